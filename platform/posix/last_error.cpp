// SPDX-License-Identifier: MIT
#include "platform/last_error.h"

namespace vxcomn {
namespace {

thread_local Status ownError = status::ok;

}  // namespace

Status lastError() noexcept {
    return ownError;
}

void setLastError(Status status) noexcept {
    ownError = status;
}

}  // namespace vxcomn
