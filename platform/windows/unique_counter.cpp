// SPDX-License-Identifier: MIT
#include "platform/unique_counter.h"

#include <atomic>

#include "platform/clock.h"
#include "platform/windows/sdk.h"

namespace vxcomn {

// The counter above the number of the process: nothing that all processes may write to is sure to be had. Numbers of processes are
// multiples of 4, and those below 65536 differ in what is kept; the counter at its usual 10 MHz has room for a year then.
uint64_t uniqueCounter() noexcept {
    constexpr int kProcessBits = 14;
    constexpr uint64_t kCountBits = (uint64_t{1} << (63 - kProcessBits)) - 1;
    static std::atomic<uint64_t> last;
    uint64_t before = last.load(), next = 0;
    do {
        const auto now = static_cast<uint64_t>(performanceCounter());
        next = now > before ? now : before + 1;
    } while (!last.compare_exchange_weak(before, next));
    const uint64_t process = GetCurrentProcessId() / 4 & ((1u << kProcessBits) - 1);
    return (next & kCountBits) << kProcessBits | process;
}

}  // namespace vxcomn
