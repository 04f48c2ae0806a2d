// SPDX-License-Identifier: MIT
//
// The exports that open and close endpoints and choose their slot.
#include <memory>

#include "VXAPOCOMAPI.h"
#include "control/enumeration.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"

using namespace vxcomn;

namespace {

constexpr size_t kEndpointIdUnits = 512;  // with its end
constexpr WideView kRenderIdPrefix = VX_TEXT("{0.0.0.00000000}.");

VXAPOHandle openEndpoint(VXAPOCOMAPI_APIContext &api, const VXWCHAR *endpointId, int32_t hardwareOnly, int32_t hostAPO,
                         GUID *instanceId) {
    const TraceScope scope(
        api.TraceTarget, VX_TEXT("_VXAPOCOMAPI_GetEndpoint"),
        CallArguments().address(VX_TEXT("apiHandle = 0x"), &api).address(VX_TEXT(", instanceId = 0x"), instanceId));
    api.log(VX_TEXT("endpointID = %s, hardwareOnly = %i, hostAPO = %i\n"), endpointId, hardwareOnly, hostAPO);
    auto endpoint = std::make_unique<VXAPOCOMAPI_EndpointContext>(api);
    if (instanceId != nullptr) *instanceId = endpoint->InstanceGuid;
    if (!endpoint->Initialize(endpointId, hardwareOnly != 0, hostAPO != 0)) {
        endpoint.reset();
        failWith(api, api, VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
        return nullptr;
    }
    publishHandle(endpoint.get());
    storeLastError(api, VXAPOCOMAPI_ERROR_NONE);
    api.log(VX_TEXT("Endpoint Handle = 0x%X\n"), reinterpret_cast<uintptr_t>(endpoint.get()));
    return endpoint.release();
}

// Opens an endpoint on a client of its own, which nobody could free any more if that fails. `open` traces through the client, so
// it has returned before the client goes.
template <class Open>
VXAPOHandle openOnOwnClient(Open &&open) {
    auto *const api = static_cast<VXAPOCOMAPI_APIContext *>(VXAPOCOMAPI_InitializeAPI());
    if (api == nullptr) return nullptr;
    VXAPOHandle const endpoint = open(*api);
    if (endpoint == nullptr) VXAPOCOMAPI_FreeAPI(api);
    return endpoint;
}

ApoType slotOfName(WideView name) noexcept {
    if (name == VX_TEXT("EFX")) return ApoType::efx;
    if (name == VX_TEXT("MFX")) return ApoType::mfx;
    if (name == VX_TEXT("SFX")) return ApoType::sfx;
    if (name == VX_TEXT("LFX")) return ApoType::lfx;
    if (name == VX_TEXT("GFX")) return ApoType::gfx;
    return ApoType::none;
}

}  // namespace

VXAPOHandle _VXAPOCOMAPI_GetEndpoint(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t hardwareOnly, int32_t hostAPO,
                                     GUID *instanceId) {
    return guarded<VXAPOHandle>(nullptr, [&]() -> VXAPOHandle {
        VXAPOCOMAPI_APIContext *const api = findApi(apiHandle);
        return api != nullptr ? openEndpoint(*api, endpointId, hardwareOnly, hostAPO, instanceId) : nullptr;
    });
}

// Kept: whatever the caller asks for, the endpoint is opened in hardware-only mode with a direct line to the effect module.
VXAPOHandle VXAPOCOMAPI_GetEndpointEx(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t /*hardwareOnly*/,
                                      GUID *instanceId) {
    return guarded<VXAPOHandle>(nullptr, [&]() -> VXAPOHandle {
        VXAPOCOMAPI_APIContext *const api = findApi(apiHandle);
        if (api == nullptr) return nullptr;
        const TraceScope scope(api->TraceTarget, VX_TEXT("VXAPOCOMAPI_GetEndpointEx"),
                               CallArguments().address(VX_TEXT("apiHandle = 0x"), apiHandle));
        api->log(VX_TEXT("hardwareOnly = 1 (always hardware-only mode!)\n"));
        return _VXAPOCOMAPI_GetEndpoint(apiHandle, endpointId, 1, 1, instanceId);
    });
}

VXAPOHandle VXAPOCOMAPI_GetEndpoint(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t hardwareOnly) {
    return VXAPOCOMAPI_GetEndpointEx(apiHandle, endpointId, hardwareOnly, nullptr);
}

int32_t VXAPOCOMAPI_FreeEndpoint(VXAPOHandle epHandle) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(epHandle);
        if (endpoint == nullptr) return 0;
        {
            const TraceScope scope(endpoint->TraceTarget, VX_TEXT("VXAPOCOMAPI_FreeEndpoint"),
                                   CallArguments().address(VX_TEXT("epHandle = 0x"), epHandle));
            if (!withdrawHandle(endpoint)) return 0;
            storeLastError(*endpoint->ApiContext, VXAPOCOMAPI_ERROR_NONE);
        }
        delete endpoint;
        return 1;
    });
}

