// SPDX-License-Identifier: MIT
//
// Follows a running sweep on the capture side and takes its fundamental out of the samples: a notch whose frequency moves with
// every sample. What is left over what was there is the distortion, one figure for each band that the sweep has passed. Capture
// thread.
#pragma once

#include "vxcomn/measurement_records.h"

namespace vxcomn {

// Filters n samples in place: feed-forward summed in f32, feedback in f64. Sets the block path's floating-point mode and restores
// it.
void runBiquad(BiquadState &state, float *samples, int n) noexcept;

// Where one channel's distortion figures go.
struct DistortionLog {
    double &inputSum;   // magnitudes before the notch
    double &outputSum;  // magnitudes behind it
    float *ratios;      // VX_MAX_DISTORTION of them
    int32_t &next;      // band to fill
    int32_t points;     // how many the sweep can give
};

// Takes a block through the notch, with the tracker moving along. rate: Hz, of the capture side.
void trackSweep(SweepGenerator &tracker, BiquadState &notch, DistortionLog log, float *samples, int count, int rate) noexcept;

}  // namespace vxcomn
