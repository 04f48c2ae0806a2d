// SPDX-License-Identifier: MIT
//
// The first row of the chain: what follows from the endpoint's property store alone.
#include "platform/endpoints.h"
#include "preset/chain_link.h"
#include "preset/endpoint_id.h"
#include "preset/endpoint_properties.h"
#include "preset/package_discovery.h"
#include "preset/preset_names.h"
#include "preset/trace_read_log.h"

using namespace vxcomn;

namespace {

PropertyAnswer readText(IPropertyStore *store, const PROPERTYKEY &key) {
    return StorePropertyReader(store).read(key);
}

bool isText(const PropertyAnswer &answer) noexcept {
    return SUCCEEDED(answer.result) && answer.type == kPropertyText;
}

}  // namespace

void CAPOPresetFile::DevicePropertyStore_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("DevicePropertyStore_Changing"), DevicePropertyStore);
    if (!DevicePropertyStore.get()) return;
    IOConfigName.set({});
    EndpointIndex.set(-1);
    PresetPackageName.set({});
    DeviceID.set({});
    SSID.set({});
    EndpointGuidText.set({});
    EndpointGuid.set(GUID{});
}

void CAPOPresetFile::DevicePropertyStore_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("DevicePropertyStore_Changed"), DevicePropertyStore);
    const ComRef<IPropertyStore> store = DevicePropertyStore.get();
    if (!store) return;
    const PropertyAnswer guid = readText(store.get(), kEndpointGuidKey);
    if (isText(guid)) {
        GUID parsed;
        parseGuidText(guid.text, parsed);  // all zeros for a text that is none
        EndpointGuidText.set(guid.text);
        EndpointGuid.set(parsed);
        log(VX_TEXT("Retrieved endpoint GUID = %s\n"), guid.text);
    } else {
        log(VX_TEXT("PKEY_AudioEndpoint_GUID property is not present.\n"));
    }
    deriveDeviceIdentity(store.get());

    log(VX_TEXT("Updating preset .zip archive path ...\n"));
    PresetZipPath.set({});
    TraceReadLog readLog(this);
    if (WideString package = findPresetPackage(DeviceID.get(), systemFacts(), &readLog); !package.empty())
        PresetZipPath.set(std::move(package));

    deriveEndpointIndex(store.get());
    WideString level = deviceIdAndEndpointIndex(DeviceID.get(), EndpointIndex.get());
    DeviceIDAndEndpointIndex.set(level);
    log(VX_TEXT("DeviceIDAndEndpointIndex = %s\n"), level);
    UpdateIOConfig(false);
}

void CAPOPresetFile::deriveDeviceIdentity(IPropertyStore *store) {
    log(VX_TEXT("Deriving DeviceID and SSID from PKEY_EndpointHIDKey ...\n"));
    const PropertyAnswer hardware = readText(store, kEndpointHidKey);
    if (!isText(hardware)) {
        log(VX_TEXT("Failed to retrieve PKEY_EndpointHIDKey value with error code %i.\n"), hardware.result);
        return;
    }
    const DeviceIdentity identity = deviceIdentity(hardware.text);
    DeviceID.set(identity.deviceId);
    SSID.set(identity.ssid);
    log(VX_TEXT("DeviceID = %s, SSID = %s.\n"), identity.deviceId, identity.ssid);
    const WideString name = presetPackageName(identity.deviceId);
    PresetPackageName.set(name);
    log(VX_TEXT("Preset package name = %s\n"), name);
}

void CAPOPresetFile::deriveEndpointIndex(IPropertyStore *store) {
    log(VX_TEXT("Retrieving endpoint index through PKEY_VXAPO_EndpointIndex ...\n"));
    StorePropertyReader properties(store);
    TraceReadLog readLog(this);
    uint32_t found = UINT32_MAX;
    devicePropsToEndpointIndex(properties, found, &readLog);
    const auto index = static_cast<int32_t>(found);
    log(VX_TEXT("Endpoint index = %i\n"), index);
    if (index == EndpointIndex.get())
        log(VX_TEXT("Endpoint index hasn't changed.\n"));
    else
        EndpointIndex.set(index);
}
