// SPDX-License-Identifier: MIT
//
// A piece of a test in a forked child, with a machine root of its own: cheap enough for a round for every byte of a file. The test
// process must not have used its own root by then, so such tests run in a helper.
#pragma once

#include <cstdio>
#include <functional>
#include <iostream>

#include <sys/wait.h>
#include <unistd.h>

namespace test {

// What stands in buffers must not be printed by both sides.
inline pid_t forkFlushed() {
    std::cout.flush();
    std::fflush(nullptr);
    return fork();
}

// The child's exit status, or -1 if a signal ended it: a crash, or an alarm after twenty seconds.
inline int inFork(const std::function<int()> &body) {
    const pid_t child = forkFlushed();
    if (child == 0) {
        alarm(20);
        _exit(body());
    }
    int result = 0;
    waitpid(child, &result, 0);
    return WIFEXITED(result) ? WEXITSTATUS(result) : -1;
}

}  // namespace test
