// SPDX-License-Identifier: MIT
//
// The system's number of the calling thread, as debuggers show it. Any thread.
#pragma once

#include <cstdint>

namespace vxcomn {

uint32_t currentThreadId() noexcept;

}  // namespace vxcomn
