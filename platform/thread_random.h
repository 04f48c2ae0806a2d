// SPDX-License-Identifier: MIT
//
// A word of memory for each thread, which holds the state of the pink noise's generator and begins as 1. It lies in the storage
// that the loader sets up together with the thread, and it is reached without a call: the compilers' own way to a thread_local
// allocates at the first use on Windows, and calls the dynamic linker on Linux. Neither is allowed in a block. Any thread,
// real-time safe.
#pragma once

#include <cstdint>

namespace vxcomn {

uint32_t *threadRandomWord() noexcept;

}  // namespace vxcomn
