// SPDX-License-Identifier: MIT
//
// Pink noise with the six recurrences side by side. The chain that counts is the one of the filters: product, sum and rounding to
// f32, sample after sample. Rounding is done on the bits of the f64, which is shorter than two conversions; it gives the nearest
// f32 as long as the value is a normal f32 or 0. The caller sees to that for the states; the sums can't leave that range, since the
// share of the noise is never below 0.008 in magnitude and an f64's last bits bound how far a difference can cancel.
#pragma once

#include <cstdint>

#include "measure/realtime.h"

namespace vxcomn {
namespace {

constexpr int kPinkFilters = 6;
constexpr double kPinkDecay[8] = {0.99886, 0.99332, 0.969, 0.8665, 0.55, -0.7616, 0.0, 0.0};
// The last filter's share is subtracted; adding its negative is the same.
constexpr double kPinkShare[8] = {0.0555179, 0.0750759, 0.153852, 0.3104856, 0.5329522, -0.016898, 0.0, 0.0};

// The nearest f64 that is an f32, ties to even.
template <class D, class I>
VXCOMN_RT_INLINE D roundedBits(D value) {
    const I bits = __builtin_bit_cast(I, value);
    // A logical shift by hand: the shape of I is signed.
    const I last = (bits >> 29) & 1;
    return __builtin_bit_cast(D, (bits + 0x0FFFFFFF + last) & ~int64_t{0x1FFFFFFF});
}

// The generator, one step and eight at once: x becomes x * factor + offset.
constexpr int kPinkPiece = 64, kDrawLanes = 8;
constexpr uint32_t kDrawFactor = 214013u, kDrawOffset = 2531011u;
struct DrawStep {
    uint32_t factor, offset;
};
constexpr DrawStep drawSteps(int count) {
    DrawStep step{1u, 0u};
    for (int i = 0; i < count; ++i) step = {step.factor * kDrawFactor, step.offset * kDrawFactor + kDrawOffset};
    return step;
}

// The words of one piece behind x. Each lane jumps over its neighbours, so that none waits for another.
VXCOMN_RT_INLINE void drawWords(uint32_t x, uint32_t *words) {
    constexpr DrawStep kJump = drawSteps(kDrawLanes);
    for (int i = 0; i < kDrawLanes; ++i) words[i] = x = x * kDrawFactor + kDrawOffset;
    for (int i = kDrawLanes; i < kPinkPiece; ++i) words[i] = words[i - kDrawLanes] * kJump.factor + kJump.offset;
}

// Writes `count` samples; b holds the seven states, x the word of the noise.
template <class L>
VXCOMN_RT_INLINE void pinkInLanes(float *b, uint32_t &word, float *samples, int count) {
    using D = typename L::Doubles;
    using I = typename L::Integers;
    constexpr int kLanes = L::kLanes, kVectors = (kPinkFilters + kLanes - 1) / kLanes, kRow = kVectors * kLanes;

    D state[kVectors], decay[kVectors], share[kVectors];
    double padded[8] = {};
    for (int i = 0; i < kPinkFilters; ++i) padded[i] = b[i];
    for (int v = 0; v < kVectors; ++v) {
        state[v] = L::load(padded + v * kLanes);
        decay[v] = L::load(kPinkDecay + v * kLanes);
        share[v] = L::load(kPinkShare + v * kLanes);
    }
    uint32_t x = word;
    float delayed = b[6];
    for (int done = 0; done < count; done += kPinkPiece) {
        const int piece = count - done < kPinkPiece ? count - done : kPinkPiece;
        alignas(64) uint32_t words[kPinkPiece];
        alignas(64) float white[kPinkPiece], sums[kPinkPiece], rows[kPinkPiece * kRow];
        drawWords(x, words);
        x = words[piece - 1];
        for (int i = 0; i < kPinkPiece; ++i) {
            const auto r = static_cast<int>((words[i] >> 16) & 0x7FFFu);
            white[i] = static_cast<float>(r * 32000.0 / 32767.0 - 16000.0);
        }
        for (int i = 0; i < piece; ++i) {
            const double w = white[i];
            for (int v = 0; v < kVectors; ++v) {
                state[v] = roundedBits<D, I>(decay[v] * state[v] + w * share[v]);
                L::storeRounded(rows + i * kRow + v * kLanes, state[v]);
            }
        }
        for (int i = 0; i < piece; ++i) {
            const float *const f = rows + i * kRow;
            sums[i] = f[1] + f[0] + f[2] + f[3] + f[4] + f[5] + delayed;
            delayed = static_cast<float>(white[i] * 0.115926);
        }
        for (int i = 0; i < piece; ++i) {
            const auto u = static_cast<float>(sums[i] + white[i] * 0.5362);
            samples[done + i] = static_cast<float>(u * 0.2 * 3.0517578125e-5);
        }
    }
    for (int v = 0; v < kVectors; ++v) L::store(padded + v * kLanes, state[v]);
    for (int i = 0; i < kPinkFilters; ++i) b[i] = static_cast<float>(padded[i]);
    b[6] = delayed;
    word = x;
}

}  // namespace
}  // namespace vxcomn
