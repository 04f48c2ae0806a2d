// SPDX-License-Identifier: MIT
//
// A key of the test's own, which goes with all that is in it. On Windows it stands in the real registry.
#pragma once

#include <doctest/doctest.h>

#include <string>

#include "platform/registry.h"
#include "tests/support/process.h"

namespace test {

struct RegistryFixture {
    static constexpr auto kRoot = vxcomn::RegistryRoot::currentUser;

    vxcomn::WideString ownName = vxcomn::toWide("VxcomnTest-" + std::to_string(processId()));
    vxcomn::WideString path = VX_TEXT("Software\\") + ownName;
    vxcomn::RegistryKey key;

    RegistryFixture() { REQUIRE(vxcomn::RegistryKey::create(kRoot, path, vxcomn::RegistryAccess::all, key) == vxcomn::status::ok); }
    ~RegistryFixture() {
        key.close();
        vxcomn::RegistryKey software;
        vxcomn::RegistryKey::open(kRoot, VX_TEXT("Software"), vxcomn::RegistryAccess::all, software);
        software.deleteTreeBelow(ownName);
    }
    RegistryFixture(const RegistryFixture &) = delete;
    RegistryFixture &operator=(const RegistryFixture &) = delete;
};

}  // namespace test
