// SPDX-License-Identifier: MIT
//
// FftFirFilter::resample: taps for another rate.
#include <bit>
#include <climits>
#include <cmath>
#include <cstdint>

#include "tests/measure/fir_fixture.h"

namespace {

using fir::Filter;

std::vector<float> tapsOf(const FftFirFilter &filter) {
    return {filter.taps, filter.taps + filter.tapCount};
}

// The formula with the C library's functions.
float expectedTap(const std::vector<float> &taps, int i, int ratio) {
    const long double pi = 3.14159265358979323846264338327950288L;
    const double x = static_cast<double>(i) / ratio;
    long double sum = 0.0L;
    for (int k = -255; k <= 254; ++k) {
        const int m = static_cast<int>(k + x);
        if (m < 0 || m >= static_cast<int>(taps.size())) continue;
        const long double d = m - static_cast<long double>(x);
        const long double window = 0.5L - 0.5L * std::cos((d / 511.0L + 0.5L) * 2.0L * pi);
        const long double sinc = d == 0.0L ? 1.0L : std::sin(pi * d) / (pi * d);
        sum += static_cast<long double>(taps[static_cast<size_t>(m)]) * window * sinc;
    }
    return static_cast<float>(sum);
}

}  // namespace

TEST_CASE("resampling by a whole ratio makes ratio times as many taps, by the windowed sinc") {
    std::mt19937 random(15);
    for (const int ratio : {2, 3, 4}) {
        for (const int count : {1, 10, 300, 600}) {
            CAPTURE(ratio);
            CAPTURE(count);
            const std::vector<float> taps = fir::randomValues(random, count);
            Filter filter(taps);
            filter.resample(48000 * ratio);
            REQUIRE_EQ(filter.tapCount, count * ratio);
            CHECK_EQ(filter.sampleRate, 48000 * ratio);
            for (int i = 0; i < filter.tapCount; ++i) {
                REQUIRE(std::fabs(filter.taps[i] - expectedTap(taps, i, ratio)) <= 1e-6f * static_cast<float>(ratio));
            }
        }
    }
}

TEST_CASE("a place between -1 and 0 counts as place 0 once more") {
    Filter filter(std::vector<float>{1.0f});
    filter.resample(96000);
    // At x = 0.5 both k = -1 and k = 0 are cut to place 0: twice the sinc of half a place.
    CHECK_EQ(filter.taps[1], doctest::Approx(2.0 * 0.63662).epsilon(1e-4));
    CHECK_EQ(filter.taps[0], 1.0f);
}

TEST_CASE("resampled taps have the same bits everywhere") {
    std::vector<float> taps(50);
    for (int i = 0; i < 50; ++i) taps[static_cast<size_t>(i)] = static_cast<float>((i * 37) % 50 - 25) / 32.0f;
    Filter filter(taps);
    filter.resample(3 * 48000);
    uint64_t digest = 1469598103934665603u;
    for (const float tap : tapsOf(filter)) digest = (digest ^ std::bit_cast<uint32_t>(tap)) * 1099511628211u;
    CHECK_EQ(digest, uint64_t{1375970036438924625u});
}

TEST_CASE("a rate with the whole ratio 1, or below, changes nothing") {
    const std::vector<float> taps{0.5f, 0.25f, 0.125f};
    Filter filter(taps);
    for (const int rate : {48000, 48001, 95999, 47999, 44100, 0, -48000, -96000, INT_MIN}) {
        CAPTURE(rate);
        filter.resample(rate);
        CHECK_EQ(tapsOf(filter), taps);
        CHECK_EQ(filter.sampleRate, 48000);
    }
}

TEST_CASE("a ratio that asks for more than 4096 taps changes nothing") {
    Filter filter(std::vector<float>(2049, 0.5f));
    filter.resample(96000);
    CHECK_EQ(filter.tapCount, 2049);
    CHECK_EQ(filter.sampleRate, 48000);
    filter.sampleRate = 1;
    filter.resample(INT_MAX);
    CHECK_EQ(filter.tapCount, 2049);
}

TEST_CASE("odd sample rates in the record do no harm to resampling") {
    const std::vector<float> taps{0.5f, 0.25f};
    Filter filter;
    filter.load(taps.data(), 2, 0);
    filter.resample(48000);
    CHECK_EQ(tapsOf(filter), taps);
    filter.load(taps.data(), 2, -1);
    filter.resample(INT_MIN);
    CHECK_EQ(tapsOf(filter), taps);
    filter.load(nullptr, 0, 48000);
    filter.resample(96000);
    CHECK_EQ(filter.tapCount, 0);
    CHECK_EQ(filter.sampleRate, 96000);
}
