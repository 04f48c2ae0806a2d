// SPDX-License-Identifier: MIT
//
// The design of one second-order filter: a state-variable filter with trapezoidal integrators, whose output is a mixture of input,
// band-pass and low-pass. Control threads design; the render thread walks from one design to the next (filter_stage.h). The form is
// chosen because every point on a straight line between two designs is itself a stable filter, which biquad coefficients do not
// promise.
#pragma once

namespace sample_engine {

struct FilterShape {
    double tuning = 0.0;   // tan(pi f / rate)
    double damping = 1.0;  // 1 / quality
    double input = 1.0;    // how much of each goes into the output
    double bandPass = 0.0;
    double lowPass = 0.0;

    bool operator==(const FilterShape &) const = default;
    // Lets every sample through as it is.
    bool isNeutral() const { return input == 1.0 && bandPass == 0.0 && lowPass == 0.0; }
};

// All three: the frequency lies above 0 and below half the rate, gains are linear and above 0. A gain of 1 gives a neutral shape.

// A bell: `gain` at the frequency, 1 far from it.
FilterShape designBell(double frequencyHz, double quality, double gain, double sampleRate);
// A shelf: `gain` below the frequency, 1 above it, the square root of `gain` at it.
FilterShape designLowShelf(double frequencyHz, double quality, double gain, double sampleRate);
// A shelf: `gain` above the frequency, 1 below it, the square root of `gain` at it.
FilterShape designHighShelf(double frequencyHz, double quality, double gain, double sampleRate);

}  // namespace sample_engine
