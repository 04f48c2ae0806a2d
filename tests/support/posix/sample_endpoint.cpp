// SPDX-License-Identifier: MIT
#include "platform/posix/endpoint_keys.h"
#include "platform/registry.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::testing {

WideString takeSampleEndpoint() {
    const WideString guid = VX_TEXT("{5d1f2b7c-8f0e-4e62-a1b3-6f2d9c4e7a10}");
    RegistryKey key;
    if (RegistryKey::create(RegistryRoot::localMachine, WideString(endpointsPath()) + VX_TEXT("\\Render\\") + guid,
                            RegistryAccess::all, key) != status::ok ||
        key.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_ACTIVE) != status::ok) {
        return {};
    }
    return VX_TEXT("{0.0.0.00000000}.") + guid;
}

void giveSampleEndpointBack() {
    RegistryKey endpoints;
    if (RegistryKey::open(RegistryRoot::localMachine, endpointsPath(), RegistryAccess::all, endpoints) == status::ok) {
        endpoints.deleteTreeBelow({});
    }
}

}  // namespace vxcomn::testing
