// SPDX-License-Identifier: MIT
//
// The picture of --levels-plot: how loud both sides of a run were over time, and what changed when.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "tools/vx/plot.h"
#include "tools/vx/run_follower.h"

namespace vx {

class LevelsPlot {
  public:
    LevelsPlot(const std::vector<std::string> &paths, bool force, int sampleRate);

    void feed(const float *input, size_t inputSamples, const float *output, size_t outputSamples, size_t frames);
    // The files that were made.
    std::vector<std::string> draw(const std::string &title, const std::vector<FollowedChange> &changes);

  private:
    void finishWindow();

    Plot plot_;
    int sampleRate_;
    uint64_t windowFrames_;
    uint64_t frame_ = 0;                           // of the window's begin
    uint64_t inWindow_ = 0;                        // frames
    double inputPower_ = 0.0, outputPower_ = 0.0;  // sums over samples of all channels
    uint64_t inputSamples_ = 0, outputSamples_ = 0;
    Table table_;
};

}  // namespace vx
