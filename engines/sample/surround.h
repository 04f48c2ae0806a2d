// SPDX-License-Identifier: MIT
//
// Component 1, surround: widens each left and right pair. The parameter is a linear gain g; the side signal, half the difference of
// the two, is raised to 1 + g above a shelf, the middle stays, so that 0 is neutral and low bass keeps its place. Works on the
// front, back and side pairs whose two speakers the layout has; centre and low frequency pass. The render thread runs it.
#pragma once

#include "filter_stage.h"

namespace sample_engine {

inline constexpr double kSurroundHz = 180.0;
inline constexpr double kSurroundQuality = 0.7;

inline FilterShape designSurround(double gain, double sampleRate) {
    return designHighShelf(kSurroundHz, kSurroundQuality, 1.0 + gain, sampleRate);
}

// Filters the side signal and adds what the filter changed. The two lanes hold the side and its negative: the arithmetic is the
// same for both but for the sign.
struct SideTap {
    bool leftAndRight[kMaxPairs] = {};  // which pairs have a side

    Pair operator()(Pair in, int pair, const FilterStep &step, FilterState &state) const {
        if (!leftAndRight[pair]) return in;
        const Pair side = (in - Pair{in[1], in[0]}) * both(0.5);
        return in + (filterFrame(side, step, state) - side);
    }
};

using SurroundStage = FilterStage<SideTap>;

}  // namespace sample_engine
