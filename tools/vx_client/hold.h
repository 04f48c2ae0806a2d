// SPDX-License-Identifier: MIT
//
// Staying alive for what lasts only as long as its client: until Ctrl-C, for a time, or until nobody reads the output any more.
#pragma once

#include <CLI/CLI.hpp>
#include <chrono>
#include <optional>
#include <string>

#include "tools/vx/interrupt.h"

namespace vx::client {

// Adds --for.
void addHoldOption(CLI::App &verb, std::optional<double> &seconds, const std::string &what);

class Hold {
  public:
    // Listens and counts from here on.
    explicit Hold(const std::optional<double> &seconds);

    bool isOver() const;
    // Sleeps for a moment.
    void nap() const;
    // Until it is over.
    void wait() const;

  private:
    using Clock = std::chrono::steady_clock;

    InterruptGuard interrupt_;
    std::optional<Clock::time_point> end_;
};

}  // namespace vx::client
