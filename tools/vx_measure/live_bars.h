// SPDX-License-Identifier: MIT
//
// A spectrum as bars in the terminal, drawn again in place. Where standard output is no terminal each picture follows the last, and
// nothing waits.
#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "tools/vx/console.h"
#include "tools/vx_measure/spectrum_reader.h"

namespace vx {

// A line a band, from the lowest frequency to the highest; bands that cannot be measured are left out. Both bounds in decibels.
std::string barLines(const std::vector<SpectrumBand> &bands, double bottomDb, double topDb, int width, const Style &style);

class LiveBars {
  public:
    explicit LiveBars(const std::string &colour);

    // Draws, then waits until so much sound would have played.
    void show(const std::vector<SpectrumBand> &bands, double seconds);

  private:
    Style style_;
    bool terminal_;
    int lines_ = 0;
    std::chrono::steady_clock::time_point start_;
};

}  // namespace vx
