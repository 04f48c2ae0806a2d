// SPDX-License-Identifier: MIT
//
// What keeps a run in step with something outside of it, such as the settings of an audio endpoint: it names the engine, sends
// parameters while blocks run, and notes the block in which each was heard. The run knows only this; main hands it the maker.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "tools/vx/run_options.h"

namespace vx {

class HostSession;

// A change that reached the engine during the run.
struct FollowedChange {
    double seconds = 0.0;  // of audio, at the first block that carried it
    std::string name;
    std::string text;  // "bass 0.5 -> 0.7"
    std::string writer;
    std::optional<double> takenMs;  // from the write until it was in the engine
    std::optional<double> heardMs;  // from the write until the first block that carried it was ready
};

class RunFollower {
  public:
    virtual ~RunFollower() = default;

    // The engine's module to play with. Asked for ahead of every block; another name than before means to load that one.
    virtual std::string engine() = 0;
    // That engine cannot be had: the one before stays.
    virtual void engineRefused(const std::string &why) = 0;
    // A host is ready and gets all settings. Null: the host is about to go, and nothing may be sent to it any more.
    virtual void attach(HostSession *host) = 0;

    virtual void beforeBlock(double seconds) = 0;
    virtual void afterBlock() = 0;

    virtual std::vector<FollowedChange> changes() const = 0;
};

// Null for options that follow nothing.
using FollowerMaker = std::function<std::unique_ptr<RunFollower>(const RunOptions &)>;

}  // namespace vx
