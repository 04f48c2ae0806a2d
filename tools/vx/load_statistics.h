// SPDX-License-Identifier: MIT
//
// The time that blocks take: mean and maximum exactly, percentiles to 0.4 % from counters of fixed size, so that a run may last as
// long as it likes. 128 counters an octave.
#pragma once

#include <cstdint>
#include <vector>

namespace vx {

struct LoadBar {
    double lowestNs = 0.0;
    double highestNs = 0.0;
    uint64_t blocks = 0;
};

class LoadStatistics {
  public:
    LoadStatistics();

    void add(uint64_t nanoseconds);

    uint64_t blocks() const { return blocks_; }
    double totalNs() const { return total_; }
    double meanNs() const;
    double maximumNs() const { return static_cast<double>(maximum_); }
    // The time that `share` of the blocks stayed within, such as 0.99.
    double percentileNs(double share) const;

    // Bars for a plot, a few an octave, without empty ones at either end.
    std::vector<LoadBar> histogram(int barsPerOctave) const;

  private:
    std::vector<uint64_t> counts_;
    uint64_t blocks_ = 0;
    double total_ = 0.0;
    uint64_t maximum_ = 0;
};

}  // namespace vx
