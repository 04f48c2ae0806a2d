// SPDX-License-Identifier: MIT
//
// Lets a control call know when the blocks that may still use a filter's old memory have ended, with neither a lock nor a wait in
// the block.
//
// A filter record has no room for this, and its heap memory is just what may be replaced, so the counts stand in a table of the
// process, found by the filter's address. Filters may share a count; that only makes a control call wait for one more block.
//
// Block:    enter, read the published pointer, work, leave.
// Control:  publish the new pointer (or null), wait until each count has been seen at 0, free or reuse the old one.
// Both sides do the first two steps in sequentially consistent order, so a block that got the old pointer was counted before the
// wait began. There are two counts, and the control side sends new blocks to the one that it does not wait for: blocks that follow
// each other without a gap do not keep it waiting.
#pragma once

#include <atomic>
#include <cstdint>

#include "measure/realtime.h"

namespace vxcomn {

inline constexpr int kFirBlockCounts = 64;

struct alignas(64) FirBlockCount {
    std::atomic<uint32_t> current{0};                // which of the counts new blocks take. control: store; blocks: load
    std::atomic<uint32_t> inside[2] = {{0u}, {0u}};  // blocks: add and subtract; control: load
};

extern constinit FirBlockCount firBlockCounts[kFirBlockCounts];

VXCOMN_RT_INLINE FirBlockCount &firBlockCount(const void *filter, uintptr_t filterSize) noexcept {
    return firBlockCounts[reinterpret_cast<uintptr_t>(filter) / filterSize % kFirBlockCounts];
}

// Returns the count that the block leaves again.
VXCOMN_RT_INLINE std::atomic<uint32_t> &enterFirBlock(FirBlockCount &count) noexcept {
    std::atomic<uint32_t> &inside = count.inside[count.current.load(std::memory_order_relaxed)];
    inside.fetch_add(1, std::memory_order_seq_cst);
    return inside;
}

VXCOMN_RT_INLINE void leaveFirBlock(std::atomic<uint32_t> &inside) noexcept {
    inside.fetch_sub(1, std::memory_order_seq_cst);
}

// [control, one thread at a time] Returns when no block that entered before the call is inside any more.
void waitForFirBlocks(FirBlockCount &count) noexcept;

}  // namespace vxcomn
