// SPDX-License-Identifier: MIT
//
// The elliptic band-stop: its coefficients against a computation in long double, and what a band-stop has to be.
#include <doctest/doctest.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <random>
#include <stdexcept>
#include <vector>

#include "measure/elliptic_filter.h"
#include "tests/measure/elliptic_reference.h"

namespace {

Dsp::Params params(double rate, double order, double center, double bandwidth, double rippleDb, double width) {
    return {{rate, order, center, bandwidth, rippleDb, width}};
}

double decibels(double magnitude) {
    return 20.0 * std::log10(magnitude);
}

// Two sets of pairs may be the same in another order: sorted by where the poles lie.
std::vector<std::pair<double, double>> sorted(std::vector<std::pair<double, double>> pairs) {
    std::sort(pairs.begin(), pairs.end());
    return pairs;
}

void checkAgainstReference(double order, double rate, double center, double bandwidth, double ripple, double width) {
    CAPTURE(order);
    CAPTURE(rate);
    CAPTURE(center);
    CAPTURE(bandwidth);
    CAPTURE(ripple);
    CAPTURE(width);
    Dsp::EllipticBandStop filter;
    filter.setParameters(params(rate, order, center, bandwidth, ripple, width));
    const auto expected = reference::bandStop(static_cast<int>(order), center, bandwidth, ripple, rate, width);
    REQUIRE_EQ(filter.cascade().stageCount, static_cast<int>(expected.size()));
    std::vector<std::pair<double, double>> poles, expectedPoles, zeros, expectedZeros;
    double gain = 1.0;
    double expectedGain = 1.0;
    for (size_t i = 0; i < expected.size(); ++i) {
        const Dsp::Stage &stage = filter.cascade().stages[i];
        poles.emplace_back(stage.a1, stage.a2);
        zeros.emplace_back(stage.b1 / stage.b0, stage.b2 / stage.b0);
        gain *= stage.b0;
        expectedPoles.emplace_back(static_cast<double>(expected[i].a1), static_cast<double>(expected[i].a2));
        expectedZeros.emplace_back(static_cast<double>(expected[i].b1 / expected[i].b0),
                                   static_cast<double>(expected[i].b2 / expected[i].b0));
        expectedGain *= static_cast<double>(expected[i].b0);
    }
    poles = sorted(poles);
    expectedPoles = sorted(expectedPoles);
    zeros = sorted(zeros);
    expectedZeros = sorted(expectedZeros);
    // Far finer than f32, whose place at these coefficients is 6e-8 to 1.2e-7.
    constexpr double kBound = 1e-9;
    for (size_t i = 0; i < expected.size(); ++i) {
        REQUIRE(std::fabs(poles[i].first - expectedPoles[i].first) <= kBound);
        REQUIRE(std::fabs(poles[i].second - expectedPoles[i].second) <= kBound);
        REQUIRE(std::fabs(zeros[i].first - expectedZeros[i].first) <= kBound);
        REQUIRE(std::fabs(zeros[i].second - expectedZeros[i].second) <= kBound);
    }
    REQUIRE(std::fabs(gain / expectedGain - 1.0) <= 1e-8);
}

}  // namespace

TEST_CASE("every order, ripple and width agrees with the formulas in long double") {
    for (int order = 1; order <= 6; ++order) {
        for (const double ripple : {0.001, 0.01, 0.1, 1.0, 3.0, 12.0}) {
            for (const double width : {-3.0, -1.0, 0.0, 1.0, 4.0}) checkAgainstReference(order, 48000, 3000, 1500, ripple, width);
        }
    }
}

TEST_CASE("random bands agree with the formulas in long double") {
    std::mt19937 random(19);
    std::uniform_real_distribution<double> uniform(0.0, 1.0);
    for (int i = 0; i < 200; ++i) {
        const double rate = 11025 + uniform(random) * (192000 - 11025);
        const double center = rate * (0.02 + 0.46 * uniform(random));
        const double bandwidth = rate * (0.005 + 0.2 * uniform(random));
        checkAgainstReference(1 + i % 6, rate, center, bandwidth, 0.001 + 3.0 * uniform(random), -2.0 + 4.0 * uniform(random));
    }
}

