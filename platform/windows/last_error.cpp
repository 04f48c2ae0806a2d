// SPDX-License-Identifier: MIT
#include "platform/last_error.h"

#include "platform/windows/sdk.h"

namespace vxcomn {

Status lastError() noexcept {
    return GetLastError();
}

void setLastError(Status status) noexcept {
    SetLastError(status);
}

}  // namespace vxcomn
