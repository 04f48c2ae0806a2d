// SPDX-License-Identifier: MIT
#include "measure/exact_power.h"

#include <cstdint>

#include "measure/wide_fixed.h"

namespace vxcomn {
namespace {

constexpr u128 kLogOfTwo = wide(0xB17217F7D1CF79AB, 0xC9E3B39803F2F6AF);  // ln 2 * 2^128

// Base-2 logarithms: of e, and the negative one of the f64 nearest to 1e-5.
constexpr Wide kLog2OfE = {wide(0xB8AA3B295C17F0BB, 0xBE87FED0691D3E88), 1};
constexpr Wide kLog2OfHundredThousand = {wide(0x84E08B2F6031369A, 0xE5848EB2D2FCD167), 5};

// 2 to the power fraction * 2^-128, as mantissa of a Wide with exponent 1.
u128 powerOfTwo(u128 fraction) {
    constexpr int kTerms = 32;  // ln(2)^33 / 33! is below 2^-140
    const u128 angle = multiplyHigh(fraction, kLogOfTwo);
    u128 sum = u128{1} << 126;
    for (int k = kTerms; k >= 1; --k) sum = (u128{1} << 126) + multiplyHigh(angle / static_cast<unsigned>(k), sum);
    return sum << 1;
}

// 2 to the power exponent * log2.
float exponential(double exponent, Wide log2) {
    if (exponent != exponent) return static_cast<float>(exponent);
    const auto bits = __builtin_bit_cast(uint64_t, exponent);
    const bool negative = (bits >> 63) != 0;
    const int field = static_cast<int>((bits >> 52) & 0x7FF);
    if (field < 1023 - 100) return 1.0F;  // so close to 1 that no f32 lies between
    if (field > 1023 + 12) return negative ? 0.0F : __builtin_inff();
    const u128 m = u128{(bits & 0xFFFFFFFFFFFFFull) | (uint64_t{1} << 52)} << 75;

    // The product's whole part and its fraction in units of 2^-128.
    const u128 product = multiplyHigh(m, log2.mantissa);
    const int e = field - 1022 + log2.exponent;
    int whole = 0;
    u128 fraction = 0;
    if (e > 0) {
        whole = static_cast<int>(product >> (128 - e));
        fraction = product << e;
    } else if (e > -128) {
        fraction = product >> -e;
    }
    if (negative) {
        whole = -whole;
        if (fraction != 0) {
            fraction = ~fraction + 1;
            --whole;
        }
    }
    if (fraction == 0) fraction = 1;  // the last bit of the fraction never decides, but the result must not look exact
    return static_cast<float>(toOddDouble({powerOfTwo(fraction), whole + 1}));
}

}  // namespace

double rootOfTwo(int n) noexcept {
    if (n == 1) return 2.0;
    // ln 2 / n by division, good to 2^-120: no root of two lies that close to the middle between two f64.
    return toNearestDouble({powerOfTwo(~u128{0} / static_cast<unsigned>(n)), 1});
}

float powerOfOneHundredThousandth(double exponent) noexcept {
    return exponential(-exponent, kLog2OfHundredThousand);
}

float exactExponential(double exponent) noexcept {
    return exponential(exponent, kLog2OfE);
}

}  // namespace vxcomn
