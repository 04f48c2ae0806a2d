// SPDX-License-Identifier: MIT
//
// FftFirFilter against the plain form, bit for bit, with the kernels of each instruction set that the machine has.
#include <doctest/doctest.h>

#include <bit>
#include <cstdint>
#include <iterator>
#include <limits>
#include <random>
#include <vector>

#include "tests/measure/fir_fixture.h"
#include "tests/measure/plain_fir.h"

namespace {

using fir::Filter;
using fir::randomValues;
using fir::withEachInstructionSet;
using Random = std::mt19937;

// Runs both forms in place over `samples`, cut as told, and tells where they first differ: -1 for nowhere.
int firstDifference(FftFirFilter &filter, plain::Fir &judge, std::vector<float> samples, const std::vector<int> &cuts) {
    std::vector<float> expected = samples;
    size_t at = 0;
    for (const int cut : cuts) {
        filter.process(samples.data() + at, samples.data() + at, cut);
        judge.process(expected.data() + at, expected.data() + at, cut);
        at += static_cast<size_t>(cut);
    }
    for (size_t i = 0; i < at; ++i) {
        const bool bothNan = samples[i] != samples[i] && expected[i] != expected[i];
        if (!bothNan && std::bit_cast<uint32_t>(samples[i]) != std::bit_cast<uint32_t>(expected[i])) return static_cast<int>(i);
    }
    for (size_t i = 0; i < judge.overlap.size(); ++i) {
        const bool bothNan = filter.overlap[i] != filter.overlap[i] && judge.overlap[i] != judge.overlap[i];
        if (!bothNan && std::bit_cast<uint32_t>(filter.overlap[i]) != std::bit_cast<uint32_t>(judge.overlap[i])) {
            return static_cast<int>(at + i);
        }
    }
    return -1;
}

std::vector<int> tapCounts() {
    std::vector<int> counts;
    for (int i = 1; i <= 64; ++i) counts.push_back(i);
    for (const int i : {65, 127, 128, 129, 255, 256, 257, 512, 1000, 1024, 2048, 2049, 4095, 4096}) counts.push_back(i);
    return counts;
}

plain::Fir judgeOf(const std::vector<float> &taps) {
    plain::Fir judge;
    judge.load(taps);
    return judge;
}

}  // namespace

TEST_CASE("the filter gives the bits of the plain form for every tap count at blocks of 512") {
    withEachInstructionSet([] {
        Random random(1);
        for (const int count : tapCounts()) {
            CAPTURE(count);
            const std::vector<float> taps = randomValues(random, count);
            Filter filter(taps);
            plain::Fir judge = judgeOf(taps);
            CHECK_EQ(firstDifference(filter, judge, randomValues(random, 1536), {512, 512, 512}), -1);
        }
    });
}

TEST_CASE("the filter gives the bits of the plain form for every block length from 1 to 512") {
    withEachInstructionSet([] {
        Random random(2);
        for (const int count : {32, 128, 300}) {
            const std::vector<float> taps = randomValues(random, count);
            Filter filter(taps);
            plain::Fir judge = judgeOf(taps);
            for (int length = 1; length <= 512; ++length) {
                CAPTURE(count);
                CAPTURE(length);
                REQUIRE_EQ(firstDifference(filter, judge, randomValues(random, length), {length}), -1);
            }
        }
    });
}

TEST_CASE("the filter gives the bits of the plain form for random cuts, for every tap count") {
    withEachInstructionSet([] {
        const unsigned seed = std::random_device{}();
        CAPTURE(seed);
        Random random(seed);
        for (const int count : tapCounts()) {
            CAPTURE(count);
            const std::vector<float> taps = randomValues(random, count);
            Filter filter(taps);
            plain::Fir judge = judgeOf(taps);
            std::vector<int> cuts;
            int total = 0;
            for (int i = 0; i < 8; ++i) {
                cuts.push_back(std::uniform_int_distribution(1, i % 2 == 0 ? 512 : 40)(random));
                total += cuts.back();
            }
            CHECK_EQ(firstDifference(filter, judge, randomValues(random, total), cuts), -1);
        }
    });
}

TEST_CASE("one call with more samples than half the transform gives the bits of the plain form") {
    withEachInstructionSet([] {
        Random random(3);
        for (const int count : {3, 20, 32, 128, 1024, 4096}) {
            CAPTURE(count);
            const std::vector<float> taps = randomValues(random, count);
            Filter filter(taps);
            plain::Fir judge = judgeOf(taps);
            CHECK_EQ(firstDifference(filter, judge, randomValues(random, 9000), {9000}), -1);
        }
    });
}