TEST_CASE("the routine's floats are the long double result rounded to f32") {
    std::mt19937 random(20);
    std::uniform_real_distribution<double> uniform(0.0, 1.0);
    for (int i = 0; i < 200; ++i) {
        const double rate = i % 2 == 0 ? 48000.0 : 44100.0;
        const double center = rate * (0.02 + 0.45 * uniform(random));
        const double bandwidth = center * (0.05 + 0.8 * uniform(random));
        const double ripple = 0.01 + uniform(random);
        float coefficients[10];
        REQUIRE_EQ(designEllipticBandStop(coefficients, 0, 0, center, bandwidth, ripple, rate), 2);
        const auto expected = reference::bandStop(2, center, bandwidth, ripple, rate, 0.0);
        for (size_t stage = 0; stage < 2; ++stage) {
            const reference::Stage &e = expected[stage];
            const reference::Real values[5] = {e.b0, e.b1, e.b2, e.a1, e.a2};
            for (size_t k = 0; k < 5; ++k) {
                const float rounded = static_cast<float>(values[k]);
                // One place is allowed where the value lies as good as between two floats.
                REQUIRE(std::fabs(coefficients[5 * stage + k] - rounded) <= std::fabs(rounded) * 0x1p-23f);
            }
        }
    }
}

TEST_CASE("the routine's floats have the same bits everywhere") {
    uint64_t digest = 1469598103934665603u;
    for (int i = 0; i < 100; ++i) {
        float coefficients[10];
        designEllipticBandStop(coefficients, 0, 0, 100.0 + 197.0 * i, 50.0 + 91.0 * i, 0.01 + 0.02 * i, 44100.0);
        for (const float value : coefficients) digest = (digest ^ std::bit_cast<uint32_t>(value)) * 1099511628211u;
    }
    CHECK_EQ(digest, uint64_t{13878572274076317991u});
}

TEST_CASE("the pass band ripples by the ripple, the stop band stays down, the edges lie at the ripple") {
    for (int order = 1; order <= 6; ++order) {
        for (const double ripple : {0.01, 0.5, 3.0}) {
            CAPTURE(order);
            CAPTURE(ripple);
            Dsp::EllipticBandStop filter;
            filter.setParameters(params(44100, order, 2000, 1720, ripple, 0));
            double lowest = 1e9;
            double highest = 0.0;
            for (int i = 0; i <= 4000; ++i) {
                const double hz = 22050.0 * i / 4000;
                if (hz > 1140.0 && hz < 2860.0) continue;
                const double magnitude = std::abs(filter.response(hz / 44100));
                lowest = std::min(lowest, magnitude);
                highest = std::max(highest, magnitude);
            }
            CHECK_GE(decibels(lowest), -ripple - 1e-6);
            CHECK_LE(decibels(highest), 1e-6);
            CHECK_EQ(decibels(std::abs(filter.response(1140.0 / 44100))), doctest::Approx(-ripple).epsilon(1e-6));
            CHECK_EQ(decibels(std::abs(filter.response(2860.0 / 44100))), doctest::Approx(-ripple).epsilon(1e-6));
            // The stop band begins where the low-pass comes to xi; the attenuation grows with order and ripple.
            const double center = std::abs(filter.response(1878.0 / 44100));
            CHECK_LT(center, std::abs(filter.response(1140.0 / 44100)));
            if (order >= 4) CHECK_LT(decibels(center), -30.0);
        }
    }
}

