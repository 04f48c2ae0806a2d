// SPDX-License-Identifier: MIT
//
// The high-resolution performance counter: QueryPerformanceCounter on Windows, the monotonic clock in nanoseconds on Linux. Any
// thread; `performanceCounter` and `performanceNanoseconds` are real-time safe and stand in the block path's section (on Linux no
// system call: the kernel maps the clock). The frequency is asked for once, when the library is loaded.
#pragma once

#include <cstdint>

namespace vxcomn {

// Counts. Never goes back.
int64_t performanceCounter() noexcept;

// Counts a second; constant for the life of the process.
int64_t performanceFrequency() noexcept;

// A count C at frequency F in nanoseconds, without a product that overflows.
[[gnu::always_inline]] constexpr int64_t nanosecondsOf(int64_t count, int64_t frequency) noexcept {
    constexpr int64_t kSecond = 1000000000;
    return count / frequency * kSecond + count % frequency * kSecond / frequency;
}

// The counter in nanoseconds: nanosecondsOf(performanceCounter(), performanceFrequency()).
int64_t performanceNanoseconds() noexcept;

}  // namespace vxcomn
