// SPDX-License-Identifier: MIT
//
// The steps of a render block written out plainly: silence test, meters, analyser feeds and the fold of 7.1 to stereo, one sample
// after the other. The indexes of an analyser's ring are exchanged for every frame.
#pragma once

#include <cmath>

#include "vxcomn/measurement_records.h"

namespace plain {

inline bool silent(float *const *channels, int count, int frames) {
    for (int c = 0; c < count; ++c) {
        for (int t = 0; t < frames; ++t) {
            if (std::fabs(channels[c][t]) > 1e-6F) return false;
        }
    }
    return true;
}

inline void meter(float *const *channels, float *peaks, int count, int frames) {
    for (int c = 0; c < count; ++c) {
        for (int t = 0; t < frames; ++t) {
            const float magnitude = std::fabs(channels[c][t]);
            if (magnitude > peaks[c]) peaks[c] = magnitude;
        }
    }
}

inline void feed(RealTimeAnalyser &analyser, float *const *channels, int count, int frames) {
    for (int t = 0; t < frames; ++t) {
        float value = channels[0][t];
        for (int c = 1; c < count; ++c) value += channels[c][t];
        value /= static_cast<float>(count);
        const int write = __atomic_load_n(analyser.writeIndex, __ATOMIC_SEQ_CST);
        const int next = (write + 1) % analyser.capacity;
        if (next == __atomic_load_n(analyser.readIndex, __ATOMIC_SEQ_CST)) continue;
        analyser.ring[write] = value;
        __atomic_exchange_n(analyser.writeIndex, next, __ATOMIC_SEQ_CST);
    }
}

inline void add(float *to, const float *from, float factor, int frames) {
    for (int t = 0; t < frames; ++t) to[t] += from[t] * factor;
}

// Slots: FL FR FC LFE BL BR SL SR.
inline void foldToStereo(float *const *slot, int frames) {
    for (int side = 0; side < 2; ++side) {
        add(slot[side], slot[6 + side], 0.7083F, frames);
        add(slot[side], slot[4 + side], 0.7083F, frames);
        add(slot[side], slot[2], 0.5F, frames);
        add(slot[side], slot[3], 0.5F, frames);
    }
}

}  // namespace plain