VXAPOHandle VXAPOCOMAPI_Initialize(int32_t endpointIndex) {
    const auto open = [&](VXAPOCOMAPI_APIContext &api) {
        const TraceScope scope(api.TraceTarget, VX_TEXT("VXAPOCOMAPI_Initialize"));
        api.log(VX_TEXT("endpointIndex = %i\n"), endpointIndex);
        WideString id;
        if (FAILED(EndpointIndexToEndpointID(api, endpointIndex, id)))
            failWith(api, api, VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND);
        return _VXAPOCOMAPI_GetEndpoint(&api, id.c_str(), 0, 0, nullptr);
    };
    return guarded<VXAPOHandle>(nullptr, [&] { return openOnOwnClient(open); });
}

VXAPOHandle VXAPOCOMAPI_InitializeEx(const char *endpointId, const char *endpointGuid, int32_t hardwareOnly) {
    const auto open = [&](VXAPOCOMAPI_APIContext &api) {
        const TraceScope scope(api.TraceTarget, VX_TEXT("VXAPOCOMAPI_InitializeEx"));
        if (endpointGuid != nullptr) {
            api.log(VX_TEXT("endpointId = %s, endpointGuid = %s, hardwareOnly = %i\n"), endpointId, endpointGuid, hardwareOnly);
        } else {
            api.log(VX_TEXT("endpointId = %s, endpointGuid = NULL, hardwareOnly = %i\n"), endpointId, hardwareOnly);
        }
        api.log(VX_TEXT("hardwareOnly = 1 (always hardware-only mode!)\n"));
        api.log(VX_TEXT("Hardware-only mode.\n"));
        WideString id(kRenderIdPrefix);
        const WideString guid = endpointGuid != nullptr ? toWide(endpointGuid) : WideString();
        if (id.size() + guid.size() < kEndpointIdUnits) id += guid;
        return _VXAPOCOMAPI_GetEndpoint(&api, id.c_str(), 1, 1, nullptr);
    };
    return guarded<VXAPOHandle>(nullptr, [&] { return openOnOwnClient(open); });
}

int32_t VXAPOCOMAPI_Free(VXAPOHandle epHandle) {
    VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(epHandle);
    if (endpoint == nullptr) return 0;
    VXAPOCOMAPI_APIContext *const api = endpoint->ApiContext;
    return VXAPOCOMAPI_FreeEndpoint(epHandle) != 0 ? VXAPOCOMAPI_FreeAPI(api) : 0;
}

int32_t VXAPOCOMAPI_SetAPOType(VXAPOHandle apoComHandle, const char *name) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(apoComHandle);
        if (endpoint == nullptr) return 0;
        const TraceScope scope(endpoint->TraceTarget, VX_TEXT("VXAPOCOMAPI_SetAPOType"),
                               CallArguments().address(VX_TEXT("apoComHandle = 0x"), apoComHandle));
        const WideString text = name != nullptr ? toWide(name) : WideString();
        endpoint->APOTypeStr.set(text);
        endpoint->log(VX_TEXT("APO Type: %s\n"), text);
        const ApoType type = slotOfName(text);
        if (type == ApoType::none) return failWith(*endpoint->ApiContext, *endpoint, VXAPOCOMAPI_ERROR_INVALID_APO_TYPE);
        endpoint->APOType.set(static_cast<int32_t>(type));
        storeLastError(*endpoint->ApiContext, VXAPOCOMAPI_ERROR_NONE);
        return 1;
    });
}
