// SPDX-License-Identifier: MIT
//
// The host's kernels with AVX-512.
#include <immintrin.h>

#include "host/kernel_loops.h"
#include "host/kernel_one_lane.h"

namespace vxcomn {
namespace {

struct SixteenLanes {
    static constexpr int lanes = 16;
    VXCOMN_RT_INLINE static __m512 load(const float *from) noexcept { return _mm512_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, __m512 a) noexcept { _mm512_storeu_ps(to, a); }
    VXCOMN_RT_INLINE static __m512 broadcast(float a) noexcept { return _mm512_set1_ps(a); }
    VXCOMN_RT_INLINE static __m512 add(__m512 a, __m512 b) noexcept { return _mm512_add_ps(a, b); }
    VXCOMN_RT_INLINE static __m512 multiply(__m512 a, __m512 b) noexcept { return _mm512_mul_ps(a, b); }
    VXCOMN_RT_INLINE static __m512i to24Bits(__m512 a) noexcept {
        const __m512i v = _mm512_cvttps_epi32(a);
        return _mm512_min_epi32(_mm512_max_epi32(v, _mm512_set1_epi32(-8388608)), _mm512_set1_epi32(8388607));
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m512i shiftLeft(__m512i a) noexcept {
        return _mm512_slli_epi32(a, kBits);
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m512i shiftRight(__m512i a) noexcept {
        return _mm512_srai_epi32(a, kBits);
    }
    VXCOMN_RT_INLINE static __m512 toFloat(__m512i a) noexcept { return _mm512_cvtepi32_ps(a); }
    VXCOMN_RT_INLINE static __m512i loadWords(const int32_t *from) noexcept { return _mm512_loadu_si512(from); }
    VXCOMN_RT_INLINE static void storeWords(int32_t *to, __m512i a) noexcept { _mm512_storeu_si512(to, a); }
};

}  // namespace
}  // namespace vxcomn

VXCOMN_DEFINE_HOST_KERNELS(kHostKernelsAvx512, SixteenLanes, OneLane)
