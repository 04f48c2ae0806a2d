// SPDX-License-Identifier: MIT
//
// Finds where a test signal arrives at the microphone: a first peak more than six times above what came 10 ms earlier, backed by an
// opposite one more than three times above. The sign of the first peak is the polarity of the chain. `resetOnsetDetector` is for
// control calls that hold the capture path up; `findOnset` runs on the capture thread.
#pragma once

#include "vxcomn/measurement_records.h"

namespace vxcomn {

// Forgets everything, for a rate in Hz.
void resetOnsetDetector(OnsetDetector &detector, float rate) noexcept;

struct Onset {
    bool found;
    int index;   // of the first peak, counted in samples since the reset
    float peak;  // its sample
};

// Searches one block. Stops where the onset is found: the rest of the block isn't looked at.
Onset findOnset(OnsetDetector &detector, const float *samples, int count) noexcept;

}  // namespace vxcomn
