// SPDX-License-Identifier: MIT
#include <chrono>
#include <string>

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

namespace {

// Whoever reads those that stay comes late to the one that doesn't.
constexpr int kSteadyEndpoints = 12;

WideString numberedGuid(int number) {
    return VX_TEXT("{f1c4e12a-0000-4000-8000-6f2d9c4e7a") + toWide(std::to_string(10 + number)) + VX_TEXT("}");
}

RegistryKey renderEndpoints() {
    RegistryKey key;
    RegistryKey::create(RegistryRoot::localMachine, WideString(endpointsPath()) + VX_TEXT("\\Render"), RegistryAccess::all, key);
    return key;
}

void makeEndpoint(const RegistryKey &endpoints, int number) {
    RegistryKey key;
    if (endpoints.createBelow(numberedGuid(number), RegistryAccess::all, key) == status::ok) {
        key.setU32(VX_TEXT("DeviceState"), DEVICE_STATE_ACTIVE);
    }
}

}  // namespace

FlickeringEndpoint::FlickeringEndpoint() {
    const RegistryKey endpoints = renderEndpoints();
    for (int number = 0; number < kSteadyEndpoints; ++number) makeEndpoint(endpoints, number);
    thread_ = std::thread([this] {
        RegistryKey own = renderEndpoints();
        while (!ended_) {
            makeEndpoint(own, kSteadyEndpoints);
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
            own.deleteTreeBelow(numberedGuid(kSteadyEndpoints));
            std::this_thread::sleep_for(std::chrono::milliseconds(1));
        }
    });
}

FlickeringEndpoint::~FlickeringEndpoint() {
    ended_ = true;
    thread_.join();
    RegistryKey endpoints = renderEndpoints();
    for (int number = 0; number < kSteadyEndpoints; ++number) endpoints.deleteTreeBelow(numberedGuid(number));
}

bool FlickeringEndpoint::possible() noexcept {
    return true;
}

}  // namespace vxcomn::testing
