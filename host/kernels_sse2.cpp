// SPDX-License-Identifier: MIT
//
// The host's kernels with SSE2, which every x86-64 machine has.
#include <emmintrin.h>

#include "host/kernel_loops.h"
#include "host/kernel_one_lane.h"

namespace vxcomn {
namespace {

struct FourLanes {
    static constexpr int lanes = 4;
    VXCOMN_RT_INLINE static __m128 load(const float *from) noexcept { return _mm_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, __m128 a) noexcept { _mm_storeu_ps(to, a); }
    VXCOMN_RT_INLINE static __m128 broadcast(float a) noexcept { return _mm_set1_ps(a); }
    VXCOMN_RT_INLINE static __m128 add(__m128 a, __m128 b) noexcept { return _mm_add_ps(a, b); }
    VXCOMN_RT_INLINE static __m128 multiply(__m128 a, __m128 b) noexcept { return _mm_mul_ps(a, b); }
    // SSE2 has no minimum of 32-bit integers, so the range is held ahead of the conversion, where a NaN takes the lower bound. What
    // no 32-bit integer holds has to become the lowest sample: the complement of the highest, which it was held to, is just that.
    VXCOMN_RT_INLINE static __m128i to24Bits(__m128 a) noexcept {
        const __m128 beyond = _mm_cmpge_ps(a, _mm_set1_ps(2147483648.0F));
        const __m128 held = _mm_min_ps(_mm_max_ps(a, _mm_set1_ps(-8388608.0F)), _mm_set1_ps(8388607.0F));
        return _mm_xor_si128(_mm_cvttps_epi32(held), _mm_castps_si128(beyond));
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m128i shiftLeft(__m128i a) noexcept {
        return _mm_slli_epi32(a, kBits);
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m128i shiftRight(__m128i a) noexcept {
        return _mm_srai_epi32(a, kBits);
    }
    VXCOMN_RT_INLINE static __m128 toFloat(__m128i a) noexcept { return _mm_cvtepi32_ps(a); }
    VXCOMN_RT_INLINE static __m128i loadWords(const int32_t *from) noexcept {
        return _mm_loadu_si128(reinterpret_cast<const __m128i *>(from));
    }
    VXCOMN_RT_INLINE static void storeWords(int32_t *to, __m128i a) noexcept {
        _mm_storeu_si128(reinterpret_cast<__m128i *>(to), a);
    }
};

}  // namespace
}  // namespace vxcomn

VXCOMN_DEFINE_HOST_KERNELS(kHostKernelsSse2, FourLanes, OneLane)
