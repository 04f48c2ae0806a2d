// SPDX-License-Identifier: MIT
#include "tools/vx_client/hold.h"

#include <iostream>
#include <thread>

#include "tools/vx/system.h"

namespace vx::client {

namespace {

constexpr auto kNap = std::chrono::milliseconds(20);
constexpr double kLongestSeconds = 1e7;

}  // namespace

void addHoldOption(CLI::App &verb, std::optional<double> &seconds, const std::string &what) {
    verb.add_option("--for", seconds, what + "; until Ctrl-C without it")
        ->check(CLI::Range(0.0, kLongestSeconds))
        ->type_name("SECONDS");
}

Hold::Hold(const std::optional<double> &seconds) {
    surviveClosedOutput();
    if (seconds) end_ = Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(*seconds));
}

bool Hold::isOver() const {
    return interrupt_.noted() || (end_ && Clock::now() >= *end_) || !std::cout || outputClosed();
}

void Hold::nap() const {
    std::this_thread::sleep_for(kNap);
}

void Hold::wait() const {
    std::cout.flush();
    while (!isOver()) nap();
}

}  // namespace vx::client
