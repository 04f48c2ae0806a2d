// SPDX-License-Identifier: MIT
//
// Marks for Wine's log of DLL calls: two functions that nothing else calls, one ahead of each block and one behind. The reader of
// the log (relay_log.py) looks at what the same thread called in between.
#include <windows.h>

#include <cstdio>

#include "tests/realtime/watch.h"

namespace realtime {

WatchNeeds watchNeeds() {
    return {.warmBlocks = 0, .watchedBlocks = 8};
}

void beginWatch() {}

void enterBlock() {
    GetTapeStatus(INVALID_HANDLE_VALUE);
}

void leaveBlock() {
    GetMailslotInfo(INVALID_HANDLE_VALUE, nullptr, nullptr, nullptr, nullptr);
}

bool endWatch(long blocks) {
    std::printf("relay: %ld blocks\n", blocks);
    return true;
}

}  // namespace realtime
