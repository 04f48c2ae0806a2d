// SPDX-License-Identifier: MIT
//
// What this process holds of the machine's memory.
#pragma once

#include <cstdint>

namespace vxcomn::testing {

// Bytes of private memory that the process has written to, 0 if the system does not tell.
uint64_t memoryInUse();

}  // namespace vxcomn::testing
