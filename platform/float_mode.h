// SPDX-License-Identifier: MIT
//
// The floating-point mode of a thread. The block path sets flush-to-zero, denormals-are-zero and the mask of the underflow
// exception for its length, so that a decaying filter never falls into the processor's slow path. The mode is a register of the
// processor, the same on both platforms, so this needs no twin. Any thread, real-time safe.
#pragma once

#include <xmmintrin.h>

namespace vxcomn {

// MXCSR bits: FTZ 0x8000, UM 0x0800, DAZ 0x0040.
inline constexpr unsigned kBlockFloatMode = 0x8840;

// Sets the block's mode for the scope and restores exactly what stood before.
class BlockFloatMode {
  public:
    [[gnu::always_inline]] BlockFloatMode() noexcept : saved_(_mm_getcsr()) { _mm_setcsr(saved_ | kBlockFloatMode); }
    [[gnu::always_inline]] ~BlockFloatMode() { _mm_setcsr(saved_); }
    BlockFloatMode(const BlockFloatMode &) = delete;
    BlockFloatMode &operator=(const BlockFloatMode &) = delete;

  private:
    unsigned saved_;
};

}  // namespace vxcomn
