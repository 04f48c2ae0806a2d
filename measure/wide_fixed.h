// SPDX-License-Identifier: MIT
//
// Numbers of 128 bits, for the few places that need a function's value to the last bit: the rare undecided lane of a vector sine,
// and the constants that control calls work out (windows, band edges, decay factors). Integer arithmetic alone gives the same bits
// on every platform and in every floating-point mode, which no C library's functions do. Everything here is inlined, so the block
// path may use it.
//
// A `Wide` stands for mantissa * 2^(exponent - 128); a normalised one has the mantissa's top bit set.
#pragma once

#include <cstdint>

#include "measure/realtime.h"

namespace vxcomn {

__extension__ typedef unsigned __int128 u128;

struct Wide {
    u128 mantissa;
    int exponent;
};

VXCOMN_RT_INLINE constexpr u128 wide(uint64_t high, uint64_t low) {
    return (u128{high} << 64) | low;
}

// The upper half of a product of two 128-bit numbers, short of it by at most 2 units.
VXCOMN_RT_INLINE constexpr u128 multiplyHigh(u128 a, u128 b) {
    const auto ah = static_cast<uint64_t>(a >> 64), al = static_cast<uint64_t>(a);
    const auto bh = static_cast<uint64_t>(b >> 64), bl = static_cast<uint64_t>(b);
    const u128 cross1 = u128{ah} * bl, cross2 = u128{al} * bh;
    const u128 low = ((u128{al} * bl) >> 64) + static_cast<uint64_t>(cross1) + static_cast<uint64_t>(cross2);
    return u128{ah} * bh + (cross1 >> 64) + (cross2 >> 64) + (low >> 64);
}

VXCOMN_RT_INLINE int leadingZeros(u128 value) {
    const auto high = static_cast<uint64_t>(value >> 64);
    return high != 0 ? __builtin_clzll(high) : 64 + __builtin_clzll(static_cast<uint64_t>(value));
}

VXCOMN_RT_INLINE Wide normalised(Wide value) {
    const int shift = leadingZeros(value.mantissa);
    return {value.mantissa << shift, value.exponent - shift};
}

// An f64 of 52 leading bits whose last bit is set because bits follow (they always do). Rounding that once more to f32 gives what
// rounding the exact value would, also where the f32 is a denormal.
VXCOMN_RT_INLINE double toOddDouble(Wide value) {
    if (value.exponent < -1000) return 0.0;
    if (value.exponent > 1000) return __builtin_inf();
    const uint64_t bits = static_cast<uint64_t>(value.mantissa >> 75) & 0xFFFFFFFFFFFFFull;
    return __builtin_bit_cast(double, (static_cast<uint64_t>(value.exponent + 1022) << 52) | bits | 1u);
}

// The nearest f64. The mantissa stands for a number that is never half-way between two of them.
VXCOMN_RT_INLINE double toNearestDouble(Wide value) {
    const auto high = static_cast<uint64_t>(value.mantissa >> 64);
    const uint64_t rounded = (high >> 11) + ((high >> 10) & 1u);  // a carry moves into the exponent, as it should
    return __builtin_bit_cast(double, (static_cast<uint64_t>(value.exponent + 1021) << 52) + rounded);
}

}  // namespace vxcomn
