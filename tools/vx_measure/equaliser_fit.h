// SPDX-License-Identifier: MIT
//
// Fits ten peaking filters so that a measured curve comes to a target: least squares of the deviation in decibels, the same weight
// for every third octave. The level between the two curves is free, since a measured curve's level says nothing about its shape.
//
// The bands either stand where the sample engine's sliders do and only their gains move, or their frequencies and widths move, too.
#pragma once

#include <array>
#include <vector>

#include "tools/vx_measure/curve.h"

namespace vx {

inline constexpr int kFitBands = 10;
inline constexpr double kFitMostDb = 18.0;  // either way: a slider's range

struct PeakBand {
    double hz = 0.0;
    double quality = 0.0;
    double decibels = 0.0;
};
using PeakBands = std::array<PeakBand, kFitBands>;

// What one peaking filter does at a frequency, in decibels: half of the boost narrows the poles and half of it widens the zeros,
// with the frequency axis warped as a digital filter of that rate does.
double peakResponse(const PeakBand &band, double hz, double sampleRate);
double equaliserResponse(const PeakBands &bands, double hz, double sampleRate);

// The sample engine's ten bands, all at 0 dB.
PeakBands sliderBands();

struct Deviation {
    double rms = 0.0;  // dB
    double worst = 0.0;
    double worstHz = 0.0;
};

struct EqualiserFit {
    PeakBands bands = {};
    double levelDb = 0.0;  // of the measured curve over the target
    Deviation before;
    Deviation after;
    Curve measured;  // at the points of the fit, levelDb taken off
    Curve target;
    Curve corrected;
};

struct FitSettings {
    double lowestHz = 20.0;
    double highestHz = 20000.0;
    double sampleRate = 48000.0;
    bool free = false;  // frequencies and widths move, too
};

// Points of the fit: those of `measured` within the bounds, at most so many that bands of a 1/12 octave stay apart. Fails with less
// than three. An empty target is flat.
EqualiserFit fitEqualiser(const Curve &measured, const Curve &target, const FitSettings &settings);

}  // namespace vx
