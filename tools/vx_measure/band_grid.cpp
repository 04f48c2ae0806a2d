// SPDX-License-Identifier: MIT
#include "tools/vx_measure/band_grid.h"

#include <cmath>

namespace vx {

namespace {

constexpr double kReferenceHz = 7.8125;  // 1000 / 128; itself never a centre
constexpr double kHighestEdgeHz = 24000.0;

}  // namespace

BandGrid makeBandGrid(int bandsPerOctave) {
    BandGrid grid;
    grid.bandsPerOctave = bandsPerOctave;
    for (int i = 0;; ++i) {
        const double edge = kReferenceHz * std::exp2((i + 0.5) / bandsPerOctave);
        if (edge > kHighestEdgeHz) return grid;
        if (i > 0) grid.centres.push_back(kReferenceHz * std::exp2(static_cast<double>(i) / bandsPerOctave));
        grid.edges.push_back(edge);
    }
}

}  // namespace vx
