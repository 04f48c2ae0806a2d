// SPDX-License-Identifier: MIT
#include "platform/unique_counter.h"

#include "platform/clock.h"
#include "platform/posix/change_table.h"

namespace vxcomn {

// The counter itself, or one more than the last number of any process where that is not behind the counter. The last number stands
// in the mapped file of the change signals; where there is none, each process counts for itself.
uint64_t uniqueCounter() noexcept {
    constexpr uint64_t kBits = (uint64_t{1} << 63) - 1;
    static std::atomic<uint64_t> own;
    Status why;
    ChangeTable *const table = ChangeTable::get(why);
    std::atomic<uint64_t> &last = table != nullptr ? table->lastNumber() : own;
    uint64_t before = last.load(), next = 0;
    do {
        const auto now = static_cast<uint64_t>(performanceCounter());
        next = now > (before & kBits) ? now : (before + 1) & kBits;
    } while (!last.compare_exchange_weak(before, next));
    return next;
}

}  // namespace vxcomn