TEST_CASE("zeros keep their signs as in the plain form") {
    withEachInstructionSet([] {
        Random random(4);
        for (const int count : {5, 16, 32, 64, 128, 512, 1024, 4096}) {
            for (int kind = 0; kind < 4; ++kind) {
                CAPTURE(count);
                CAPTURE(kind);
                // Mostly zeros of either sign, in the input, the taps and so in what is carried over.
                const auto sparse = [&](int length) {
                    std::vector<float> values = randomValues(random, length);
                    for (float &value : values) {
                        const unsigned draw = random() % 16;
                        if (kind == 0 || draw < 7)
                            value = -0.0f;
                        else if (kind != 1 && draw < 15)
                            value = 0.0f;
                        else if (kind == 1)
                            value = -0.0f;
                        else if (kind == 2)
                            value = draw % 2 != 0 ? 1.0f : -1.0f;
                    }
                    return values;
                };
                const std::vector<float> taps = sparse(count);
                Filter filter(taps);
                plain::Fir judge = judgeOf(taps);
                for (size_t i = 0; i < judge.overlap.size(); ++i) {
                    judge.overlap[i] = filter.overlap[i] = random() % 2 != 0 ? -0.0f : 0.0f;
                }
                CHECK_EQ(firstDifference(filter, judge, sparse(1200), {512, 17, 512, 1, 158}), -1);
            }
        }
    });
}

TEST_CASE("a lone negative zero keeps its sign as in the plain form") {
    withEachInstructionSet([] {
        // Short blocks of small numbers, so that sums cancel and what is left of a zero is its sign.
        constexpr float kValues[] = {0.0f, -0.0f, -0.0f, 1.0f, -1.0f, 0.5f, -1.5f};
        Random random(7);
        const auto draw = [&](int length) {
            std::vector<float> values(static_cast<size_t>(length));
            for (float &value : values) value = kValues[random() % std::size(kValues)];
            return values;
        };
        for (const int count : {3, 5, 8, 9, 13, 16, 17, 33}) {
            for (int trial = 0; trial < 4000; ++trial) {
                CAPTURE(count);
                CAPTURE(trial);
                const std::vector<float> taps = draw(count);
                Filter filter(taps);
                plain::Fir judge = judgeOf(taps);
                for (size_t i = 0; i < judge.overlap.size(); ++i) {
                    judge.overlap[i] = filter.overlap[i] = random() % 2 != 0 ? -0.0f : 0.0f;
                }
                const int length = 1 + static_cast<int>(random() % 12);
                REQUIRE_EQ(firstDifference(filter, judge, draw(length), {length}), -1);
            }
        }
    });
}

TEST_CASE("tiny and huge samples give the bits of the plain form") {
    withEachInstructionSet([] {
        Random random(5);
        for (const int count : {9, 32, 512, 4096}) {
            for (const float scale : {1e-45f, 1e-40f, 1e-30f, 1e18f, 1e30f, 3e38f}) {
                CAPTURE(count);
                CAPTURE(scale);
                std::vector<float> taps = randomValues(random, count);
                for (float &tap : taps) tap *= scale;
                std::vector<float> samples = randomValues(random, 1024);
                for (float &sample : samples) sample *= scale;
                Filter filter(taps);
                plain::Fir judge = judgeOf(taps);
                CHECK_EQ(firstDifference(filter, judge, samples, {512, 512}), -1);
            }
        }
    });
}

TEST_CASE("infinities and NaN in samples or taps come out where they do in the plain form") {
    withEachInstructionSet([] {
        Random random(6);
        const float infinity = std::numeric_limits<float>::infinity();
        const float nan = std::numeric_limits<float>::quiet_NaN();
        for (const int count : {7, 32, 128, 1024, 4096}) {
            for (const float odd : {infinity, -infinity, nan}) {
                for (int place = 0; place < 8; ++place) {
                    CAPTURE(count);
                    CAPTURE(odd);
                    CAPTURE(place);
                    std::vector<float> taps = randomValues(random, count);
                    std::vector<float> samples = randomValues(random, 1024);
                    if (place == 7)
                        taps[random() % taps.size()] = odd;
                    else
                        samples[place == 0 ? 0 : random() % samples.size()] = odd;
                    Filter filter(taps);
                    plain::Fir judge = judgeOf(taps);
                    CHECK_EQ(firstDifference(filter, judge, samples, {512, 500, 12}), -1);
                }
            }
        }
    });
}
