// SPDX-License-Identifier: MIT
//
// The real-time sanitizer's runtime: it stands in front of the C library's functions and ends the process, with a stack, when one
// that may wait or allocate is called between enter and exit.
#include <cstdio>

#include "tests/realtime/watch.h"

extern "C" {
void __rtsan_realtime_enter();
void __rtsan_realtime_exit();
}

namespace realtime {

WatchNeeds watchNeeds() {
    return {.warmBlocks = 0, .watchedBlocks = 200};
}

void beginWatch() {}

void enterBlock() {
    __rtsan_realtime_enter();
}

void leaveBlock() {
    __rtsan_realtime_exit();
}

bool endWatch(long blocks) {
    std::printf("real-time sanitizer: %ld blocks, nothing called\n", blocks);
    return true;
}

}  // namespace realtime
