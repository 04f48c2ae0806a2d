// SPDX-License-Identifier: MIT
//
// What must never stand in a block, one of each kind: the negative controls of the real-time proofs. host/process.cpp takes this in
// only if the build defines VXCOMN_RT_FAULT as the name of one of the functions below; the shipped library never does.
#pragma once

#include <unistd.h>

#include <chrono>
#include <mutex>
#include <thread>
#include <vector>

#include "measure/realtime.h"

namespace vxcomn::injected_fault {

inline std::mutex mutex;
inline volatile char pages[64 << 20];
inline size_t nextPage = 0;

// An allocation, and its release.
VXCOMN_RT_INLINE void allocFault() {
    void *volatile memory = ::operator new(64);
    ::operator delete(memory);
}

// A lock that nobody else holds.
VXCOMN_RT_INLINE void lockFault() {
    const std::lock_guard lock(mutex);
}

// A call of the system: it is asked to write nothing.
VXCOMN_RT_INLINE void writeFault() {
    const char text[1] = {};
    [[maybe_unused]] const auto written = ::write(STDERR_FILENO, text, 0);
}

// A thread's own object with a constructor and a destructor.
VXCOMN_RT_INLINE void tlsFault() {
    thread_local std::vector<int> object(4);
    object.front() = 1;
}

// An exception, caught at once.
VXCOMN_RT_INLINE void throwFault() {
    try {
        throw 1;
    } catch (int) {
        return;
    }
}

// A page that nobody has touched before.
VXCOMN_RT_INLINE void pageFault() {
    pages[nextPage * 4096 % sizeof pages] = 1;
    ++nextPage;
}

// A nap.
VXCOMN_RT_INLINE void sleepFault() {
    std::this_thread::sleep_for(std::chrono::microseconds(50));
}

}  // namespace vxcomn::injected_fault
