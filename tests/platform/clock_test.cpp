// SPDX-License-Identifier: MIT
#include "platform/clock.h"

#include <doctest/doctest.h>

#include <thread>
#include <vector>

#include "platform/thread_id.h"

using namespace vxcomn;

TEST_CASE("the counter runs, never goes back, and its frequency stays the same") {
    const int64_t frequency = performanceFrequency();
    CHECK(frequency >= 1000000);
    const int64_t start = performanceCounter();
    int64_t last = start;
    int backwards = 0;
    while (last - start < frequency / 1000) {
        const int64_t now = performanceCounter();
        if (now < last) ++backwards;
        last = now;
    }
    CHECK(backwards == 0);
    CHECK(performanceFrequency() == frequency);
}

TEST_CASE("nanoseconds are the counter's, converted") {
    const int64_t before = nanosecondsOf(performanceCounter(), performanceFrequency());
    const int64_t now = performanceNanoseconds();
    const int64_t after = nanosecondsOf(performanceCounter(), performanceFrequency());
    CHECK(before <= now);
    CHECK(now <= after);
}

TEST_CASE("a count becomes nanoseconds by seconds and rest, without overflow") {
    CHECK(nanosecondsOf(0, 10000000) == 0);
    CHECK(nanosecondsOf(1, 10000000) == 100);
    CHECK(nanosecondsOf(10000001, 10000000) == 1000000100);
    CHECK(nanosecondsOf(2, 3) == 666666666);                                       // cut, not rounded
    CHECK(nanosecondsOf(9000000000000000000, 1000000000) == 9000000000000000000);  // the product alone would not fit
    CHECK(nanosecondsOf(31536000LL * 24000000 + 1, 24000000) == 31536000000000041);
}

TEST_CASE("each thread has a number of its own and keeps it") {
    const uint32_t own = currentThreadId();
    CHECK(own != 0);
    CHECK(currentThreadId() == own);
    uint32_t other = 0;
    std::thread([&other] { other = currentThreadId(); }).join();
    CHECK(other != 0);
    CHECK(other != own);
}
