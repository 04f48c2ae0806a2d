// SPDX-License-Identifier: MIT
//
// The property graph over an endpoint of the system's. What the system lets nobody write stays as it is, so the test says what
// follows from whatever stands there.
#include "tests/preset/graph_fixture.h"

#include "platform/guid.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE_FIXTURE(Graph, "an endpoint of the system's leads to a configuration key") {
    initializeCom();
    ComPtr<IMMDeviceEnumerator> enumerator;
    REQUIRE(createDeviceEnumerator(enumerator) == S_OK);
    ComPtr<IMMDevice> device;
    if (FAILED(enumerator->GetDefaultAudioEndpoint(eRender, eConsole, device.put()))) {
        MESSAGE("skipped: this machine has no endpoint for rendering");
        return;
    }
    ComPtr<IPropertyStore> endpointStore;
    REQUIRE(device->OpenPropertyStore(STGM_READ, endpointStore.put()) == S_OK);
    host->Device.set(ComRef<IMMDevice>(device.get()));
    host->open(endpointStore.get(), "EFX");

    StorePropertyReader properties(endpointStore.get());
    const PropertyAnswer guid = properties.read(kEndpointGuidKey);
    CHECK(host->EndpointGuidText.get() == guid.text);
    uint32_t index = 0;
    devicePropsToEndpointIndex(properties, index, nullptr);
    CHECK(host->EndpointIndex.get() == static_cast<int32_t>(index));
    const VXWCHAR *const ioConfig = devicePropsToIOConfig(properties, nullptr);
    CHECK(host->IOConfigName.get() == (ioConfig != nullptr ? WideString(ioConfig) : WideString()));
    CHECK(host->APOTypeRegKeyName.get() == configurationKey(host->DeviceIDAndEndpointIndex.get(), VX_TEXT("EFX")));
    CHECK(host->Mutex);
}
