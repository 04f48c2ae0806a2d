// SPDX-License-Identifier: MIT
//
// A page that a bench and its forked reader share: which round it is, how the reader is to wait in it, and when it had the value.
#pragma once

#include <atomic>
#include <cstdint>

#include <sched.h>
#include <sys/mman.h>
#include <time.h>

#include "bench/support/require.h"

namespace vxcomn::bench {

enum class Way : uint32_t { futex, store, dconf, sound, end };

struct SharedPage {
    std::atomic<uint32_t> word, round;
    std::atomic<Way> way;
    std::atomic<uint64_t> value;
    std::atomic<uint32_t> blocked;  // the round that the reader is about to wait in
    std::atomic<uint32_t> arrived;  // the round whose value it had
    std::atomic<int64_t> when;
};

// Something that a fork shares with its parent; all zeros.
template <class T>
T *makeShared() {
    void *page = mmap(nullptr, sizeof(T), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    require(page != MAP_FAILED, "no shared page");
    return static_cast<T *>(page);
}

// Keeps the calling process on one processor, so that a wake always crosses from one to the other.
inline void pinTo(int processor) {
    cpu_set_t set;
    CPU_ZERO(&set);
    CPU_SET(processor, &set);
    sched_setaffinity(0, sizeof set, &set);
}

inline int64_t nowNanoseconds() {
    timespec now;
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * int64_t{1000000000} + now.tv_nsec;
}

inline void sleepMicroseconds(long count) {
    const timespec time = {0, count * 1000};
    nanosleep(&time, nullptr);
}

}  // namespace vxcomn::bench
