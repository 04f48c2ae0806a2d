// SPDX-License-Identifier: MIT
//
// Ctrl-C during a long run: the run ends through the usual way out, so that temporary files go.
#pragma once

#include <csignal>

#include "tools/vx/failure.h"

namespace vx {

class InterruptGuard {
  public:
    InterruptGuard() : previousInterrupt_(std::signal(SIGINT, note)), previousTerminate_(std::signal(SIGTERM, note)) {}
    InterruptGuard(const InterruptGuard &) = delete;
    InterruptGuard &operator=(const InterruptGuard &) = delete;
    ~InterruptGuard() {
        std::signal(SIGINT, previousInterrupt_);
        std::signal(SIGTERM, previousTerminate_);
    }

    // Fails once a signal has come.
    void check() const {
        if (noted_ != 0) throw Failure(ExitStatus::system, "interrupted; nothing was written");
    }

    // For whom a signal is the usual end.
    bool noted() const { return noted_ != 0; }

  private:
    using Handler = void (*)(int);

    static void note(int) { noted_ = 1; }

    static inline volatile std::sig_atomic_t noted_ = 0;
    Handler previousInterrupt_;
    Handler previousTerminate_;
};

}  // namespace vx
