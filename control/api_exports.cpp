// SPDX-License-Identifier: MIT
//
// The exports that begin and end a client's use of the library, and those of the last errors.
#include <memory>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"

using namespace vxcomn;

namespace {

void freeOrphans(VXAPOCOMAPI_APIContext &api) {
    const std::lock_guard guard(api.EndpointHandlesLock);
    if (api.EndpointHandles.empty()) return;
    api.log(VX_TEXT("Found orphan endpoint handles, disposing ...\n"));
    const auto orphans = api.EndpointHandles;
    for (VXAPOCOMAPI_EndpointContext *orphan : orphans) VXAPOCOMAPI_FreeEndpoint(orphan);
    api.log(VX_TEXT("Done.\n"));
}

}  // namespace

VXAPOHandle VXAPOCOMAPI_InitializeAPI(void) {
    return guarded<VXAPOHandle>(nullptr, []() -> VXAPOHandle {
        auto api = std::make_unique<VXAPOCOMAPI_APIContext>();
        const TraceScope scope(api->TraceTarget, VX_TEXT("VXAPOCOMAPI_InitializeAPI"));
        if (!api->Initialize()) {
            api->log(VX_TEXT("Failed to initialize APO context.\n"));
            return nullptr;
        }
        publishHandle(api.get());
        api->log(VX_TEXT("Handle = 0x%X\n"), reinterpret_cast<uintptr_t>(api.get()));
        return api.release();
    });
}

int32_t VXAPOCOMAPI_FreeAPI(VXAPOHandle apiHandle) {
    return guarded<int32_t>(0, [&] {
        VXAPOCOMAPI_APIContext *const api = findApi(apiHandle);
        if (api == nullptr) return 0;
        {
            const TraceScope scope(api->TraceTarget, VX_TEXT("VXAPOCOMAPI_FreeAPI"),
                                   CallArguments().address(VX_TEXT("apiHandle = 0x"), apiHandle));
            freeOrphans(*api);
            if (!withdrawHandle(api)) return 0;
        }
        delete api;
        return 1;
    });
}

int32_t VXAPOCOMAPI_GetLastError(VXAPOHandle handle) {
    const VXAPOCOMAPI_APIContext *const api = findClient(handle);
    return api != nullptr ? api->LastError.load() : globalLastError();
}

uint32_t VXAPOCOMAPI_GetWindowsLastError(VXAPOHandle handle) {
    const VXAPOCOMAPI_APIContext *const api = findClient(handle);
    return api != nullptr ? api->WindowsLastError.load() : globalWindowsLastError();
}

void VXAPOCOMAPI_SetLastError(VXAPOHandle handle, int32_t code) {
    if (VXAPOCOMAPI_APIContext *const api = findClient(handle); api != nullptr) api->LastError = code;
    storeGlobalLastError(code);
}
