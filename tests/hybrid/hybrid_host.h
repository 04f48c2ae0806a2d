// SPDX-License-Identifier: MIT
//
// Parameters for tests of the hybrid module.
#pragma once

#include "tests/support/host_instance.h"

namespace vxcomn::testing {

using Calls = std::vector<std::string>;

inline uint32_t setByte(const HostInstance &host, int32_t component, int32_t id, uint8_t value) {
    return VXDSPAPI_SetParameter(host.handle, component, id, 0, &value, 1);
}

// Parameter -25.
inline uint32_t setHardwareMode(const HostInstance &host, uint32_t mode) {
    return VXDSPAPI_SetParameter(host.handle, 0, -25, 0, reinterpret_cast<uint8_t *>(&mode), sizeof mode);
}

inline HostInstance::Options hostType(int32_t type) {
    HostInstance::Options options;
    options.hostType = type;
    return options;
}

}  // namespace vxcomn::testing
