// SPDX-License-Identifier: MIT
//
// Lets a control call know when the blocks that may still use a filter's old memory have ended, with neither a lock nor a wait in
// the block.
//
// A filter record has no room for this, and its heap memory is just what may be replaced, so the counts stand in a table of the
// process, found by the filter's address. Filters may share a count; that only makes a control call wait for one more block.
//
// Block:    enter, read the published pointer, work, leave.
// Control:  publish the new pointer (or null), wait until nobody is inside, free or reuse the old one.
// Both sides do the first two steps in sequentially consistent order, so at least one of them sees the other.
#pragma once

#include <atomic>
#include <cstdint>

#include "measure/realtime.h"

namespace vxcomn {

inline constexpr int kFirBlockCounts = 64;

struct alignas(64) FirBlockCount {
    std::atomic<uint32_t> inside{0};  // blocks: add and subtract; control: load
};

extern constinit FirBlockCount firBlockCounts[kFirBlockCounts];

VXCOMN_RT_INLINE FirBlockCount &firBlockCount(const void *filter, uintptr_t filterSize) noexcept {
    return firBlockCounts[reinterpret_cast<uintptr_t>(filter) / filterSize % kFirBlockCounts];
}

// [control] Returns when no block that entered before the call is inside any more.
void waitForFirBlocks(const FirBlockCount &count) noexcept;

}  // namespace vxcomn
