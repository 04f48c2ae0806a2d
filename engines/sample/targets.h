// SPDX-License-Identifier: MIT
//
// What the block works towards: every number of the render thread, made of the Settings for one sample rate. A control thread makes
// a whole set and publishes it; the render thread takes it at the start of a block and glides there. So the block designs nothing,
// and never sees half of a change.
#pragma once

#include "settings.h"

namespace sample_engine {

struct Targets {
    FilterShape surround;
    FilterShape bass;
    FilterShape detail;
    FilterShape voice;
    EqualiserShapes equaliser;
    double limiter = 1.0;  // 1 on, 0 off
    double inputGain = 1.0;
    double outputGain = 1.0;
    double effects = 1.0;  // 1 processed, 0 the input bit for bit
    double limiterRelease = 0.0;
    int glideFrames = 1;
};

Targets makeTargets(const Settings &settings, double sampleRate);

}  // namespace sample_engine
