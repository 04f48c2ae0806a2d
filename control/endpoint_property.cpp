// SPDX-License-Identifier: MIT
//
// VXAPOCOMAPI_GetEndpointPropertyValue: properties of an open endpoint, those known by number and those of its property store.
#include <iterator>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "platform/guid.h"
#include "platform/variant.h"

using namespace vxcomn;

namespace {

constexpr PROPERTYKEY kFriendlyNameKey = {{0xA45C254E, 0xDF1C, 0x4EFD, {0x80, 0x20, 0x67, 0xD1, 0x46, 0xA8, 0x50, 0xE0}}, 14};

constexpr const VXWCHAR *kPropertyNames[] = {
    VX_TEXT("DeviceID"),      VX_TEXT("SSID"),          VX_TEXT("FriendlyName"),  VX_TEXT("EngineName"),
    VX_TEXT("EndpointIndex"), VX_TEXT("EndpointState"), VX_TEXT("PresetZipPath"), VX_TEXT("PresetFilePath"),
};

bool giveText(const WideString &text, VARIANT &value) {
    VariantInit(&value);
    value.vt = VT_BSTR;
    value.bstrVal = SysAllocString(text.c_str());
    if (value.bstrVal == nullptr) VariantInit(&value);
    return value.vt == VT_BSTR;
}

bool giveNumber(int32_t number, VARIANT &value) {
    VariantInit(&value);
    value.vt = VT_I4;
    value.lVal = number;
    return true;
}

bool giveFriendlyName(const VXAPOCOMAPI_EndpointContext &endpoint, VARIANT &value) {
    OwnedPropVariant name;
    VariantInit(&value);
    const ComRef<IPropertyStore> properties = endpoint.DevicePropertyStore.get();
    if (!properties || FAILED(properties->GetValue(kFriendlyNameKey, name.put()))) {
        endpoint.log(VX_TEXT("Failed to retrieve endpoint's friendly name.\n"));
        return false;
    }
    if (FAILED(convertVariant(*name, value))) {
        endpoint.log(VX_TEXT("Failed to convert from PROPVARIANT ot VARIANT.\n"));
        return false;
    }
    return true;
}

bool giveState(const VXAPOCOMAPI_EndpointContext &endpoint, VARIANT &value) {
    DWORD state = 0;
    VariantInit(&value);
    const ComRef<IMMDevice> device = endpoint.Device.get();
    if (!device || FAILED(device->GetState(&state))) return false;
    return giveNumber(static_cast<int32_t>(state), value);
}

bool giveKnown(const VXAPOCOMAPI_EndpointContext &endpoint, uint32_t id, VARIANT &value) {
    if (id >= std::size(kPropertyNames)) {
        endpoint.log(VX_TEXT("Property ID is unknown.\n"));
        return false;
    }
    endpoint.log(VX_TEXT("property ID = VXAPOCOMAPI_EndpointPropID_%s\n"), kPropertyNames[id]);
    switch (id) {
        case VXAPOCOMAPI_EndpointPropID_DeviceID:
            return giveText(endpoint.DeviceID.get(), value);
        case VXAPOCOMAPI_EndpointPropID_SSID:
            return giveText(endpoint.SSID.get(), value);
        case VXAPOCOMAPI_EndpointPropID_FriendlyName:
            return giveFriendlyName(endpoint, value);
        case VXAPOCOMAPI_EndpointPropID_EngineName:
            return giveText(endpoint.EngineShortName.get(), value);
        case VXAPOCOMAPI_EndpointPropID_EndpointIndex:
            return giveNumber(endpoint.EndpointIndex.get(), value);
        case VXAPOCOMAPI_EndpointPropID_EndpointState:
            return giveState(endpoint, value);
        case VXAPOCOMAPI_EndpointPropID_PresetZipPath:
            return giveText(endpoint.PresetZipPath.get(), value);
        default:
            return giveText(endpoint.PresetFilePath.get(), value);
    }
}

bool giveFromStore(const VXAPOCOMAPI_EndpointContext &endpoint, const GUID &guid, uint32_t id, VARIANT &value) {
    endpoint.log(VX_TEXT("Received property GUID %s and property ID %i.\n"), guidText(guid), id);
    const ComRef<IPropertyStore> properties = endpoint.DevicePropertyStore.get();
    if (!properties) {
        endpoint.log(VX_TEXT("DevicePropertyStore == NULL.\n"));
        return false;
    }
    OwnedPropVariant found;
    if (const HRESULT result = properties->GetValue({guid, id}, found.put()); FAILED(result)) {
        endpoint.log(VX_TEXT("Failed to access property with error code %i.\n"), result);
        return false;
    }
    if (FAILED(convertVariant(*found, value))) {
        endpoint.log(VX_TEXT("Failed to convert from PROPVARIANT to VARIANT. vt = %i.\n"), found->vt);
        return false;
    }
    return true;
}

}  // namespace

int32_t VXAPOCOMAPI_GetEndpointPropertyValue(VXAPOHandle epHandle, const GUID *propertyGuid, uint32_t propertyId, VARIANT *value) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(epHandle);
        if (endpoint == nullptr) return 0;
        VXAPOCOMAPI_APIContext &api = *endpoint->ApiContext;
        const TraceScope scope(endpoint->TraceTarget, VX_TEXT("VXAPOCOMAPI_GetEndpointPropertyValue"),
                               CallArguments().address(VX_TEXT("epHandle = 0x"), epHandle));
        if (propertyGuid == nullptr) {
            endpoint->log(VX_TEXT("Property GUID is NULL, property ID %i is from VXAPOCOMAPI_EndpointPropID enum.\n"), propertyId);
            const bool given = value != nullptr && giveKnown(*endpoint, propertyId, *value);
            storeLastError(api, given ? VXAPOCOMAPI_ERROR_NONE : VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
            // Kept: the result of this half says nothing; the last error does.
            return 1;
        }
        if (value == nullptr || !giveFromStore(*endpoint, *propertyGuid, propertyId, *value))
            return failWith(api, *endpoint, VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
        storeLastError(api, VXAPOCOMAPI_ERROR_NONE);
        return 1;
    });
}
