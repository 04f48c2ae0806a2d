// SPDX-License-Identifier: MIT
//
// The judge of every sine: 64 bits of mantissa on the processor's extended type, by a way that has nothing in common with the
// library's. Good for phases up to a few thousand turns; its error is some 2^-61 of the result, so a value so close to the middle
// between two f32 that this could matter is reported as a tie and left to other judges.
#pragma once

#include <cmath>

namespace plain {

struct Sine {
    float value;
    bool tie;
};

inline long double sineOf(double x) {
    // pi/2 in parts of 40 bits: their products with whole numbers below 2^24 are exact in an extended number.
    constexpr long double kPart1 = 0xc90fdaa221p-39L, kPart2 = 0x68c234c4c6p-79L, kPart3 = 0x628b80dc1cp-119L;
    const long double quarters = std::floor(static_cast<long double>(x) / 1.5707963267948966192L + 0.5L);
    const long double r = ((static_cast<long double>(x) - quarters * kPart1) - quarters * kPart2) - quarters * kPart3;
    const bool cosine = std::fmod(quarters, 2.0L) != 0.0L;
    long double term = cosine ? 1.0L : r, sum = term;
    for (int k = cosine ? 1 : 2; k < 40; k += 2) {
        term *= -r * r / (static_cast<long double>(k) * (k + 1));
        sum += term;
    }
    const long double half = std::fmod(std::floor(quarters / 2.0L), 2.0L);
    return half != 0.0L ? -sum : sum;
}

inline Sine sine(double x) {
    const long double exact = sineOf(x);
    const auto low = static_cast<float>(exact * (1.0L - 0x1p-58L)), high = static_cast<float>(exact * (1.0L + 0x1p-58L));
    return {static_cast<float>(exact), low != high};
}

}  // namespace plain
