// SPDX-License-Identifier: MIT
//
// The engine's own functions against the C library's in long double, which on Windows is no better than double; a few units in the
// last place either way.
#include <doctest/doctest.h>

#include "engine_rig.h"
#include "engines/sample/deterministic_math.h"

namespace {

constexpr double kEps = 2.220446049250313e-16;

// The error in units of the last place of the expected value.
double ulps(double got, long double expected) {
    return static_cast<double>(std::fabs(static_cast<long double>(got) - expected) / std::fabs(expected)) / kEps;
}

}  // namespace

TEST_CASE("sine, cosine and tangent of half turns stay within a few units in the last place") {
    for (int i = 1; i < 5000; ++i) {
        const double x = 0.4999 * i / 5000.0;
        const long double angle = 3.14159265358979323846264338L * static_cast<long double>(x);
        REQUIRE(ulps(sample_engine::sinPi(x), std::sin(angle)) < 3.0);
        REQUIRE(ulps(sample_engine::cosPi(x), std::cos(angle)) < 8.0);
        REQUIRE(ulps(sample_engine::tanPi(x), std::tan(angle)) < 12.0);
    }
    CHECK(sample_engine::sinPi(0.0) == 0.0);
    CHECK(sample_engine::sinPi(0.5) == 1.0);
    CHECK(sample_engine::sinPi(1.0) == 0.0);
    CHECK(sample_engine::sinPi(-1.5) == 1.0);
    CHECK(sample_engine::cosPi(0.5) == 0.0);
    CHECK(sample_engine::cosPi(1.0) == -1.0);
    CHECK(sample_engine::cosPi(-3.0) == -1.0);
}

TEST_CASE("powers and logarithms to base 2 stay within a few units in the last place") {
    for (int i = -5000; i <= 5000; ++i) {
        const double x = i * 0.01237;
        REQUIRE(ulps(sample_engine::exp2(x), std::exp2(static_cast<long double>(x))) < 3.0);
        const double y = std::exp2(x) * 1.1;
        if (std::fabs(std::log2(y)) > 0.01) REQUIRE(ulps(sample_engine::log2(y), std::log2(static_cast<long double>(y))) < 4.0);
    }
    for (int i = -1000; i <= 1000; ++i) CHECK(sample_engine::exp2(i) == std::ldexp(1.0, i));
    CHECK(sample_engine::exp2(5000.0) == std::ldexp(1.0, 1000));
    CHECK(sample_engine::log2(1.0) == 0.0);
    CHECK(sample_engine::log2(0.125) == -3.0);
    CHECK(sample_engine::decibelsToGain(0.0) == 1.0);
    CHECK(std::fabs(sample_engine::decibelsToGain(20.0) - 10.0) < 1e-13);
    CHECK(std::fabs(sample_engine::gainToDecibels(10.0) - 20.0) < 1e-13);
}
