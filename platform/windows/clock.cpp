// SPDX-License-Identifier: MIT
#include "platform/clock.h"

#include "platform/windows/sdk.h"

namespace vxcomn {
namespace {

// A class, so that it can be given its place ahead of all other objects that are built at load and may ask for the time.
struct Frequency {
    Frequency() noexcept {
        LARGE_INTEGER answer;
        QueryPerformanceFrequency(&answer);
        hertz = answer.QuadPart;
    }
    int64_t hertz;
};
[[gnu::init_priority(101)]] Frequency frequency;

}  // namespace

[[gnu::section("RT_CODE")]] int64_t performanceCounter() noexcept {
    LARGE_INTEGER count;
    QueryPerformanceCounter(&count);
    return count.QuadPart;
}

int64_t performanceFrequency() noexcept {
    return frequency.hertz;
}

[[gnu::section("RT_CODE")]] int64_t performanceNanoseconds() noexcept {
    LARGE_INTEGER count;
    QueryPerformanceCounter(&count);
    return nanosecondsOf(count.QuadPart, frequency.hertz);
}

}  // namespace vxcomn