TEST_CASE("all poles lie inside the unit circle and all zeros on it") {
    for (int order = 1; order <= 6; ++order) {
        for (const double width : {-16.0, -4.0, 0.0, 4.0}) {
            for (const double center : {50.0, 2000.0, 11025.0, 20000.0}) {
                CAPTURE(order);
                CAPTURE(width);
                CAPTURE(center);
                Dsp::EllipticBandStop filter;
                filter.setParameters(params(44100, order, center, center / 2, 0.5, width));
                for (const Dsp::PoleZeroPair &pair : filter.poleZeros()) {
                    for (int i = 0; i < 2; ++i) {
                        REQUIRE(std::abs(pair.poles[i]) < 1.0);
                        REQUIRE(std::abs(pair.zeros[i]) == doctest::Approx(1.0).epsilon(1e-6));
                    }
                }
            }
        }
    }
}

TEST_CASE("a band that reaches down to 0 starts at a lower edge of 1e-8") {
    // Where it is cut makes no difference to what is above it: the same as a band that begins exactly there.
    checkAgainstReference(2, 48000, 500, 1000, 0.1, 0);
    checkAgainstReference(2, 48000, 400, 1000, 0.1, 0);
    const double edge = 1e-8 * 48000 / (2.0 * 3.14159265358979323846);
    Dsp::EllipticBandStop cut;
    Dsp::EllipticBandStop begins;
    cut.setParameters(params(48000, 2, 400, 1000, 0.1, 0));
    begins.setParameters(params(48000, 2, (900 + edge) / 2, 900 - edge, 0.1, 0));
    for (int i = 0; i < 2; ++i) {
        const auto at = static_cast<size_t>(i);
        CHECK_EQ(cut.cascade().stages[at].a1, doctest::Approx(begins.cascade().stages[at].a1).epsilon(1e-9));
        CHECK_EQ(cut.cascade().stages[at].b1, doctest::Approx(begins.cascade().stages[at].b1).epsilon(1e-9));
    }
}

TEST_CASE("a band that reaches to or above Nyquist ends 1e-8 below pi") {
    checkAgainstReference(2, 48000, 23000, 2000, 0.1, 0);
    checkAgainstReference(2, 48000, 23500, 3000, 0.1, 0);
    for (const double center : {23000.0, 23500.0, 24000.0}) {
        float coefficients[10];
        REQUIRE_EQ(designEllipticBandStop(coefficients, 0, 0, center, 2 * (24000 - center) + 2000, 0.1, 48000), 2);
        for (const float value : coefficients) CHECK(std::isfinite(value));
    }
}

TEST_CASE("an order of 2 gives two stages, whatever the other parameters are") {
    const double infinity = std::numeric_limits<double>::infinity();
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const double odd[] = {0.0, -0.0, -1.0, 1e-300, 1e300, -1e300, 1e6, infinity, -infinity, nan, 48000.0};
    for (const double center : odd) {
        for (const double bandwidth : odd) {
            for (const double ripple : odd) {
                for (const double rate : odd) {
                    float coefficients[10];
                    REQUIRE_EQ(designEllipticBandStop(coefficients, 1, 2, center, bandwidth, ripple, rate), 2);
                }
            }
        }
    }
}

TEST_CASE("odd orders and widths stay inside the object") {
    const double infinity = std::numeric_limits<double>::infinity();
    const double nan = std::numeric_limits<double>::quiet_NaN();
    for (const double order : {-1e300, -1.0, 0.0, 0.5, 6.9, 7.0, 1e300, infinity, -infinity, nan}) {
        for (const double width : {-16.0, -40.0, -1e300, 700.0, 1e300, infinity, nan}) {
            Dsp::EllipticBandStop filter;
            filter.setParameters(params(48000, order, 1000, 100, 0.1, width));
            const int expected = order >= 6.0 ? 6 : 1;
            CHECK_EQ(filter.cascade().stageCount, expected);
            CHECK_EQ(filter.poleZeros().size(), static_cast<size_t>(expected));
        }
    }
}

