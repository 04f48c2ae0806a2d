// SPDX-License-Identifier: MIT
#include <chrono>

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

FlickeringEndpoint::FlickeringEndpoint()
    : thread_([this] {
          const WideString guid = VX_TEXT("{f1c4e12a-0000-4000-8000-6f2d9c4e7a11}");
          while (!ended_) {
              RegistryKey endpoints, key;
              if (RegistryKey::create(RegistryRoot::localMachine, WideString(endpointsPath()) + VX_TEXT("\\Render"),
                                      RegistryAccess::all, endpoints) != status::ok ||
                  endpoints.createBelow(guid, RegistryAccess::all, key) != status::ok) {
                  return;
              }
              key.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_ACTIVE);
              key.close();
              endpoints.deleteTreeBelow(guid);
          }
      }) {}

FlickeringEndpoint::~FlickeringEndpoint() {
    ended_ = true;
    thread_.join();
}

bool FlickeringEndpoint::possible() noexcept {
    return true;
}

}  // namespace vxcomn::testing
