// SPDX-License-Identifier: MIT
#include "control/handles.h"

#include <functional>
#include <mutex>
#include <set>

namespace vxcomn {

namespace {

// The live contexts of one kind, by address.
template <class Context>
class HandleSet {
  public:
    Context *find(const void *handle, void (*enter)(Context &) = nullptr) {
        const std::lock_guard guard(lock_);
        const auto found = contexts_.find(handle);
        if (found == contexts_.end()) return nullptr;
        if (enter != nullptr) enter(**found);
        return *found;
    }
    void insert(Context *context) {
        const std::lock_guard guard(lock_);
        contexts_.insert(context);
    }
    bool erase(Context *context) {
        const std::lock_guard guard(lock_);
        return contexts_.erase(context) != 0;
    }

  private:
    struct ByAddress {
        using is_transparent = void;
        bool operator()(const void *left, const void *right) const noexcept { return std::less<>()(left, right); }
    };

    std::mutex lock_;
    std::set<Context *, ByAddress> contexts_;
};

HandleSet<VXAPOCOMAPI_APIContext> ApiHandles;
HandleSet<VXAPOCOMAPI_EndpointContext> EndpointHandles;

}  // namespace

VXAPOCOMAPI_APIContext *findApi(const void *handle) noexcept {
    VXAPOCOMAPI_APIContext *const api = handle != nullptr ? ApiHandles.find(handle) : nullptr;
    return api != nullptr && api->HandleSignature == kHandleSignature ? api : nullptr;
}

VXAPOCOMAPI_EndpointContext *findEndpoint(const void *handle) noexcept {
    VXAPOCOMAPI_EndpointContext *const endpoint = handle != nullptr ? EndpointHandles.find(handle) : nullptr;
    return endpoint != nullptr && endpoint->HandleSignature == kHandleSignature ? endpoint : nullptr;
}

VXAPOCOMAPI_EndpointContext *findEndpoint(const void *handle, void (*enter)(VXAPOCOMAPI_EndpointContext &)) noexcept {
    return handle != nullptr ? EndpointHandles.find(handle, enter) : nullptr;
}

VXAPOCOMAPI_APIContext *findClient(const void *handle) noexcept {
    const VXAPOCOMAPI_EndpointContext *const endpoint = findEndpoint(handle);
    return endpoint != nullptr ? findApi(endpoint->ApiContext) : findApi(handle);
}

void publishHandle(VXAPOCOMAPI_APIContext *api) {
    ApiHandles.insert(api);
}

void publishHandle(VXAPOCOMAPI_EndpointContext *endpoint) {
    const std::lock_guard guard(endpoint->ApiContext->EndpointHandlesLock);
    EndpointHandles.insert(endpoint);
    try {
        endpoint->ApiContext->EndpointHandles.insert(endpoint);
    } catch (...) {
        EndpointHandles.erase(endpoint);
        throw;
    }
}

bool withdrawHandle(VXAPOCOMAPI_APIContext *api) noexcept {
    return ApiHandles.erase(api);
}

bool withdrawHandle(VXAPOCOMAPI_EndpointContext *endpoint) noexcept {
    if (!EndpointHandles.erase(endpoint)) return false;
    const std::lock_guard guard(endpoint->ApiContext->EndpointHandlesLock);
    endpoint->ApiContext->EndpointHandles.erase(endpoint);
    return true;
}

}  // namespace vxcomn
