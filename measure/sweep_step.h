// SPDX-License-Identifier: MIT
//
// One sample of a sweep's way through its frequency table, shared by the generator and by its twin on the capture side, which
// follows the sweep without making a sound. Real-time safe.
#pragma once

#include "measure/realtime.h"
#include "vxcomn/measurement_records.h"

namespace vxcomn {

// Frequency in Hz at a fractional table index.
VXCOMN_RT_INLINE double sweepFrequency(const float *table, double position) {
    const auto i = static_cast<int>(position);
    return static_cast<double>(table[i + 1] - table[i]) * (position - i) + table[i];
}

// The next table index. The limits also catch a step that is no number.
VXCOMN_RT_INLINE double nextTablePosition(double position, double step, double highest) {
    const double next = position + step;
    const double notBelow = next > 0.0 ? next : 0.0;
    return notBelow < highest ? notBelow : highest;
}

// Moves a sweep on by one sample.
VXCOMN_RT_INLINE void advanceSweep(SweepGenerator &sweep) {
    if (sweep.Position >= sweep.PreDelaySamples) {
        const double hz = sweepFrequency(sweep.Table, sweep.TablePosition);
        sweep.CurrentFrequency = hz;
        sweep.TablePosition = nextTablePosition(sweep.TablePosition, sweep.TableStep, sweep.TableSize - 2);
        sweep.Phase += hz * sweep.RadiansPerHz;
    }
    ++sweep.Position;
}

}  // namespace vxcomn
