// SPDX-License-Identifier: MIT
#include "measure/elliptic_math.h"

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>

namespace vxcomn {
namespace {

// pi / 2 in three parts of 33, 33 and 53 bits: the products of the first two with a whole number below 2^20 are exact.
constexpr double kHalfPi1 = 0x1.921fb544p+0;
constexpr double kHalfPi2 = 0x1.0b4611a6p-34;
constexpr double kHalfPi3 = 0x1.3198a2e037073p-69;
constexpr double kTwoOverPi = 0x1.45f306dc9c883p-1;
constexpr double kReducibleAngle = 1.0e6;

// ln 2 in two parts, the first of 33 bits.
constexpr double kLn2High = 0x1.62e42fefp-1;
constexpr double kLn2Low = 0x1.473de6af278edp-34;
constexpr double kOneOverLn2 = 0x1.71547652b82fep+0;

double nearestWhole(double value) noexcept {
    constexpr double kShift = 0x1.8p52;  // pushes the fraction out of the significand
    return (value + kShift) - kShift;
}

struct ReducedAngle {
    double high;   // within pi / 4
    double low;    // what high leaves out
    int quadrant;  // 0 to 3
};

ReducedAngle reduce(double angle) noexcept {
    // The remainder of a division is exact on every platform. So large an angle has no phase worth the name, but an answer.
    if (!(std::fabs(angle) <= kReducibleAngle)) angle = std::fmod(angle, 2.0 * kPi);
    if (std::isnan(angle)) return {angle, 0.0, 0};
    const double turns = nearestWhole(angle * kTwoOverPi);
    const double first = angle - turns * kHalfPi1;
    const double second = first - turns * kHalfPi2;
    const double lost = (first - second) - turns * kHalfPi2;
    const double tail = lost - turns * kHalfPi3;
    const double high = second + tail;
    return {high, (second - high) + tail, static_cast<int>(static_cast<int64_t>(turns) & 3)};
}

// Series up to the order 17; the next term is below 1e-19 within pi / 4.
double sineNearZero(const ReducedAngle &x) noexcept {
    const double square = x.high * x.high;
    double sum = 0.0;
    for (int n = 17; n >= 3; n -= 2) sum = (1.0 + sum) * (-square / (n * (n - 1)));
    return x.high + (x.high * sum + x.low);
}

double cosineNearZero(const ReducedAngle &x) noexcept {
    const double square = x.high * x.high;
    double sum = 0.0;
    for (int n = 18; n >= 4; n -= 2) sum = (1.0 + sum) * (-square / (n * (n - 1)));
    const double half = 0.5 * square;
    const double lead = 1.0 - half;
    return lead + (((1.0 - lead) - half) - half * sum - x.high * x.low);
}

double inQuadrant(const ReducedAngle &x, int quadrant) noexcept {
    const double value = (quadrant & 1) != 0 ? cosineNearZero(x) : sineNearZero(x);
    return (quadrant & 2) != 0 ? -value : value;
}

}  // namespace

double sine(double angle) noexcept {
    const ReducedAngle x = reduce(angle);
    return inQuadrant(x, x.quadrant);
}

double cosine(double angle) noexcept {
    const ReducedAngle x = reduce(angle);
    return inQuadrant(x, x.quadrant + 1);
}

double tangent(double angle) noexcept {
    const ReducedAngle x = reduce(angle);
    return inQuadrant(x, x.quadrant) / inQuadrant(x, x.quadrant + 1);
}

double exponential(double power) noexcept {
    if (std::isnan(power)) return power;
    if (power > 710.0) return std::numeric_limits<double>::infinity();
    if (power < -746.0) return 0.0;
    const double doublings = nearestWhole(power * kOneOverLn2);
    const double high = power - doublings * kLn2High;
    const double low = doublings * kLn2Low;
    const double x = high - low;
    const double lost = (high - x) - low;
    double sum = 0.0;
    for (int n = 14; n >= 2; --n) sum = (1.0 + sum) * (x / n);
    return std::ldexp(1.0 + (x + (x * sum + lost)), static_cast<int>(doublings));
}

double logarithm(double value) noexcept {
    if (std::isnan(value) || value < 0.0) return std::numeric_limits<double>::quiet_NaN();
    if (value == 0.0) return -std::numeric_limits<double>::infinity();
    if (std::isinf(value)) return value;
    int exponent = 0;
    double m = std::frexp(value, &exponent);  // 0.5 to 1
    if (m < 0.70710678118654752) {
        m *= 2.0;
        --exponent;
    }
    // ln m = 2 artanh s; with f = m - 1 that is f - s (f - series), whose leading term is exact.
    const double f = m - 1.0;
    const double s = f / (2.0 + f);
    const double square = s * s;
    double sum = 0.0;
    for (int n = 23; n >= 3; n -= 2) sum = (sum + 2.0 / n) * square;
    const double half = 0.5 * f * f;
    const double small = s * (half + sum);
    return exponent * kLn2High - ((half - (small + exponent * kLn2Low)) - f);
}

}  // namespace vxcomn
