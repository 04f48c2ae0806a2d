// SPDX-License-Identifier: MIT
//
// The sine and the sweep in lanes. A phase is a sum that must be rounded sample by sample, so it stays a chain of scalar additions;
// everything that hangs on it goes in lanes, and the processor works at both at once. Blocks are cut into pieces that stay in the
// first cache.
#pragma once

#include "measure/kernels.h"
#include "measure/realtime.h"
#include "measure/sine_lanes.h"
#include "measure/sweep_step.h"

namespace vxcomn {
namespace {

constexpr int kPiece = 64;

// The sines of one piece, of which the last vector may be shorter than a whole one.
template <class L>
VXCOMN_RT_INLINE void sinesOfPiece(double *phases, float *samples, int count) {
    int i = 0;
    for (; i + L::kLanes <= count; i += L::kLanes) sineInLanes<L>(phases + i, samples + i);
    if (i == count) return;
    float rest[L::kLanes];
    for (int lane = count; lane < i + L::kLanes; ++lane) phases[lane] = phases[i];
    sineInLanes<L>(phases + i, rest);
    for (int lane = 0; i + lane < count; ++lane) samples[i + lane] = rest[lane];
}

// Returns the phase behind the block.
template <class L>
VXCOMN_RT_INLINE double sineBlock(double phase, double step, float *samples, int count) {
    alignas(64) double phases[kPiece];
    for (int done = 0; done < count; done += kPiece) {
        const int piece = count - done < kPiece ? count - done : kPiece;
        for (int i = 0; i < piece; ++i) {
            phases[i] = phase;
            phase += step;
        }
        sinesOfPiece<L>(phases, samples + done, piece);
    }
    return phase;
}

// The table positions of a piece and, in place of them, its frequencies.
template <class L>
VXCOMN_RT_INLINE void sweepPiece(SweepRun &run, double *hz, int count) {
    using D = typename L::Doubles;
    const double first = run.position;
    double position = first;
    for (int i = 0; i < count; ++i) {
        hz[i] = position;
        position += run.step;
    }
    // The step has one sign, so the sums rise or fall throughout: if the last one is inside the limits, none was cut.
    if (!(position >= 0.0 && position <= run.highest)) {
        position = first;
        for (int i = 0; i < count; ++i) {
            hz[i] = position;
            position = nextTablePosition(position, run.step, run.highest);
        }
    }
    run.position = position;

    const auto index = static_cast<int>(first);
    if (index == static_cast<int>(hz[count - 1])) {  // the rule: a table entry lasts for hundreds of samples
        const double slope = run.table[index + 1] - run.table[index], base = run.table[index];
        for (int i = 0; i < count; i += L::kLanes) {
            const D at = L::load(hz + i);
            L::store(hz + i, slope * (at - static_cast<double>(index)) + base);
        }
    } else {
        for (int i = 0; i < count; ++i) hz[i] = sweepFrequency(run.table, hz[i]);
    }
    run.hz = hz[count - 1];
}

template <class L>
VXCOMN_RT_INLINE void sweepBlock(SweepRun &run, float *samples, int count) {
    using D = typename L::Doubles;
    alignas(64) double steps[kPiece] = {};
    alignas(64) double phases[kPiece];
    double phase = run.phase;
    for (int done = 0; done < count; done += kPiece) {
        const int piece = count - done < kPiece ? count - done : kPiece;
        sweepPiece<L>(run, steps, piece);
        for (int i = 0; i < piece; i += L::kLanes) {
            const D hz = L::load(steps + i);
            L::store(steps + i, hz * run.radiansPerHz);
        }
        for (int i = 0; i < piece; ++i) {
            phases[i] = phase;
            phase += steps[i];
        }
        sinesOfPiece<L>(phases, samples + done, piece);
    }
    run.phase = phase;
}

}  // namespace
}  // namespace vxcomn
