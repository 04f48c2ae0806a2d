// SPDX-License-Identifier: MIT
//
// The property graph over an endpoint that lies in the registry: what an installer writes there is what the chain is built from.
#include "tests/platform/posix/endpoint_keys.h"
#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr const char *kGuid = "{5D9A1C70-3B52-4E0F-9C41-0A6E27D1BFFF}";

struct RegistryEndpoint : Graph {
    RegistryEndpoint() : properties(keys.make("Render", kGuid, DEVICE_STATE_ACTIVE)) {
        set("{A45C254E-DF1C-4EFD-8020-67D146A850E0},2", "Speakers");
        set("{B3F8FA53-0004-438E-9003-51A46E139BFC},2", kHardwareKey.c_str());
        set("{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},0", 2);
        set("{6A6414E7-39E4-491F-8B8C-C9028AC7D659},0", 7);
    }
    ~RegistryEndpoint() {
        // The object goes ahead of the endpoint.
        host.reset();
    }
    void set(const char *name, const char *text) { below().setText(toWide(name), toWide(text)); }
    void set(const char *name, uint32_t number) { below().setU32(toWide(name), number); }
    RegistryKey below() {
        RegistryKey key;
        REQUIRE(properties.createBelow(VX_TEXT("Properties"), RegistryAccess::all, key) == status::ok);
        return key;
    }
    // The endpoint's device and its property store, as an application gets them.
    void openEndpoint() {
        ComPtr<IMMDeviceEnumerator> enumerator;
        REQUIRE(createDeviceEnumerator(enumerator) == S_OK);
        const WideString id = toWide(std::string("{0.0.0.00000000}.") + kGuid);
        ComPtr<IMMDevice> device;
        REQUIRE(enumerator->GetDevice(id.c_str(), device.put()) == S_OK);
        ComPtr<IPropertyStore> endpointStore;
        REQUIRE(device->OpenPropertyStore(STGM_READWRITE, endpointStore.put()) == S_OK);
        host->Device.set(ComRef<IMMDevice>(device.get()));
        host->open(endpointStore.get(), "EFX");
    }

    test::EndpointKeys keys;
    RegistryKey properties;
};

}  // namespace

TEST_CASE_FIXTURE(RegistryEndpoint, "an endpoint in the registry leads to its preset and its parameters") {
    putPreset(longDocument());
    openEndpoint();
    CHECK(toUtf8(host->EndpointGuidText.get()) == kGuid);
    CHECK(toUtf8(host->DeviceIDAndEndpointIndex.get()) == kDevice + "\\7");
    CHECK(toUtf8(host->SSID.get()) == "SUBSYS_1234ABCD");
    CHECK(toUtf8(host->IOConfigName.get()) == "LineOut");
    CHECK(toUtf8(host->ParamRegKeyName.get()) ==
          "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
    CHECK(value(5, 117).size() == 13);
}

TEST_CASE_FIXTURE(RegistryEndpoint, "headphones that the driver redirects to are another configuration at the next update") {
    putPreset(longDocument(), "EFX", "AnyOutput");
    putPreset(longDocument(), "EFX", "Headphones");
    set("{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},0", 1);
    openEndpoint();
    REQUIRE(toUtf8(host->IOConfigName.get()) == "AnyOutput");
    set("{3BA0CD54-830F-4551-A6EB-F3EAB68E3700},1", 1);
    host->UpdateIOConfig(false);
    CHECK(toUtf8(host->IOConfigName.get()) == "Headphones");
    CHECK(toUtf8(host->ParamRegKeyName.get()).find("\\Headphones\\") != std::string::npos);
}

TEST_CASE_FIXTURE(RegistryEndpoint, "properties of the wrong type count as absent") {
    set("{B3F8FA53-0004-438E-9003-51A46E139BFC},2", 7);
    set("{6A6414E7-39E4-491F-8B8C-C9028AC7D659},0", "7");
    set("{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E},0", "2");
    openEndpoint();
    CHECK(toUtf8(host->APOTypeRegKeyName.get()) == "Software\\Ondrevale\\APO\\0\\EFX");
    CHECK(host->IOConfigName.get().empty());
    CHECK(host->ParamRegKeyName.get().empty());
}
