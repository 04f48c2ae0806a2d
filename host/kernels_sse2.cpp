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
    VXCOMN_RT_INLINE static __m128i truncate(__m128 a) noexcept { return _mm_cvttps_epi32(a); }
    VXCOMN_RT_INLINE static __m128i choose(__m128i condition, __m128i a, __m128i b) noexcept {
        return _mm_or_si128(_mm_and_si128(condition, a), _mm_andnot_si128(condition, b));
    }
    VXCOMN_RT_INLINE static __m128i clamp(__m128i a, int32_t low, int32_t high) noexcept {
        const __m128i lowest = _mm_set1_epi32(low);
        const __m128i highest = _mm_set1_epi32(high);
        a = choose(_mm_cmpgt_epi32(lowest, a), lowest, a);
        return choose(_mm_cmpgt_epi32(a, highest), highest, a);
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