TEST_CASE("the same design run twice gives the same coefficients, the second time from the prototype's cache") {
    Dsp::EllipticBandStop filter;
    filter.setParameters(params(48000, 5, 3000, 500, 0.2, 0.5));
    const Dsp::Cascade first = filter.cascade();
    filter.setParameters(params(48000, 5, 3000, 500, 0.2, 0.5));
    const Dsp::Cascade second = filter.cascade();
    Dsp::EllipticBandStop fresh;
    fresh.setParameters(params(48000, 4, 3000, 500, 0.2, 0.5));
    fresh.setParameters(params(48000, 5, 1000, 100, 0.2, 0.5));
    fresh.setParameters(params(48000, 5, 3000, 500, 0.2, 0.5));
    for (size_t i = 0; i < 5; ++i) {
        for (const Dsp::Cascade &other : {second, fresh.cascade()}) {
            CHECK_EQ(first.stages[i].b0, other.stages[i].b0);
            CHECK_EQ(first.stages[i].b1, other.stages[i].b1);
            CHECK_EQ(first.stages[i].b2, other.stages[i].b2);
            CHECK_EQ(first.stages[i].a1, other.stages[i].a1);
            CHECK_EQ(first.stages[i].a2, other.stages[i].a2);
        }
    }
}

TEST_CASE("samples run through the stages in direct form I, with the anti-denormal term in the first stage alone") {
    for (const bool narrow : {false, true}) {
        Dsp::EllipticBandStop filter;
        filter.setParameters(params(48000, 3, 3000, 500, 0.2, 0));
        filter.reset();
        std::mt19937 random(21);
        std::uniform_real_distribution<double> uniform(-1.0, 1.0);
        struct State {
            double x1 = 0, x2 = 0, y1 = 0, y2 = 0;
        } states[3];
        double term = 1e-8;
        for (int i = 0; i < 500; ++i) {
            double sample = uniform(random);
            double wide = sample;
            float small = static_cast<float>(sample);
            double *wideChannel = &wide;
            float *smallChannel = &small;
            if (narrow) {
                sample = small;
                filter.process(1, &smallChannel);
            } else {
                filter.process(1, &wideChannel);
            }
            term = -term;
            for (size_t s = 0; s < 3; ++s) {
                const Dsp::Stage &stage = filter.cascade().stages[s];
                State &state = states[s];
                double out =
                    stage.b0 * sample + stage.b1 * state.x1 + stage.b2 * state.x2 - stage.a1 * state.y1 - stage.a2 * state.y2;
                if (s == 0) out += term;
                state = {sample, state.x1, out, state.y1};
                sample = out;
            }
            if (narrow)
                REQUIRE_EQ(small, static_cast<float>(sample));
            else
                REQUIRE_EQ(wide, sample);
        }
        // With its states cleared the filter answers silence with the term alone.
        filter.reset();
        double silence = 0.0;
        double *channel = &silence;
        filter.process(1, &channel);
        CHECK(std::fabs(silence) < 2e-8);
        CHECK(silence != 0.0);
    }
}

TEST_CASE("the band's centre is taken out and a tone outside comes through") {
    Dsp::EllipticBandStop filter;
    filter.setParameters(params(48000, 4, 3000, 1000, 0.1, 0));
    const auto rms = [&](double hz) {
        filter.reset();
        std::vector<float> samples(48000);
        for (size_t i = 0; i < samples.size(); ++i) {
            samples[i] = static_cast<float>(std::sin(2.0 * 3.14159265358979 * hz * static_cast<double>(i) / 48000.0));
        }
        float *channel = samples.data();
        filter.process(static_cast<int>(samples.size()), &channel);
        double sum = 0.0;
        for (size_t i = 24000; i < samples.size(); ++i) sum += static_cast<double>(samples[i]) * samples[i];
        return std::sqrt(sum / 24000.0) * std::sqrt(2.0);
    };
    CHECK_LT(decibels(rms(2960)), -40.0);
    CHECK_GT(decibels(rms(1000)), -0.11);
    CHECK_GT(decibels(rms(9000)), -0.11);
}
