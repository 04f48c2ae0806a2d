// SPDX-License-Identifier: MIT
#include "control/content_property.h"

namespace vxcomn {
namespace {

constexpr GUID kContentProperties = {0xA1784D91, 0x5E58, 0x49C4, {0xA5, 0xFC, 0xA3, 0x3D, 0xC8, 0xB6, 0x6A, 0x18}};

// Kept: all zero for the slots without a property.
PROPERTYKEY contentKey(int32_t apoType) noexcept {
    switch (static_cast<ApoType>(apoType)) {
        case ApoType::efx:
            return {kContentProperties, 3};
        case ApoType::mfx:
            return {kContentProperties, 2};
        case ApoType::sfx:
            return {kContentProperties, 1};
        default:
            return {};
    }
}

HRESULT setText(IPropertyStore *store, const PROPERTYKEY &key, WideString text) {
    if (store == nullptr) return E_POINTER;
    if (key.fmtid == GUID{}) return E_INVALIDARG;  // not every system's store refuses it
    PROPVARIANT value = {};                        // the text stays ours, so nobody clears it
    value.vt = VT_LPWSTR;
    value.pwszVal = text.data();
    return store->SetValue(key, value);
}

}  // namespace

void syncContentProperty(VXAPOCOMAPI_EndpointContext &endpoint, const WideString &contentType) {
    endpoint.log(VX_TEXT("Syncing device property with received ContentType ...\n"));
    const PROPERTYKEY key = contentKey(endpoint.APOType.get());
    const HRESULT result = setText(endpoint.DevicePropertyStore.get().get(), key, contentType);
    if (SUCCEEDED(result)) {
        endpoint.log(VX_TEXT("Done.\n"));
        return;
    }
    const GUID &id = key.fmtid;
    endpoint.log(VX_TEXT("Failed to set property {{%08lX-%04hX-%04hX-%02hhX%02hhX-%02hhX%02hhX%02hhX%02hhX%02hhX%02hhX}, %i} of "
                         "endpoint %s with error code %i\n"),
                 uint32_t{id.Data1}, id.Data2, id.Data3, id.Data4[0], id.Data4[1], id.Data4[2], id.Data4[3], id.Data4[4],
                 id.Data4[5], id.Data4[6], id.Data4[7], uint32_t{key.pid}, endpoint.EndpointID, result);
}

}  // namespace vxcomn
