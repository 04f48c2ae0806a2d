// SPDX-License-Identifier: MIT
#include "platform/thread_id.h"

#include "platform/windows/sdk.h"

namespace vxcomn {

uint32_t currentThreadId() noexcept {
    return GetCurrentThreadId();
}

}  // namespace vxcomn
