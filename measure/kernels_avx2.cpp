// SPDX-License-Identifier: MIT
//
// The kernels for machines with AVX2. See measure/kernels.h.
#include "measure/kernels.h"

#include <immintrin.h>

#include "measure/level_lanes.h"
#include "measure/notch_lanes.h"
#include "measure/pink_lanes.h"
#include "measure/source_lanes.h"
#include "measure/transform_lanes.h"

namespace vxcomn {
namespace {

struct Level {
    using Floats = __m256;
    static constexpr int kWidth = 8;
    VXCOMN_RT_INLINE static Floats load(const float *from) { return _mm256_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, Floats value) { _mm256_storeu_ps(to, value); }
    VXCOMN_RT_INLINE static Floats broadcast(float value) { return _mm256_set1_ps(value); }
    // The second one where the first is NaN, as `a > b ? a : b` has it.
    VXCOMN_RT_INLINE static Floats larger(Floats a, Floats b) { return _mm256_max_ps(a, b); }
    VXCOMN_RT_INLINE static Floats smaller(Floats a, Floats b) { return _mm256_min_ps(a, b); }
    VXCOMN_RT_INLINE static Floats interleaveLow(Floats a, Floats b) {
        return _mm256_permute2f128_ps(_mm256_unpacklo_ps(a, b), _mm256_unpackhi_ps(a, b), 0x20);
    }
    VXCOMN_RT_INLINE static Floats interleaveHigh(Floats a, Floats b) {
        return _mm256_permute2f128_ps(_mm256_unpacklo_ps(a, b), _mm256_unpackhi_ps(a, b), 0x31);
    }
    VXCOMN_RT_INLINE static Floats magnitude(Floats value) { return _mm256_andnot_ps(_mm256_set1_ps(-0.0F), value); }
    VXCOMN_RT_INLINE static bool anyLarger(Floats a, Floats b) { return _mm256_movemask_ps(_mm256_cmp_ps(a, b, _CMP_GT_OQ)) != 0; }
    VXCOMN_RT_INLINE static float highest(Floats value) {
        __m128 half = _mm_max_ps(_mm256_castps256_ps128(value), _mm256_extractf128_ps(value, 1));
        half = _mm_max_ps(half, _mm_movehl_ps(half, half));
        return _mm_cvtss_f32(_mm_max_ss(half, _mm_shuffle_ps(half, half, 1)));
    }
};

struct Wave {
    using Doubles = __m256d;
    using Integers = __attribute__((vector_size(32))) int64_t;
    static constexpr int kLanes = 4;
    VXCOMN_RT_INLINE static Doubles load(const double *from) { return _mm256_loadu_pd(from); }
    VXCOMN_RT_INLINE static void store(double *to, Doubles value) { _mm256_storeu_pd(to, value); }
    VXCOMN_RT_INLINE static void storeRounded(float *to, Doubles value) { _mm_storeu_ps(to, _mm256_cvtpd_ps(value)); }
    VXCOMN_RT_INLINE static Doubles roundedToFloat(Doubles value) { return _mm256_cvtps_pd(_mm256_cvtpd_ps(value)); }
    VXCOMN_RT_INLINE static bool all(Integers mask) { return _mm256_movemask_pd(__builtin_bit_cast(__m256d, mask)) == 15; }
};

VXCOMN_RT void peaks(float *const *channels, float *peaks, int channelCount, int frameCount) {
    peaksInLanes<Level>(channels, peaks, channelCount, frameCount);
}

VXCOMN_RT bool anyAbove(const float *samples, int count, float threshold) {
    return anyAboveInLanes<Level>(samples, count, threshold);
}

VXCOMN_RT void mean(float *const *channels, int channelCount, int from, int count, float *to) {
    meanInLanes<Level>(channels, channelCount, from, count, to);
}

VXCOMN_RT void copy(const float *from, int count, float *to) {
    copyInLanes<Level>(from, count, to);
}

VXCOMN_RT double sine(double phase, double step, float *samples, int count) {
    return sineBlock<Wave>(phase, step, samples, count);
}

VXCOMN_RT void sweep(SweepRun &run, float *samples, int count) {
    sweepBlock<Wave>(run, samples, count);
}

VXCOMN_RT void pink(float *b, uint32_t &word, float *samples, int count) {
    pinkInLanes<Wave>(b, word, samples, count);
}

VXCOMN_RT void notch(SweepRun &run, double rate, int count, NotchPiece &piece) {
    notchInLanes<Wave>(run, rate, count, piece);
}

void spectrum(const SpectrumJob &job) {
    spectrumInLanes<Level>(job);
}

}  // namespace

constinit const MeasureKernels kMeasureKernelsAvx2 = {peaks, anyAbove, mean, copy, sine, sweep, pink, notch, spectrum};

}  // namespace vxcomn
