// SPDX-License-Identifier: MIT
//
// Last errors: each client's, and a copy for the process that a client without a handle can ask for. Plain words, the last writer
// wins. Any control thread.
#pragma once

#include <cstdint>

#include "VXAPOCOMAPI.h"
#include "control/api_context.h"
#include "platform/status.h"

namespace vxcomn {

int32_t globalLastError() noexcept;
uint32_t globalWindowsLastError() noexcept;

// Stores a code, VXAPOCOMAPI_ERROR_NONE as well, as the client's and the process's.
void storeLastError(VXAPOCOMAPI_APIContext &api, int32_t code) noexcept;
// The process's alone.
void storeGlobalLastError(int32_t code) noexcept;

// Stores a failure and logs "Error: %i" through `trace`. Returns 0, the result of the call that fails.
int32_t failWith(VXAPOCOMAPI_APIContext &api, const CTraceFuncCallTarget &trace, int32_t code) noexcept;

// Stores VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE with its error, and logs it in words. Returns 0.
int32_t failWithWindowsError(VXAPOCOMAPI_APIContext &api, Status error) noexcept;

}  // namespace vxcomn
