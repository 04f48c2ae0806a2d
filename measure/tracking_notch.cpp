// SPDX-License-Identifier: MIT
#include "measure/tracking_notch.h"

#include <xmmintrin.h>

#include "measure/biquad_step.h"
#include "measure/notch_lanes.h"
#include "measure/realtime.h"
#include "measure/sweep_step.h"

namespace vxcomn {
namespace {

VXCOMN_RT_INLINE float magnitude(float x) {
    return x < 0.0F ? -x : x;
}

}  // namespace

VXCOMN_RT void runBiquad(BiquadState &state, float *samples, int n) noexcept {
    const unsigned mode = _mm_getcsr();
    _mm_setcsr(mode | 0x8840);  // flush to zero, denormals are zero, underflow masked
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
    const auto hz = static_cast<double>(static_cast<float>(rate));
    for (int i = 0; i < count; ++i) {
        if (tracker.Position >= tracker.PreDelaySamples) log.inputSum += magnitude(samples[i]);
        const auto at = notchAt<double, int64_t>(static_cast<double>(static_cast<float>(tracker.CurrentFrequency)), hz);
        notch.b0 = notch.b2 = static_cast<float>(at.gain);
        notch.b1 = notch.a1 = static_cast<float>(at.feedback);
        notch.a2 = static_cast<float>(at.a2);
        advanceSweep(tracker);
        runBiquad(notch, samples + i, 1);
        if (tracker.Position >= tracker.PreDelaySamples) log.outputSum += magnitude(samples[i]);
        const int band = log.next;
        if (band >= 0 && band < log.points && band < VX_MAX_DISTORTION && band < static_cast<int>(tracker.TablePosition)) {
            log.ratios[band] = log.inputSum == 0.0 ? 1.0F : static_cast<float>(log.outputSum / log.inputSum);
            log.inputSum = 0.0;
            log.outputSum = 0.0;
            ++log.next;
        }
    }
}

}  // namespace vxcomn
