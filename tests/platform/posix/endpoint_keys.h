// SPDX-License-Identifier: MIT
//
// Endpoints that a test makes in its registry, and takes away with all others when it ends.
#pragma once

#include <doctest/doctest.h>

#include "platform/posix/endpoint_keys.h"

namespace test {

struct EndpointKeys {
    EndpointKeys() = default;
    ~EndpointKeys() {
        vxcomn::RegistryKey audio;
        if (vxcomn::RegistryKey::open(vxcomn::RegistryRoot::localMachine, vxcomn::endpointsPath(), vxcomn::RegistryAccess::all,
                                      audio) == vxcomn::status::ok) {
            audio.deleteTreeBelow({});
        }
    }
    EndpointKeys(const EndpointKeys &) = delete;
    EndpointKeys &operator=(const EndpointKeys &) = delete;

    static vxcomn::RegistryKey make(const char *flow, const char *guid) {
        vxcomn::RegistryKey key;
        REQUIRE(vxcomn::RegistryKey::create(
                    vxcomn::RegistryRoot::localMachine,
                    vxcomn::WideString(vxcomn::endpointsPath()) + vxcomn::toWide(std::string("\\") + flow + "\\" + guid),
                    vxcomn::RegistryAccess::all, key) == vxcomn::status::ok);
        return key;
    }
    static vxcomn::RegistryKey make(const char *flow, const char *guid, uint32_t state) {
        vxcomn::RegistryKey key = make(flow, guid);
        REQUIRE(key.setU32(VX_TEXT("DeviceState"), state) == vxcomn::status::ok);
        return key;
    }
};

}  // namespace test
