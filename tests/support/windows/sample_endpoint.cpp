// SPDX-License-Identifier: MIT
#include "platform/endpoints.h"
#include "tests/support/sample_machine.h"
#include "vxcomn/com_memory.h"

namespace vxcomn::testing {

WideString takeSampleEndpoint() {
    initializeCom();
    ComPtr<IMMDeviceEnumerator> enumerator;
    ComPtr<IMMDeviceCollection> devices;
    ComPtr<IMMDevice> device;
    LPWSTR text = nullptr;
    if (FAILED(createDeviceEnumerator(enumerator)) ||
        FAILED(enumerator->EnumAudioEndpoints(eRender, DEVICE_STATE_ACTIVE, devices.put())) ||
        FAILED(devices->Item(0, device.put())) || FAILED(device->GetId(&text))) {
        return {};
    }
    const WideString id = text;
    CoTaskMemFree(text);
    return id;
}

void giveSampleEndpointBack() {}

FlickeringEndpoint::FlickeringEndpoint() = default;
FlickeringEndpoint::~FlickeringEndpoint() = default;

bool FlickeringEndpoint::possible() noexcept {
    return false;
}

}  // namespace vxcomn::testing
