// SPDX-License-Identifier: MIT
//
// Component 3, bass: a low shelf. The parameter is a linear gain g; what lies below the shelf is raised to 1 + g, so that 0 is
// neutral, a slider at its lower end (-54 dB) all but inaudible, and its upper end (+6 dB) a lift of 9.5 dB. Control threads design
// it; the stage is FilterStage<Straight>.
#pragma once

#include "filter_shape.h"

namespace sample_engine {

inline constexpr double kBassHz = 110.0;
inline constexpr double kBassQuality = 0.7;

inline FilterShape designBass(double gain, double sampleRate) {
    return designLowShelf(kBassHz, kBassQuality, 1.0 + gain, sampleRate);
}

}  // namespace sample_engine
