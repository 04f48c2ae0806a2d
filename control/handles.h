// SPDX-License-Identifier: MIT
//
// Handles: which addresses are live contexts. An address is looked up in sets of the process before anybody reads what it points
// to, so stale handles and wild pointers are refused alike. A set's lock is held for the lookup alone: keeping a handle from being
// freed while a call uses it is the client's business. Any thread.
#pragma once

#include "control/api_context.h"
#include "control/endpoint_context.h"

namespace vxcomn {

// The context behind a handle; null for any other address.
VXAPOCOMAPI_APIContext *findApi(const void *handle) noexcept;
VXAPOCOMAPI_EndpointContext *findEndpoint(const void *handle) noexcept;
// The same, and calls `enter` before the handle can be withdrawn: what it marks is seen by whoever frees the endpoint.
VXAPOCOMAPI_EndpointContext *findEndpoint(const void *handle, void (*enter)(VXAPOCOMAPI_EndpointContext &)) noexcept;

// The client that a handle of either kind belongs to; null for any other address.
VXAPOCOMAPI_APIContext *findClient(const void *handle) noexcept;

// From here on the context is found. An endpoint goes into its client's EndpointHandles, too.
void publishHandle(VXAPOCOMAPI_APIContext *api);
void publishHandle(VXAPOCOMAPI_EndpointContext *endpoint);

// From here on it isn't. False if it was not to be found: somebody else is freeing it.
bool withdrawHandle(VXAPOCOMAPI_APIContext *api) noexcept;
bool withdrawHandle(VXAPOCOMAPI_EndpointContext *endpoint) noexcept;

}  // namespace vxcomn
