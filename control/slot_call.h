// SPDX-License-Identifier: MIT
//
// What the calls that change a slot have around their work: the handle is looked up, the entry traced, the state lock and then the
// slot's mutex taken, and the slot has to be chosen. The work runs on the caller's thread with both locks held.
#pragma once

#include <mutex>
#include <utility>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"

namespace vxcomn {

// A text of the caller's; null counts as empty.
inline WideString textArgument(const char *text) {
    return text != nullptr ? toWide(text) : WideString();
}

inline CallArguments handleArgument(const void *handle) {
    return CallArguments().address(VX_TEXT("apoComHandle = 0x"), handle);
}

// Whether a slot is chosen.
inline bool hasSlot(const VXAPOCOMAPI_EndpointContext &endpoint) {
    return !endpoint.APOTypeRegKeyName.get().empty();
}

// Stores success as the last error. Returns 1, the result of the call that succeeds.
inline int32_t succeed(VXAPOCOMAPI_EndpointContext &endpoint) noexcept {
    storeLastError(*endpoint.ApiContext, VXAPOCOMAPI_ERROR_NONE);
    return 1;
}

// The selection setters' frame. The result is that of the client's last error behind the work.
template <class Work>
int32_t callSlot(void *handle, const VXWCHAR *traceName, Work &&work) {
    VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    const TraceScope scope(endpoint->TraceTarget, traceName, handleArgument(handle));
    const std::lock_guard state(endpoint->stateLock());
    const GlobalMutexLock slot(endpoint->Mutex);
    VXAPOCOMAPI_APIContext &api = *endpoint->ApiContext;
    if (!hasSlot(*endpoint)) {
        endpoint->log(VX_TEXT("APO type is not set\n"));
        return failWith(api, *endpoint, VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    }
    storeLastError(api, VXAPOCOMAPI_ERROR_NONE);
    std::forward<Work>(work)(*endpoint);
    return api.LastError == VXAPOCOMAPI_ERROR_NONE ? 1 : 0;
}

}  // namespace vxcomn
