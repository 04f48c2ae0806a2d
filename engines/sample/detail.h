// SPDX-License-Identifier: MIT
//
// Component 2, detail: a high shelf. The parameter is a linear gain g; what lies above the shelf is raised to 1 + g, so that 0 is
// neutral and the slider's upper end (+12 dB) a lift of 13.9 dB. Control threads design it; the stage is FilterStage<Straight>.
#pragma once

#include <algorithm>

#include "filter_shape.h"

namespace sample_engine {

inline constexpr double kDetailHz = 5000.0;
inline constexpr double kDetailQuality = 0.7;

inline FilterShape designDetail(double gain, double sampleRate) {
    // At the lowest rates the shelf begins earlier, so that there is something above it.
    return designHighShelf(std::min(kDetailHz, 0.35 * sampleRate), kDetailQuality, 1.0 + gain, sampleRate);
}

}  // namespace sample_engine
