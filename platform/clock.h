// SPDX-License-Identifier: MIT
//
// The high-resolution performance counter: QueryPerformanceCounter on Windows, the monotonic clock in nanoseconds on Linux. Any
// thread; `performanceCounter` and `nanoseconds` are real-time safe (on Linux no system call: the kernel maps the clock).
#pragma once

#include <cstdint>

namespace vxcomn {

// Counts. Never goes back.
int64_t performanceCounter() noexcept;

// Counts a second; constant for the life of the process.
int64_t performanceFrequency() noexcept;

// The counter in nanoseconds, (C / F) x 1000000000 + ((C mod F) x 1000000000) / F in signed 64-bit integers.
int64_t performanceNanoseconds() noexcept;

}  // namespace vxcomn
