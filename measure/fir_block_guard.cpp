// SPDX-License-Identifier: MIT
#include "measure/fir_block_guard.h"

#include <thread>

namespace vxcomn {

constinit FirBlockCount firBlockCounts[kFirBlockCounts];

void waitForFirBlocks(FirBlockCount &count) noexcept {
    for (int turn = 0; turn < 2; ++turn) {
        const uint32_t before = count.current.load(std::memory_order_relaxed);
        count.current.store(1 - before, std::memory_order_relaxed);
        while (count.inside[before].load(std::memory_order_seq_cst) != 0) std::this_thread::yield();
    }
}

}  // namespace vxcomn
