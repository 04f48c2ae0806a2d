// SPDX-License-Identifier: MIT
#include "platform/clock.h"

#include <time.h>

namespace vxcomn {

constexpr int64_t kFrequency = 1000000000;

[[gnu::section("RT_CODE")]] int64_t performanceCounter() noexcept {
    timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * kFrequency + now.tv_nsec;
}

int64_t performanceFrequency() noexcept {
    return kFrequency;
}

// At this frequency the count is the nanoseconds; the formula's divisions would only cost time.
[[gnu::section("RT_CODE")]] int64_t performanceNanoseconds() noexcept {
    return performanceCounter();
}

}  // namespace vxcomn
