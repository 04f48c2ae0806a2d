// SPDX-License-Identifier: MIT
//
// The kernels for every x86-64 machine: SSE2. See measure/kernels.h.
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
    using Floats = __m128;
    static constexpr int kWidth = 4;
    VXCOMN_RT_INLINE static Floats load(const float *from) { return _mm_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, Floats value) { _mm_storeu_ps(to, value); }
    VXCOMN_RT_INLINE static Floats broadcast(float value) { return _mm_set1_ps(value); }
    // The second one where the first is NaN, as `a > b ? a : b` has it.
    VXCOMN_RT_INLINE static Floats larger(Floats a, Floats b) { return _mm_max_ps(a, b); }
    VXCOMN_RT_INLINE static Floats smaller(Floats a, Floats b) { return _mm_min_ps(a, b); }
    VXCOMN_RT_INLINE static Floats interleaveLow(Floats a, Floats b) { return _mm_unpacklo_ps(a, b); }
    VXCOMN_RT_INLINE static Floats interleaveHigh(Floats a, Floats b) { return _mm_unpackhi_ps(a, b); }
    VXCOMN_RT_INLINE static Floats magnitude(Floats value) { return _mm_andnot_ps(_mm_set1_ps(-0.0F), value); }
    VXCOMN_RT_INLINE static bool anyLarger(Floats a, Floats b) { return _mm_movemask_ps(_mm_cmpgt_ps(a, b)) != 0; }
    VXCOMN_RT_INLINE static float highest(Floats value) {
        value = larger(value, _mm_movehl_ps(value, value));
        return _mm_cvtss_f32(_mm_max_ss(value, _mm_shuffle_ps(value, value, 1)));
    }
};

struct Wave {
    using Doubles = __m128d;
    using Integers = __attribute__((vector_size(16))) int64_t;
    static constexpr int kLanes = 2;
    VXCOMN_RT_INLINE static Doubles load(const double *from) { return _mm_loadu_pd(from); }
    VXCOMN_RT_INLINE static void store(double *to, Doubles value) { _mm_storeu_pd(to, value); }
    VXCOMN_RT_INLINE static void storeRounded(float *to, Doubles value) {
        _mm_storel_pi(reinterpret_cast<__m64 *>(to), _mm_cvtpd_ps(value));
    }
    VXCOMN_RT_INLINE static Doubles roundedToFloat(Doubles value) { return _mm_cvtps_pd(_mm_cvtpd_ps(value)); }
    VXCOMN_RT_INLINE static bool all(Integers mask) { return _mm_movemask_pd(__builtin_bit_cast(__m128d, mask)) == 3; }
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

constinit const MeasureKernels kMeasureKernelsSse2 = {peaks, anyAbove, mean, copy, sine, sweep, pink, notch, spectrum};

}  // namespace vxcomn
