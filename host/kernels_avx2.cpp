// SPDX-License-Identifier: MIT
//
// The host's kernels with AVX2.
#include <immintrin.h>

#include "host/kernel_loops.h"
#include "host/kernel_one_lane.h"

namespace vxcomn {
namespace {

struct EightLanes {
    static constexpr int lanes = 8;
    VXCOMN_RT_INLINE static __m256 load(const float *from) noexcept { return _mm256_loadu_ps(from); }
    VXCOMN_RT_INLINE static void store(float *to, __m256 a) noexcept { _mm256_storeu_ps(to, a); }
    VXCOMN_RT_INLINE static __m256 broadcast(float a) noexcept { return _mm256_set1_ps(a); }
    VXCOMN_RT_INLINE static __m256 add(__m256 a, __m256 b) noexcept { return _mm256_add_ps(a, b); }
    VXCOMN_RT_INLINE static __m256 multiply(__m256 a, __m256 b) noexcept { return _mm256_mul_ps(a, b); }
    VXCOMN_RT_INLINE static __m256i to24Bits(__m256 a) noexcept {
        const __m256i v = _mm256_cvttps_epi32(a);
        return _mm256_min_epi32(_mm256_max_epi32(v, _mm256_set1_epi32(-8388608)), _mm256_set1_epi32(8388607));
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m256i shiftLeft(__m256i a) noexcept {
        return _mm256_slli_epi32(a, kBits);
    }
    template <int kBits>
    VXCOMN_RT_INLINE static __m256i shiftRight(__m256i a) noexcept {
        return _mm256_srai_epi32(a, kBits);
    }
    VXCOMN_RT_INLINE static __m256 toFloat(__m256i a) noexcept { return _mm256_cvtepi32_ps(a); }
    VXCOMN_RT_INLINE static __m256i loadWords(const int32_t *from) noexcept {
        return _mm256_loadu_si256(reinterpret_cast<const __m256i *>(from));
    }
    VXCOMN_RT_INLINE static void storeWords(int32_t *to, __m256i a) noexcept {
        _mm256_storeu_si256(reinterpret_cast<__m256i *>(to), a);
    }
};

}  // namespace
}  // namespace vxcomn

VXCOMN_DEFINE_HOST_KERNELS(kHostKernelsAvx2, EightLanes, OneLane)
