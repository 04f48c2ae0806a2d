// SPDX-License-Identifier: MIT
#include "tools/vx_client/device_list.h"

#include <VXDSPAPI.h>

#include "platform/endpoints.h"
#include "platform/variant.h"
#include "preset/endpoint_id.h"
#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

using namespace vxcomn;

constexpr GUID kDeviceFormat = {0xA45C254E, 0xDF1C, 0x4EFD, {0x80, 0x20, 0x67, 0xD1, 0x46, 0xA8, 0x50, 0xE0}};
constexpr PROPERTYKEY kFriendlyName = {kDeviceFormat, 14};
constexpr PROPERTYKEY kDescription = {kDeviceFormat, 2};
constexpr GUID kEndpointFormat = {0x1DA5D803, 0xD492, 0x4EDD, {0x8C, 0x23, 0xE0, 0xC0, 0xFF, 0xEE, 0x7F, 0x0E}};
constexpr PROPERTYKEY kDisableEffects = {kEndpointFormat, 5};
constexpr PROPERTYKEY kHardwareKey = {{0xB3F8FA53, 0x0004, 0x438E, {0x90, 0x03, 0x51, 0xA4, 0x6E, 0x13, 0x9B, 0xFC}}, 2};

// The text of a property; empty where it is none.
WideString textOf(IPropertyStore &store, const PROPERTYKEY &key) {
    OwnedPropVariant value;
    if (FAILED(store.GetValue(key, value.put())) || value->vt != VT_LPWSTR || value->pwszVal == nullptr) return {};
    return value->pwszVal;
}

bool isSwitchedOn(IPropertyStore &store, const PROPERTYKEY &key) {
    OwnedPropVariant value;
    return SUCCEEDED(store.GetValue(key, value.put())) && value->vt == VT_UI4 && value->ulVal != 0;
}

void readProperties(IPropertyStore &store, Device &device) {
    device.hasProperties = true;
    WideString name = textOf(store, kFriendlyName);
    if (name.empty()) name = textOf(store, kDescription);
    device.name = printable(toUtf8(name));
    device.effectsOff = isSwitchedOn(store, kDisableEffects);
    DeviceIdentity identity = deviceIdentity(textOf(store, kHardwareKey));
    device.deviceId = std::move(identity.deviceId);
    device.subsystemId = std::move(identity.ssid);
    uint32_t index = UINT32_MAX;
    VXDSPAPI_DevicePropsToEndpointIndex(nullptr, &store, &index);
    device.index = static_cast<int32_t>(index);
    if (const VXWCHAR *const derived = VXDSPAPI_DevicePropsToIOConfig(nullptr, &store)) device.derivedIoConfig = derived;
}

// Nothing if the endpoint went away meanwhile.
bool readDevice(IMMDevice &device, Device &result) {
    LPWSTR id = nullptr;
    DWORD state = 0;
    if (FAILED(device.GetId(&id)) || id == nullptr) return false;
    result.id = id;
    CoTaskMemFree(id);
    result.idText = toUtf8(result.id);
    if (FAILED(device.GetState(&state))) return false;
    result.state = state;
    ComPtr<IPropertyStore> store;
    if (SUCCEEDED(device.OpenPropertyStore(STGM_READ, store.put())) && store) readProperties(*store.get(), result);
    result.storeName = deviceIdAndEndpointIndex(result.deviceId, result.index);
    return true;
}

}  // namespace

std::vector<Device> listDevices() {
    initializeCom();
    ComPtr<IMMDeviceEnumerator> enumerator;
    const HRESULT refused = createDeviceEnumerator(enumerator);
    if (FAILED(refused) || !enumerator)
        throw Failure(ExitStatus::system,
                      textf("the system's audio endpoints cannot be listed (0x%08X); is its audio service running?",
                            static_cast<unsigned>(refused)));
    std::vector<Device> devices;
    for (const EDataFlow flow : {eRender, eCapture}) {
        ComPtr<IMMDeviceCollection> found;
        UINT count = 0;
        if (FAILED(enumerator->EnumAudioEndpoints(flow, DEVICE_STATEMASK_ALL, found.put())) || FAILED(found->GetCount(&count)))
            throw Failure(ExitStatus::system, "the system's audio endpoints cannot be listed; is its audio service running?");
        for (UINT i = 0; i < count; ++i) {
            ComPtr<IMMDevice> device;
            Device entry;
            entry.isCapture = flow == eCapture;
            if (SUCCEEDED(found->Item(i, device.put())) && device && readDevice(*device.get(), entry))
                devices.push_back(std::move(entry));
        }
    }
    return devices;
}

std::string stateText(uint32_t state) {
    switch (state) {
        case DEVICE_STATE_ACTIVE:
            return "active";
        case DEVICE_STATE_DISABLED:
            return "disabled";
        case DEVICE_STATE_NOTPRESENT:
            return "not present";
        case DEVICE_STATE_UNPLUGGED:
            return "unplugged";
        default:
            return textf("state 0x%X", state);
    }
}

std::string printable(std::string text) {
    for (char &letter : text)
        if (static_cast<unsigned char>(letter) < 0x20 || letter == 0x7F) letter = '?';
    return text;
}

}  // namespace vx::client
