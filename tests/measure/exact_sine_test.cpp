// SPDX-License-Identifier: MIT
//
// The sine that is rounded once: one value at a time and in lanes, against a judge in extended precision.
#include "measure/exact_sine.h"

#include <doctest/doctest.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <limits>
#include <random>
#include <vector>

#include "measure/exact_power.h"
#include "measure/kernels.h"
#include "measure_sets.h"
#include "plain_sine.h"

using namespace vxcomn;

namespace {

uint32_t bitsOf(float value) {
    return __builtin_bit_cast(uint32_t, value);
}

// Phases whose sine lies as close to the middle between two f32 as an f64 phase allows.
std::vector<double> hardPhases() {
    std::vector<double> phases;
    std::mt19937 random(7);
    while (phases.size() < 20000) {
        const float value = static_cast<float>(random() % 16777216u) / 16777216.0F;
        const float above = std::nextafter(value, 2.0F);
        const double middle = (static_cast<double>(value) + static_cast<double>(above)) / 2.0;
        if (middle >= 1.0) continue;
        const double phase = std::asin(middle) + 6.283185307179586 * static_cast<double>(random() % 100);
        for (int step = -2; step <= 2; ++step) phases.push_back(phase + step * (std::nextafter(phase, 1e9) - phase));
    }
    return phases;
}

}  // namespace

TEST_CASE("the sine of four million phases is the exact sine rounded once") {
    std::mt19937_64 random(1);
    int64_t wrong = 0, ties = 0;
    for (int i = 0; i < 4000000; ++i) {
        const double phase = std::ldexp(static_cast<double>(random() >> 11), -53) * (i % 2 == 0 ? 640.0 : 7.0);
        const plain::Sine judge = plain::sine(phase);
        ties += judge.tie ? 1 : 0;
        if (!judge.tie && bitsOf(exactSine(phase)) != bitsOf(judge.value)) ++wrong;
    }
    CHECK(wrong == 0);
    CHECK(ties < 10);
}

TEST_CASE("phases whose sine lies next to the middle between two values round to the right side") {
    int64_t wrong = 0, ties = 0;
    const std::vector<double> phases = hardPhases();
    for (const double phase : phases) {
        const plain::Sine judge = plain::sine(phase);
        ties += judge.tie ? 1 : 0;
        if (!judge.tie && bitsOf(exactSine(phase)) != bitsOf(judge.value)) ++wrong;
    }
    CHECK(wrong == 0);
    CHECK(ties < static_cast<int64_t>(phases.size()) / 8);
}

TEST_CASE("in lanes the sine has the same bits as one at a time, also for hard, huge, tiny and impossible phases") {
    std::vector<double> phases = hardPhases();
    std::mt19937_64 random(3);
    for (int i = 0; i < 40000; ++i) {
        double any;
        const uint64_t bits = random();
        std::memcpy(&any, &bits, sizeof any);
        phases.push_back(any);
        phases.push_back(std::ldexp(static_cast<double>(random() >> 11), static_cast<int>(random() % 60) - 60));
        phases.push_back(3.141592653589793 * static_cast<double>(random() % 5000000));
    }
    for (const double special : {0.0, -0.0, 1e-310, -1e-310, 1e-30, 1e-9, std::numeric_limits<double>::infinity(),
                                 -std::numeric_limits<double>::infinity(), std::numeric_limits<double>::quiet_NaN()}) {
        phases.push_back(special);
    }
    onEachInstructionSet([&] {
        int64_t wrong = 0;
        for (const double phase : phases) {
            float lanes[8];
            const double behind = measureKernels->sine(phase, 0.0, lanes, 8);
            const float one = exactSine(phase);
            if (std::isnan(one)) {
                wrong += std::isnan(lanes[0]) && std::isnan(lanes[7]) ? 0 : 1;
            } else {
                wrong += bitsOf(lanes[0]) == bitsOf(one) && lanes[7] == one && behind == phase ? 0 : 1;
            }
        }
        CHECK(wrong == 0);
    });
}

TEST_CASE("sines of phases near whole half turns keep all their bits") {
    for (int k = 1; k < 2000; ++k) {
        const double phase = 3.141592653589793 * k;
        const plain::Sine judge = plain::sine(phase);
        REQUIRE(!judge.tie);
        REQUIRE(bitsOf(exactSine(phase)) == bitsOf(judge.value));
    }
}

TEST_CASE("the sine is odd, and zero keeps its sign") {
    CHECK(bitsOf(exactSine(0.0)) == 0u);
    CHECK(bitsOf(exactSine(-0.0)) == 0x80000000u);
    for (int i = 1; i < 5000; ++i) CHECK(exactSine(-i * 0.173) == -exactSine(i * 0.173));
}

TEST_CASE("sines of enormous phases have the bits that all platforms agree on") {
    // From a 600-digit computation.
    CHECK(exactSine(1e22) == -0x1.b453acp-1F);
    CHECK(exactSine(0x1p1023) == 0x1.205248p-1F);
    CHECK(exactSine(6381956970095103.0 * 0x1p797) == 1.0F);
}

TEST_CASE("the cosine is within half a unit of its last place") {
    std::mt19937_64 random(5);
    for (int i = 0; i < 200000; ++i) {
        const double angle = std::ldexp(static_cast<double>(random() >> 11), -53) * 6.283185307179586;
        const long double exact = plain::sineOf(angle / 2.0);  // cos a = 1 - 2 sin^2(a/2)
        const long double cosine = 1.0L - 2.0L * exact * exact;
        const double got = exactCosine(angle);
        REQUIRE(std::fabs(static_cast<double>(got - cosine)) <= 0.51 * 0x1p-53);
    }
    CHECK(exactCosine(0.0) == 1.0);
    CHECK(exactCosine(1e-200) == 1.0);
}

TEST_CASE("roots of two multiply back to two") {
    CHECK(rootOfTwo(1) == 2.0);
    CHECK(rootOfTwo(2) == 0x1.6a09e667f3bcdp+0);
    for (int n = 1; n <= 128; ++n) {
        const double root = rootOfTwo(n);
        long double below = 1.0L, above = 1.0L;
        for (int i = 0; i < n; ++i) {
            below *= static_cast<long double>(root) - 0x1.01p-53L;
            above *= static_cast<long double>(root) + 0x1.01p-53L;
        }
        CHECK(below < 2.0L);
        CHECK(above > 2.0L);
    }
}

TEST_CASE("powers of 1e-5 and exponentials agree with extended precision") {
    for (int i = 1; i < 2600; ++i) {
        const double exponent = i / 1000.0 * i / 1000.0;
        const float power = powerOfOneHundredThousandth(exponent);
        CHECK(std::fabs(power / static_cast<double>(std::pow(static_cast<long double>(1e-5), static_cast<long double>(exponent))) -
                        1.0) < 0x1.0001p-24);
        const float exponential = exactExponential(-exponent);
        CHECK(std::fabs(exponential / static_cast<double>(std::exp(static_cast<long double>(-exponent))) - 1.0) < 0x1.0001p-24);
    }
    CHECK(powerOfOneHundredThousandth(0.0) == 1.0F);
    CHECK(powerOfOneHundredThousandth(std::numeric_limits<double>::infinity()) == 0.0F);
    CHECK(exactExponential(1e9) == std::numeric_limits<float>::infinity());
    CHECK(std::isnan(exactExponential(std::numeric_limits<double>::quiet_NaN())));
}
