// SPDX-License-Identifier: MIT
//
// A trap for system calls: while the thread's selector byte is up, the kernel turns each one into a SIGSYS. The handler notes
// number and address and lets everything through from then on, until the next block raises the byte again.
#include <dlfcn.h>
#include <signal.h>
#include <sys/prctl.h>

#include <cstdio>
#include <cstdlib>

#include "tests/realtime/watch.h"

namespace realtime {
namespace {

#ifndef PR_SET_SYSCALL_USER_DISPATCH
constexpr int PR_SET_SYSCALL_USER_DISPATCH = 59;
constexpr unsigned long PR_SYS_DISPATCH_ON = 1;
#endif

constexpr char kAllow = 0;
constexpr char kTrap = 1;

volatile char selector = kAllow;
volatile long seen = 0;
volatile int lastNumber = -1;
void *volatile lastAddress = nullptr;

void onSystemCall(int, siginfo_t *info, void *) {
    selector = kAllow;
    seen = seen + 1;
    lastNumber = info->si_syscall;
    lastAddress = info->si_call_addr;
}

}  // namespace

WatchNeeds watchNeeds() {
    return {.warmBlocks = 0, .watchedBlocks = 500};
}

void beginWatch() {
    struct sigaction action = {};
    action.sa_sigaction = onSystemCall;
    action.sa_flags = SA_SIGINFO;
    sigaction(SIGSYS, &action, nullptr);
    if (prctl(PR_SET_SYSCALL_USER_DISPATCH, PR_SYS_DISPATCH_ON, 0, 0, &selector) != 0) {
        std::perror("system calls can't be trapped on this machine");
        std::exit(2);
    }
}

void enterBlock() {
    selector = kTrap;
}

void leaveBlock() {
    selector = kAllow;
}

bool endWatch(long blocks) {
    std::printf("system calls: %ld blocks, %ld calls\n", blocks, seen);
    if (seen == 0) return true;
    Dl_info place = {};
    const bool known = dladdr(lastAddress, &place) != 0;
    std::printf("the last was number %d, from %s %s\n", lastNumber, known ? place.dli_fname : "an unknown file",
                known && place.dli_sname != nullptr ? place.dli_sname : "");
    return false;
}

}  // namespace realtime
