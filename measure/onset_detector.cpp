// SPDX-License-Identifier: MIT
#include "measure/onset_detector.h"

#include "measure/exact_power.h"
#include "measure/realtime.h"
#include "measure/saturate.h"

namespace vxcomn {

void resetOnsetDetector(OnsetDetector &detector, float rate) noexcept {
    constexpr double kLogOfHundredth = -4.605170185988091;  // ln 0.01
    detector = OnsetDetector{};
    const int length = truncateToInt32(static_cast<double>(rate) / 100.0);
    detector.windowLength = length < VX_ONSET_HISTORY ? length : VX_ONSET_HISTORY;
    detector.delayedMinimum = detector.minimum = -1e-6F;
    detector.delayedMaximum = detector.maximum = 1e-6F;
    // Kept: nobody reads it.
    detector.decay = exactExponential(kLogOfHundredth / (static_cast<double>(rate) * 100.0 * 0.001));
}

VXCOMN_RT Onset findOnset(OnsetDetector &detector, const float *samples, int count) noexcept {
    constexpr float kFirstGrowth = 6.0F, kSecondGrowth = 3.0F;
    const int window = detector.windowLength < VX_ONSET_HISTORY ? detector.windowLength : VX_ONSET_HISTORY;
    for (int i = 0; i < count; ++i) {
        const float x = samples[i];
        float delayed = x;
        if (window > 0) {
            delayed = detector.history[detector.historyPosition];
            detector.history[detector.historyPosition] = x;
            if (++detector.historyPosition >= window) detector.historyPosition = 0;
        }
        if (delayed > detector.delayedMaximum) detector.delayedMaximum = delayed;
        if (delayed < detector.delayedMinimum) detector.delayedMinimum = delayed;
        if (x > detector.maximum) {
            detector.maximum = x;
            detector.maximumIndex = detector.sampleIndex;
        }
        if (x < detector.minimum) {
            detector.minimum = x;
            detector.minimumIndex = detector.sampleIndex;
        }
        if (detector.sampleIndex > 2 * int64_t{window}) {
            const float up = detector.maximum / detector.delayedMaximum, down = detector.minimum / detector.delayedMinimum;
            if (detector.maximumIndex < detector.minimumIndex) {
                if (up > kFirstGrowth && down > kSecondGrowth) return {true, detector.maximumIndex, detector.maximum};
            } else if (down > kFirstGrowth && up > kSecondGrowth) {
                return {true, detector.minimumIndex, detector.minimum};
            }
        }
        // Counts in 32 bits and wraps, as a search that never ends would otherwise overflow.
        detector.sampleIndex = static_cast<int32_t>(static_cast<uint32_t>(detector.sampleIndex) + 1u);
    }
    return {false, 0, 0.0F};
}

}  // namespace vxcomn
