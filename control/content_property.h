// SPDX-License-Identifier: MIT
//
// The content type that a slot runs stands in its endpoint's property store as well, where the system's effects look for it.
// Control threads, under the state lock.
#pragma once

#include "control/endpoint_context.h"

namespace vxcomn {

// Writes the content type. A failure is logged and changes nothing else; GFX and LFX have no property of their own.
void syncContentProperty(VXAPOCOMAPI_EndpointContext &endpoint, const WideString &contentType);

}  // namespace vxcomn
