// SPDX-License-Identifier: MIT
//
// Numbers that nobody else of the machine gets, made of the performance counter. For stamps that are compared for equality only;
// below 2^63. Control threads.
#pragma once

#include <cstdint>

namespace vxcomn {

uint64_t uniqueCounter() noexcept;

}  // namespace vxcomn
