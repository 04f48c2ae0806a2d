// SPDX-License-Identifier: MIT
//
// The calling thread's last error: the system's own on Windows, where other calls may change it, and a word of the library's own
// elsewhere, which only `setLastError` changes. Control threads.
#pragma once

#include "platform/status.h"

namespace vxcomn {

Status lastError() noexcept;
void setLastError(Status status) noexcept;

}  // namespace vxcomn
