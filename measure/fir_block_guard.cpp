// SPDX-License-Identifier: MIT
#include "measure/fir_block_guard.h"

#include <thread>

namespace vxcomn {

constinit FirBlockCount firBlockCounts[kFirBlockCounts];

void waitForFirBlocks(const FirBlockCount &count) noexcept {
    while (count.inside.load(std::memory_order_seq_cst) != 0) std::this_thread::yield();
}

}  // namespace vxcomn
