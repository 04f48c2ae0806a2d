// SPDX-License-Identifier: MIT
#include "tools/vx/load_statistics.h"

#include <algorithm>
#include <bit>
#include <cmath>

namespace vx {

namespace {

constexpr int kStepBits = 7;
constexpr size_t kSteps = size_t{1} << kStepBits;  // counters an octave
constexpr int kOctaves = 36;                       // up to 68 s
constexpr uint64_t kLongest = (uint64_t{1} << kOctaves) - 1;

// Below kSteps nanoseconds each value has its own counter; above, the octave and the seven bits behind the leading one choose it.
size_t indexOf(uint64_t ns) {
    if (ns < kSteps) return static_cast<size_t>(ns);
    const int octave = std::bit_width(ns) - 1 - kStepBits;
    return (static_cast<size_t>(octave) << kStepBits) + static_cast<size_t>(ns >> octave);
}

double lowestOf(size_t index) {
    if (index < 2 * kSteps) return static_cast<double>(index);
    const size_t octave = index / kSteps - 1;
    return std::ldexp(static_cast<double>(index - octave * kSteps), static_cast<int>(octave));
}

}  // namespace

LoadStatistics::LoadStatistics() : counts_(indexOf(kLongest) + 1) {}

void LoadStatistics::add(uint64_t nanoseconds) {
    ++counts_[indexOf(std::min(nanoseconds, kLongest))];
    ++blocks_;
    total_ += static_cast<double>(nanoseconds);
    maximum_ = std::max(maximum_, nanoseconds);
}

double LoadStatistics::meanNs() const {
    return blocks_ == 0 ? 0.0 : total_ / static_cast<double>(blocks_);
}

double LoadStatistics::percentileNs(double share) const {
    const auto wanted = static_cast<uint64_t>(std::ceil(share * static_cast<double>(blocks_)));
    uint64_t seen = 0;
    for (size_t index = 0; index < counts_.size(); ++index) {
        seen += counts_[index];
        if (seen >= wanted && seen > 0) return std::min((lowestOf(index) + lowestOf(index + 1)) / 2.0, maximumNs());
    }
    return maximumNs();
}

std::vector<LoadBar> LoadStatistics::histogram(int barsPerOctave) const {
    std::vector<LoadBar> bars;
    if (blocks_ == 0) return bars;
    const auto barOf = [&](double ns) { return static_cast<int>(std::floor(std::log2(std::max(ns, 1.0)) * barsPerOctave)); };
    const auto edgeOf = [&](int bar) { return std::exp2(static_cast<double>(bar) / barsPerOctave); };
    int first = 0;
    for (size_t index = 0; index < counts_.size(); ++index) {
        if (counts_[index] == 0) continue;
        const int bar = barOf((lowestOf(index) + lowestOf(index + 1)) / 2.0);
        if (bars.empty()) first = bar;
        while (static_cast<int>(bars.size()) <= bar - first) {
            const int next = first + static_cast<int>(bars.size());
            bars.push_back({edgeOf(next), edgeOf(next + 1), 0});
        }
        bars[static_cast<size_t>(bar - first)].blocks += counts_[index];
    }
    return bars;
}

}  // namespace vx
