// SPDX-License-Identifier: MIT
#include "measure/tracking_notch.h"

#include <xmmintrin.h>

#include "measure/biquad_step.h"
#include "measure/kernels.h"
#include "measure/notch_lanes.h"
#include "measure/realtime.h"

namespace vxcomn {
namespace {

constexpr unsigned kBlockMode = 0x8840;  // flush to zero, denormals are zero, underflow masked

VXCOMN_RT_INLINE float magnitude(float x) {
    return __builtin_fabsf(x);
}

// What is added up beside the filter, which leaves the processor time for it.
struct Sums {
    double input, output, phase;
};

// Filters a piece with coefficients that change from sample to sample, and leaves the last ones in the record.
VXCOMN_RT_INLINE void filterPiece(BiquadState &state, const NotchPiece &piece, float *samples, int count, Sums &sums) {
    BiquadHistory history{state.x1, state.x2, state.y1, state.y2};
    double input = sums.input, output = sums.output, phase = sums.phase;
    for (int i = 0; i < count; ++i) {
        const float gain = piece.gain[i], feedback = piece.feedback[i], x = samples[i];
        const float y = biquadStep(history, gain, feedback, gain, feedback, piece.a2[i], x);
        samples[i] = y;
        input += magnitude(x);
        output += magnitude(y);
        phase += piece.turn[i];
    }
    sums = {input, output, phase};
    state.b0 = state.b2 = piece.gain[count - 1];
    state.b1 = state.a1 = piece.feedback[count - 1];
    state.a2 = piece.a2[count - 1];
    state.x1 = history.x1;
    state.x2 = history.x2;
    state.y1 = history.y1;
    state.y2 = history.y2;
}

// How many samples can go through together: as long as the lead-in lasts on both sides of each, or from its end on.
VXCOMN_RT_INLINE int evenPiece(const SweepGenerator &tracker, int count) {
    const int most = count < kNotchPiece ? count : kNotchPiece;
    const int64_t left = tracker.PreDelaySamples - tracker.Position;
    if (left <= 0) return most;
    return left - 1 < most ? (left > 1 ? static_cast<int>(left - 1) : 1) : most;
}

// Whether the sweep has passed the band that is to be filled next.
VXCOMN_RT_INLINE bool bandPassed(const DistortionLog &log, double position) {
    return log.next >= 0 && log.next < log.points && log.next < VX_MAX_DISTORTION && log.next < static_cast<int>(position);
}

// One piece, which lies behind the lead-in (`sounding`) or within it. Place 0 of the coefficients is filled, before and after.
VXCOMN_RT void trackPiece(SweepGenerator &tracker, BiquadState &notch, DistortionLog &log, float *samples, int count, double rate,
                          NotchPiece &piece) {
    Sums sums{log.inputSum, log.outputSum, tracker.Phase};
    if (tracker.Position >= tracker.PreDelaySamples) {
        SweepRun run{tracker.Table, tracker.TablePosition, tracker.TableStep,       tracker.TableSize - 2.0,
                     tracker.Phase, tracker.RadiansPerHz,  tracker.CurrentFrequency};
        measureKernels->notch(run, rate, count, piece);
        filterPiece(notch, piece, samples, count, sums);
        log.inputSum = sums.input;
        tracker.TablePosition = run.position;
        tracker.Phase = sums.phase;
        tracker.CurrentFrequency = run.hz;
    } else {
        // In the lead-in the frequency stands still, and nothing but the sample before its end counts: behind the notch only.
        for (int i = 0; i < count; ++i) {
            piece.gain[i + 1] = piece.gain[0];
            piece.feedback[i + 1] = piece.feedback[0];
            piece.a2[i + 1] = piece.a2[0];
            piece.turn[i] = 0.0;
        }
        filterPiece(notch, piece, samples, count, sums);
    }
    piece.gain[0] = piece.gain[count];
    piece.feedback[0] = piece.feedback[count];
    piece.a2[0] = piece.a2[count];
    tracker.Position += count;
    if (tracker.Position >= tracker.PreDelaySamples) log.outputSum = sums.output;
}

}  // namespace

VXCOMN_RT void runBiquad(BiquadState &state, float *samples, int n) noexcept {
    const unsigned mode = _mm_getcsr();
    _mm_setcsr(mode | kBlockMode);
    BiquadHistory history{state.x1, state.x2, state.y1, state.y2};
    const float b0 = state.b0, b1 = state.b1, b2 = state.b2, a1 = state.a1, a2 = state.a2;
    for (int i = 0; i < n; ++i) samples[i] = biquadStep(history, b0, b1, b2, a1, a2, samples[i]);
    state.x1 = history.x1;
    state.x2 = history.x2;
    state.y1 = history.y1;
    state.y2 = history.y2;
    _mm_setcsr(mode);
}

VXCOMN_RT void trackSweep(SweepGenerator &tracker, BiquadState &notch, DistortionLog log, float *samples, int count,
                          int rate) noexcept {
    // The filter's mode, for all of the block: changing it makes the processor wait.
    const unsigned mode = _mm_getcsr();
    _mm_setcsr(mode | kBlockMode);
    const auto hz = static_cast<double>(static_cast<float>(rate));
    NotchPiece piece;
    const auto first = notchAt<double, int64_t>(static_cast<double>(static_cast<float>(tracker.CurrentFrequency)), hz);
    piece.gain[0] = static_cast<float>(first.gain);
    piece.feedback[0] = static_cast<float>(first.feedback);
    piece.a2[0] = static_cast<float>(first.a2);
    for (int done = 0; done < count;) {
        // Where a band may end inside the piece, it goes sample by sample. The table position moves one way, so its last value
        // tells.
        int length = evenPiece(tracker, count - done);
        double last = tracker.TablePosition + 0x1p-20 + (tracker.TableStep > 0.0 ? length * tracker.TableStep : 0.0);
        if (last > tracker.TableSize) last = tracker.TableSize;
        if (bandPassed(log, last)) length = 1;
        trackPiece(tracker, notch, log, samples + done, length, hz, piece);
        done += length;
        if (bandPassed(log, tracker.TablePosition)) {
            log.ratios[log.next] = log.inputSum == 0.0 ? 1.0F : static_cast<float>(log.outputSum / log.inputSum);
            log.inputSum = 0.0;
            log.outputSum = 0.0;
            ++log.next;
        }
    }
    _mm_setcsr(mode);
}

}  // namespace vxcomn
