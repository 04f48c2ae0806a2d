// SPDX-License-Identifier: MIT
//
// The word that the pink noise's generator keeps for each thread. Each thread's sequence begins as the C library's does, with 1,
// and nobody seeds it. Where a thread's own memory lies is the platform's business, and compilers reach it in ways that may
// allocate at the first use; so the word comes through a function that the host installs while the library loads. Without one, all
// threads share a single word, which is what a lone generator in a test wants.
#pragma once

#include <cstdint>

namespace vxcomn {

// Returns the calling thread's word, which begins as 1. Real-time safe, never null.
using ThreadRandomWord = uint32_t *(*)() noexcept;

// [control, no block runs]; null goes back to the shared word.
void installThreadRandom(ThreadRandomWord word) noexcept;

// The calling thread's word. Real-time safe.
uint32_t *threadRandom() noexcept;

}  // namespace vxcomn
