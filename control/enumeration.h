// SPDX-License-Identifier: MIT
//
// Which endpoint bears a product endpoint index. Control threads.
#pragma once

#include <cstdint>

#include "control/api_context.h"

namespace vxcomn {

// The id of the first active or unplugged render endpoint of that index; `id` stays as it was if there is none. Returns what the
// last call to the system came to, so a search without a match may well succeed.
HRESULT EndpointIndexToEndpointID(VXAPOCOMAPI_APIContext &api, int32_t index, WideString &id);

}  // namespace vxcomn
