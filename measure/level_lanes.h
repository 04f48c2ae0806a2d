// SPDX-License-Identifier: MIT
//
// The loops over plain samples, written once for all instruction sets: peaks, the silence test, the mean of channels. A kernel file
// names its vector type `Floats` and the functions load, store, magnitude, larger, anyLarger and broadcast for it, and includes
// this. One pass, each sample loaded once; the shorter end of a block goes one by one. Lanes are samples, so nothing is reordered
// that could change a bit: a maximum has no order, and a mean is added up inside its own lane.
#pragma once

#include "measure/realtime.h"

namespace vxcomn {
namespace {

VXCOMN_RT_INLINE float magnitudeOf(float x) {
    return __builtin_fabsf(x);
}

// Four accumulators hide the latency of the maximum.
template <class L>
VXCOMN_RT_INLINE void peaksInLanes(float *const *channels, float *peaks, int channelCount, int frameCount) {
    using Floats = typename L::Floats;
    constexpr int kWidth = L::kWidth;
    for (int c = 0; c < channelCount; ++c) {
        const float *const samples = channels[c];
        float peak = peaks[c];
        int i = 0;
        if (frameCount >= kWidth) {
            Floats a = L::broadcast(0.0F), b = a, d = a, e = a;
            for (; i + 4 * kWidth <= frameCount; i += 4 * kWidth) {
                a = L::larger(L::magnitude(L::load(samples + i)), a);
                b = L::larger(L::magnitude(L::load(samples + i + kWidth)), b);
                d = L::larger(L::magnitude(L::load(samples + i + 2 * kWidth)), d);
                e = L::larger(L::magnitude(L::load(samples + i + 3 * kWidth)), e);
            }
            for (; i + kWidth <= frameCount; i += kWidth) a = L::larger(L::magnitude(L::load(samples + i)), a);
            const float highest = L::highest(L::larger(L::larger(a, b), L::larger(d, e)));
            if (highest > peak) peak = highest;
        }
        for (; i < frameCount; ++i) {
            const float magnitude = magnitudeOf(samples[i]);
            if (magnitude > peak) peak = magnitude;
        }
        peaks[c] = peak;
    }
}

template <class L>
VXCOMN_RT_INLINE bool anyAboveInLanes(const float *samples, int count, float threshold) {
    using Floats = typename L::Floats;
    constexpr int kWidth = L::kWidth;
    const Floats limit = L::broadcast(threshold);
    int i = 0;
    for (; i + 4 * kWidth <= count; i += 4 * kWidth) {
        const Floats a = L::larger(L::magnitude(L::load(samples + i)), limit);
        const Floats b = L::larger(L::magnitude(L::load(samples + i + kWidth)), a);
        const Floats c = L::larger(L::magnitude(L::load(samples + i + 2 * kWidth)), limit);
        const Floats d = L::larger(L::magnitude(L::load(samples + i + 3 * kWidth)), c);
        if (L::anyLarger(L::larger(b, d), limit)) return true;
    }
    for (; i < count; ++i) {
        if (magnitudeOf(samples[i]) > threshold) return true;
    }
    return false;
}

template <class L>
VXCOMN_RT_INLINE void meanInLanes(float *const *channels, int channelCount, int from, int count, float *mean) {
    using Floats = typename L::Floats;
    constexpr int kWidth = L::kWidth;
    const auto divisor = static_cast<float>(channelCount);
    const Floats divisors = L::broadcast(divisor);
    int i = 0;
    for (; i + 2 * kWidth <= count; i += 2 * kWidth) {
        Floats first = L::load(channels[0] + from + i), second = L::load(channels[0] + from + i + kWidth);
        for (int c = 1; c < channelCount; ++c) {
            first += L::load(channels[c] + from + i);
            second += L::load(channels[c] + from + i + kWidth);
        }
        L::store(mean + i, first / divisors);
        L::store(mean + i + kWidth, second / divisors);
    }
    for (; i < count; ++i) {
        float sum = channels[0][from + i];
        for (int c = 1; c < channelCount; ++c) sum += channels[c][from + i];
        mean[i] = sum / divisor;
    }
}

template <class L>
VXCOMN_RT_INLINE void copyInLanes(const float *from, int count, float *to) {
    constexpr int kWidth = L::kWidth;
    int i = 0;
    for (; i + 2 * kWidth <= count; i += 2 * kWidth) {
        const typename L::Floats first = L::load(from + i), second = L::load(from + i + kWidth);
        L::store(to + i, first);
        L::store(to + i + kWidth, second);
    }
    for (; i < count; ++i) to[i] = from[i];
}

}  // namespace
}  // namespace vxcomn
