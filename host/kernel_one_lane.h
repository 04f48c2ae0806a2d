// SPDX-License-Identifier: MIT
//
// The vector type of a single sample, for the tails of the kernel loops: the same operations on the lowest lane of a register.
#pragma once

#include <emmintrin.h>

#include <cstdint>

#include "measure/realtime.h"

namespace vxcomn {
namespace {

struct OneLane {
    static constexpr int lanes = 1;
    VXCOMN_RT_INLINE static __m128 load(const float *from) noexcept { return _mm_load_ss(from); }
    VXCOMN_RT_INLINE static void store(float *to, __m128 a) noexcept { _mm_store_ss(to, a); }
    VXCOMN_RT_INLINE static __m128 broadcast(float a) noexcept { return _mm_set_ss(a); }
    VXCOMN_RT_INLINE static __m128 add(__m128 a, __m128 b) noexcept { return _mm_add_ss(a, b); }
    VXCOMN_RT_INLINE static __m128 multiply(__m128 a, __m128 b) noexcept { return _mm_mul_ss(a, b); }
    VXCOMN_RT_INLINE static int32_t to24Bits(__m128 a) noexcept {
        const int32_t v = _mm_cvttss_si32(a);
        return v < -8388608 ? -8388608 : v > 8388607 ? 8388607 : v;
    }
    template <int kBits>
    VXCOMN_RT_INLINE static int32_t shiftLeft(int32_t a) noexcept {
        return static_cast<int32_t>(static_cast<uint32_t>(a) << kBits);
    }
    template <int kBits>
    VXCOMN_RT_INLINE static int32_t shiftRight(int32_t a) noexcept {
        return a >> kBits;
    }
    VXCOMN_RT_INLINE static __m128 toFloat(int32_t a) noexcept { return _mm_cvtsi32_ss(_mm_setzero_ps(), a); }
    VXCOMN_RT_INLINE static int32_t loadWords(const int32_t *from) noexcept { return *from; }
    VXCOMN_RT_INLINE static void storeWords(int32_t *to, int32_t a) noexcept { *to = a; }
};

}  // namespace
}  // namespace vxcomn
