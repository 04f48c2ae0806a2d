// SPDX-License-Identifier: MIT
//
// The kernels for machines with AVX-512 (F, BW, DQ, VL). See measure/kernels.h.
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
    using Floats = __m512;
    static constexpr int kWidth = 16;
    VXCOMN_RT_INLINE static Floats load(const float *from) { return _mm512_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, Floats value) { _mm512_storeu_ps(to, value); }
    VXCOMN_RT_INLINE static Floats broadcast(float value) { return _mm512_set1_ps(value); }
    // The second one where the first is NaN, as `a > b ? a : b` has it.
    VXCOMN_RT_INLINE static Floats larger(Floats a, Floats b) { return _mm512_max_ps(a, b); }
    VXCOMN_RT_INLINE static Floats smaller(Floats a, Floats b) { return _mm512_min_ps(a, b); }
    VXCOMN_RT_INLINE static Floats interleaveLow(Floats a, Floats b) {
        return _mm512_permutex2var_ps(a, _mm512_setr_epi32(0, 16, 1, 17, 2, 18, 3, 19, 4, 20, 5, 21, 6, 22, 7, 23), b);
    }
    VXCOMN_RT_INLINE static Floats interleaveHigh(Floats a, Floats b) {
        return _mm512_permutex2var_ps(a, _mm512_setr_epi32(8, 24, 9, 25, 10, 26, 11, 27, 12, 28, 13, 29, 14, 30, 15, 31), b);
    }
    VXCOMN_RT_INLINE static Floats magnitude(Floats value) { return _mm512_abs_ps(value); }
    VXCOMN_RT_INLINE static bool anyLarger(Floats a, Floats b) { return _mm512_cmp_ps_mask(a, b, _CMP_GT_OQ) != 0; }
    VXCOMN_RT_INLINE static float highest(Floats value) { return _mm512_reduce_max_ps(value); }
};

struct Wave {
    using Doubles = __m512d;
    using Integers = __attribute__((vector_size(64))) int64_t;
    static constexpr int kLanes = 8;
    VXCOMN_RT_INLINE static Doubles load(const double *from) { return _mm512_loadu_pd(from); }
    VXCOMN_RT_INLINE static void store(double *to, Doubles value) { _mm512_storeu_pd(to, value); }
    VXCOMN_RT_INLINE static void storeRounded(float *to, Doubles value) { _mm256_storeu_ps(to, _mm512_cvtpd_ps(value)); }
    VXCOMN_RT_INLINE static Doubles roundedToFloat(Doubles value) { return _mm512_cvtps_pd(_mm512_cvtpd_ps(value)); }
    VXCOMN_RT_INLINE static bool all(Integers mask) { return _mm512_movepi64_mask(__builtin_bit_cast(__m512i, mask)) == 255; }
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

constinit const MeasureKernels kMeasureKernelsAvx512 = {peaks, anyAbove, mean, copy, sine, sweep, pink, notch, spectrum};

}  // namespace vxcomn
