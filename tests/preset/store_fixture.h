// SPDX-License-Identifier: MIT
//
// A device of the test's own in the parameter store, which goes with all that is in it; on Windows it stands in the real registry.
// And a logger that is on, with what it said.
#pragma once

#include <doctest/doctest.h>

#include <algorithm>
#include <string>
#include <vector>

#include "platform/registry.h"
#include "preset/parameter_store.h"
#include "preset/store_names.h"
#include "tests/support/debug_capture.h"
#include "tests/support/process.h"

namespace test {

struct Logger : CTraceFuncCallTarget {
    explicit Logger(const VXWCHAR *tag = VX_TEXT("STORE")) {
        vxcomn::setTraceTag(*this, tag);
        Enabled = 1;
    }
};

// How many lines end with this text.
inline int said(const vxcomn::testing::DebugCapture &capture, const std::string &text) {
    const auto lines = capture.lines();
    return static_cast<int>(
        std::count_if(lines.begin(), lines.end(), [&](const std::string &line) { return line.ends_with(text); }));
}

struct StoreFixture {
    static constexpr auto kMachine = vxcomn::RegistryRoot::localMachine;

    vxcomn::WideString device = vxcomn::toWide("VxcomnTest-" + std::to_string(processId()));
    vxcomn::WideString configuration = vxcomn::configurationKey(device, VX_TEXT("EFX"));
    vxcomn::WideString parameters = vxcomn::parameterKey(
        {configuration, VX_TEXT("Engine"), VX_TEXT("Speakers"), vxcomn::kDefaultUserProfile, vxcomn::kDefaultContentType},
        vxcomn::kEngineLevelVersion);

    StoreFixture() { forget(); }
    ~StoreFixture() { forget(); }
    StoreFixture(const StoreFixture &) = delete;
    StoreFixture &operator=(const StoreFixture &) = delete;

    void forget() const {
        vxcomn::RegistryKey root;
        if (vxcomn::RegistryKey::open(kMachine, vxcomn::kStoreRoot, vxcomn::RegistryAccess::all, root) == vxcomn::status::ok) {
            root.deleteTreeBelow(device);
        }
    }

    vxcomn::RegistryKey open(vxcomn::WideView path, const VXWCHAR *below = VX_TEXT("")) const {
        vxcomn::RegistryKey key, lower;
        if (vxcomn::RegistryKey::create(kMachine, path, vxcomn::RegistryAccess::all, key) != vxcomn::status::ok) return {};
        if (*below == 0) return key;
        key.openBelow(below, vxcomn::RegistryAccess::all, lower);
        return lower;
    }

    // Writes a parameter with little ado.
    bool write(int32_t component, int32_t param, std::vector<uint8_t> data, uint64_t *stamp = nullptr) const {
        return vxcomn::WriteParameter(nullptr, parameters, component, param, -1, data, {}, false, stamp);
    }
};

}  // namespace test
