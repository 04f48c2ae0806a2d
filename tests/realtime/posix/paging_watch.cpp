// SPDX-License-Identifier: MIT
//
// What the kernel counts for the thread: page faults and waits. Warm blocks have none, also while the analysers' rings of one
// second go round for the first time.
#include <malloc.h>
#include <sys/resource.h>

#include <cstdio>

#include "tests/realtime/watch.h"

namespace realtime {
namespace {

rusage before = {};
long faults = 0;
long waits = 0;

}  // namespace

WatchNeeds watchNeeds() {
    return {.warmBlocks = 8, .watchedBlocks = 400};
}

void beginWatch() {
    // Large blocks come fresh from the system and not out of what was freed before, so that a page nobody has touched yet shows.
    mallopt(M_MMAP_THRESHOLD, 64 * 1024);
}

void enterBlock() {
    getrusage(RUSAGE_THREAD, &before);
}

void leaveBlock() {
    rusage after = {};
    getrusage(RUSAGE_THREAD, &after);
    faults += after.ru_minflt - before.ru_minflt + after.ru_majflt - before.ru_majflt;
    waits += after.ru_nvcsw - before.ru_nvcsw;
}

bool endWatch(long blocks) {
    std::printf("paging: %ld warm blocks, %ld page faults, %ld waits\n", blocks, faults, waits);
    return faults == 0 && waits == 0;
}

}  // namespace realtime
