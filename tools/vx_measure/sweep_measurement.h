// SPDX-License-Identifier: MIT
//
// Distortion over frequency by the library's sweep: what stays behind a notch that follows the sweep, over everything, a ratio of
// mean magnitudes a band. Works out ahead which bands a sweep can measure, runs it, and says of every other band why not.
#pragma once

#include <string>
#include <vector>

#include "tools/vx_measure/band_grid.h"
#include "tools/vx_measure/rig.h"

namespace vx {

struct SweepSettings {
    int channel = 0;
    int startHz = 20;
    int stopHz = 20000;
    int timeMs = 20000;
    int preDelayMs = 60;
    int bandsPerOctave = 3;
};

struct SweepBand {
    double centreHz = 0.0;
    double lowestHz = 0.0;
    double highestHz = 0.0;
    double ratio = 0.0;    // what the library gave; only of a band that was reached
    double floor = 0.0;    // what the sweep leaves behind the notch on a chain without distortion, at most
    int highestOrder = 0;  // the highest harmonic below half the rate
    std::string why;       // why it is not measurable; empty if it was measured
};

struct SweepOutcome {
    bool onset = false;
    std::vector<SweepBand> bands;

    bool anyMeasured() const;
};

// Fails with what is wrong: a stop beyond the table or half the rate, or no more than one band between start and stop.
void checkSweep(const SweepSettings &settings, int rate);

// Seconds from the beginning until the sweep has passed its last band, on a chain without delay.
double sweepSeconds(const SweepSettings &settings);

void startSweep(Rig &rig, const SweepSettings &settings);
void stopSweep(Rig &rig, const SweepSettings &settings);

// Runs the whole measurement.
SweepOutcome measureSweep(Rig &rig, const SweepSettings &settings, bool silent);

// The largest ratio that the sweep itself leaves in a band of the table: the notch follows up to a millisecond late, lags, and has
// to settle at the beginning.
double sweepFloor(const SweepSettings &settings, int band, int rate);

}  // namespace vx
