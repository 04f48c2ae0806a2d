// SPDX-License-Identifier: MIT
//
// The few functions that filter design needs, made of additions, multiplications and divisions only, so that every compiler and
// every system computes the same bits. The C library's versions differ in their last bits from one system to the next, and those
// bits would end in the samples. Control threads call them, while they turn parameters into coefficients; errors stay within a few
// units in the last place. The square root is the processor's own, which is correctly rounded everywhere.
#pragma once

#include <emmintrin.h>

#include <bit>
#include <cstdint>

namespace sample_engine {

inline constexpr double kPi = 3.14159265358979323846;
inline constexpr double kLn2 = 0.69314718055994530942;
inline constexpr double kLog2E = 1.44269504088896340736;
inline constexpr double kOctavesPerDecibel = 0.16609640474436811739;  // log2(10) / 20
inline constexpr double kDecibelsPerOctave = 6.02059991327962390427;  // 20 / log2(10)

inline double squareRoot(double x) {
    const __m128d value = _mm_set_sd(x);
    return _mm_cvtsd_f64(_mm_sqrt_sd(value, value));
}

// The nearest integer, halves away from zero; |x| below 2^62.
inline int64_t nearestInteger(double x) {
    return static_cast<int64_t>(x < 0.0 ? x - 0.5 : x + 0.5);
}

// The power series of sine and cosine for |y| up to pi/4; the first term left out is below 2^-58 of the result.
inline double sineSeries(double y) {
    const double z = y * y;
    double sum = 1.0;
    for (int n = 16; n >= 2; n -= 2) sum = 1.0 - sum * z / static_cast<double>(n * (n + 1));
    return y * sum;
}

inline double cosineSeries(double y) {
    const double z = y * y;
    double sum = 1.0;
    for (int n = 17; n >= 1; n -= 2) sum = 1.0 - sum * z / static_cast<double>(n * (n + 1));
    return sum;
}

// sin(pi x) and cos(pi x), |x| below 2^50. The argument in half turns makes the reduction to a quarter exact.
inline double sinPi(double x) {
    const int64_t quarter = nearestInteger(x * 2.0);
    const double y = (x - static_cast<double>(quarter) * 0.5) * kPi;
    switch (quarter & 3) {
        case 0:
            return sineSeries(y);
        case 1:
            return cosineSeries(y);
        case 2:
            return -sineSeries(y);
        default:
            return -cosineSeries(y);
    }
}

inline double cosPi(double x) {
    const int64_t quarter = nearestInteger(x * 2.0);
    const double y = (x - static_cast<double>(quarter) * 0.5) * kPi;
    switch (quarter & 3) {
        case 0:
            return cosineSeries(y);
        case 1:
            return -sineSeries(y);
        case 2:
            return -cosineSeries(y);
        default:
            return sineSeries(y);
    }
}

// tan(pi x) for 0 <= x < 1/2.
inline double tanPi(double x) {
    return sinPi(x) / cosPi(x);
}

// 2 to the power x; exponents beyond +-1000 are taken as +-1000, which keeps the result a normal number.
inline double exp2(double x) {
    const double bounded = x < -1000.0 ? -1000.0 : x > 1000.0 ? 1000.0 : x;
    const int64_t whole = nearestInteger(bounded);
    const double t = (bounded - static_cast<double>(whole)) * kLn2;
    double sum = 1.0;
    for (int n = 14; n >= 1; --n) sum = 1.0 + sum * t / static_cast<double>(n);
    return sum * std::bit_cast<double>(static_cast<uint64_t>(whole + 1023) << 52);
}

// The logarithm to base 2 of a positive normal number.
inline double log2(double x) {
    const auto bits = std::bit_cast<uint64_t>(x);
    auto exponent = static_cast<int64_t>(bits >> 52) - 1023;
    double mantissa = std::bit_cast<double>((bits & 0x000FFFFFFFFFFFFFu) | 0x3FF0000000000000u);
    if (mantissa > 1.4142135623730951) {
        mantissa *= 0.5;
        ++exponent;
    }
    // ln m = 2 artanh((m - 1) / (m + 1)), with a quotient below 0.172.
    const double s = (mantissa - 1.0) / (mantissa + 1.0);
    const double z = s * s;
    double sum = 0.0;
    for (int n = 23; n >= 3; n -= 2) sum = (sum + 1.0 / static_cast<double>(n)) * z;
    return static_cast<double>(exponent) + 2.0 * (s + s * sum) * kLog2E;
}

inline double decibelsToGain(double decibels) {
    return exp2(decibels * kOctavesPerDecibel);
}

// Of a positive normal gain.
inline double gainToDecibels(double gain) {
    return log2(gain) * kDecibelsPerOctave;
}

}  // namespace sample_engine
