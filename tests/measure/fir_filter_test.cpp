// SPDX-License-Identifier: MIT
//
// FftFirFilter: what each call does to the record, and what comes out of it.
#include <algorithm>
#include <bit>
#include <climits>
#include <cmath>
#include <cstdint>

#include "measure/elliptic_math.h"
#include "tests/measure/fir_fixture.h"
#include "tests/measure/plain_fir.h"

namespace {

using fir::Filter;
using fir::randomValues;
using fir::withEachInstructionSet;

std::vector<float> filtered(FftFirFilter &filter, std::vector<float> samples, int cut) {
    const int count = static_cast<int>(samples.size());
    for (int at = 0; at < count; at += cut) filter.process(samples.data() + at, samples.data() + at, std::min(cut, count - at));
    return samples;
}

bool sameBits(const std::vector<float> &a, const std::vector<float> &b) {
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i) {
        if (std::bit_cast<uint32_t>(a[i]) != std::bit_cast<uint32_t>(b[i])) return false;
    }
    return true;
}

// The record's fields, to see that a refused call changed nothing.
std::vector<unsigned char> recordBytes(const FftFirFilter &filter) {
    const auto *bytes = reinterpret_cast<const unsigned char *>(&filter);
    return {bytes, bytes + sizeof(FftFirFilter)};
}

}  // namespace

TEST_CASE("a fresh filter is transparent: 32 taps, an impulse, 44100 Hz") {
    Filter filter;
    CHECK_EQ(filter.tapCount, 32);
    CHECK_EQ(filter.sampleRate, 44100);
    CHECK_EQ(filter.log2Size, 6);
    CHECK_EQ(filter.fftSize, 64);
    REQUIRE_NE(filter.plan, nullptr);
    CHECK_EQ(*filter.plan, 64);
    CHECK((filter.beforeTransform == nullptr));
    CHECK((filter.afterTransform == nullptr));
    CHECK_EQ(filter.beforeTransformArgument, nullptr);
    CHECK_EQ(filter.afterTransformArgument, nullptr);
    for (int i = 0; i < 32; ++i) {
        CHECK_EQ(filter.taps[i], i == 0 ? 1.0f : 0.0f);
        CHECK_EQ(filter.overlap[i], 0.0f);
    }
    for (int i = 0; i < 64; ++i) {
        CHECK_EQ(filter.response[2 * i], 1.0);
        CHECK_EQ(filter.response[2 * i + 1], 0.0);
    }
}

TEST_CASE("a unit impulse of any length returns the input, apart from f32 rounding") {
    withEachInstructionSet([] {
        std::mt19937 random(7);
        for (const int count : {1, 2, 3, 8, 9, 31, 32, 33, 100, 512, 1000, 4096}) {
            CAPTURE(count);
            std::vector<float> taps(static_cast<size_t>(count));
            taps[0] = 1.0f;
            Filter filter(taps);
            const std::vector<float> samples = randomValues(random, 1500);
            const std::vector<float> result = filtered(filter, samples, 480);
            for (size_t i = 0; i < samples.size(); ++i) REQUIRE(std::fabs(result[i] - samples[i]) <= 1e-7f);
        }
    });
}

TEST_CASE("one tap yields a log2Size of 1 and a transform of 2") {
    const float tap = -0.5f;
    Filter filter;
    filter.load(&tap, 1, 48000);
    CHECK_EQ(filter.log2Size, 1);
    CHECK_EQ(filter.fftSize, 2);
    CHECK_EQ(*filter.plan, 2);
    CHECK_EQ(filter.sampleRate, 48000);
    const std::vector<float> result = filtered(filter, {1.0f, 2.0f, 3.0f}, 2);
    CHECK_EQ(result, std::vector<float>{-0.5f, -1.0f, -1.5f});
}

TEST_CASE("the transform is the next power of two that holds the taps twice") {
    Filter filter;
    for (int count = 1; count <= 4096; ++count) {
        const std::vector<float> taps(static_cast<size_t>(count), 1.0f);
        if (count > 70 && count % 512 > 2 && count % 512 < 510) continue;
        filter.load(taps.data(), count, 48000);
        REQUIRE_EQ(filter.log2Size, static_cast<int>(std::ceil(std::log2(count))) + 1);
        REQUIRE_EQ(filter.fftSize, 1 << filter.log2Size);
        REQUIRE_EQ(*filter.plan, filter.fftSize);
    }
}

TEST_CASE("a count above half the transform is cut in pieces and gives the same output as one large transform") {
    withEachInstructionSet([] {
        std::mt19937 random(8);
        const std::vector<float> taps = randomValues(random, 20);
        std::vector<float> padded = taps;
        padded.resize(1024);
        Filter pieces(taps);
        Filter whole(padded);
        const std::vector<float> samples = randomValues(random, 1000);
        const std::vector<float> a = filtered(pieces, samples, 1000);
        const std::vector<float> b = filtered(whole, samples, 1000);
        // Each sum has 20 products below 1; what is carried between pieces is rounded to f32 once more.
        for (size_t i = 0; i < samples.size(); ++i) REQUIRE(std::fabs(a[i] - b[i]) <= 20.0f * 0x1p-23f);
    });
}

TEST_CASE("loading 0 taps frees all buffers and the next block passes unchanged") {
    Filter filter;
    filter.load(nullptr, 0, 96000);
    CHECK_EQ(filter.tapCount, 0);
    CHECK_EQ(filter.sampleRate, 96000);
    CHECK_EQ(filter.taps, nullptr);
    CHECK_EQ(filter.response, nullptr);
    CHECK_EQ(filter.work, nullptr);
    CHECK_EQ(filter.overlap, nullptr);
    CHECK_EQ(filter.plan, nullptr);
    std::mt19937 random(9);
    const std::vector<float> samples = randomValues(random, 512);
    CHECK(sameBits(filtered(filter, samples, 512), samples));
    filter.clearOverlap();
}

TEST_CASE("a disposed filter has no memory, passes blocks and can be loaded again") {
    Filter filter;
    filter.dispose();
    CHECK_EQ(filter.taps, nullptr);
    CHECK_EQ(filter.response, nullptr);
    CHECK_EQ(filter.work, nullptr);
    CHECK_EQ(filter.overlap, nullptr);
    CHECK_EQ(filter.plan, nullptr);
    const std::vector<float> samples{1.0f, 2.0f};
    CHECK(sameBits(filtered(filter, samples, 2), samples));
    const std::vector<float> taps(32, 0.25f);
    filter.load(taps.data(), 32, 48000);
    REQUIRE_NE(filter.plan, nullptr);
    CHECK_EQ(filtered(filter, {1.0f, 0.0f}, 2)[1], doctest::Approx(0.25f));
}

TEST_CASE("a block without samples changes nothing") {
    Filter filter;
    float sample = 3.0f;
    filter.overlap[0] = 0.5f;
    filter.process(&sample, &sample, 0);
    filter.process(&sample, &sample, -1);
    filter.process(&sample, &sample, INT_MIN);
    CHECK_EQ(sample, 3.0f);
    CHECK_EQ(filter.overlap[0], 0.5f);
}

TEST_CASE("a record whose tap count, taps or plan is missing passes blocks") {
    const std::vector<float> samples{1.0f, -2.0f, 3.0f};
    Filter filter(std::vector<float>(20, 0.5f));
    const FftFirFilter kept = filter;
    filter.tapCount = 0;
    CHECK(sameBits(filtered(filter, samples, 3), samples));
    filter.tapCount = kept.tapCount;
    filter.taps = nullptr;
    CHECK(sameBits(filtered(filter, samples, 3), samples));
    filter.taps = kept.taps;
    filter.plan = nullptr;
    CHECK(sameBits(filtered(filter, samples, 3), samples));
    filter.plan = kept.plan;
    CHECK_FALSE(sameBits(filtered(filter, samples, 3), samples));
}

TEST_CASE("a reload of equal length leaves the overlap in place, so the old tail fades out through the new filter") {
    withEachInstructionSet([] {
        std::mt19937 random(10);
        for (const int count : {6, 40, 600}) {
            CAPTURE(count);
            const std::vector<float> first = randomValues(random, count);
            const std::vector<float> second = randomValues(random, count);
            Filter filter(first);
            plain::Fir judge;
            judge.load(first);
            std::vector<float> samples = randomValues(random, 700);
            std::vector<float> expected = samples;
            filter.process(samples.data(), samples.data(), 300);
            judge.process(expected.data(), expected.data(), 300);
            filter.load(second.data(), count, 44100);
            judge.load(second);
            CHECK_EQ(std::vector<float>(filter.taps, filter.taps + count), second);
            CHECK_EQ(filter.sampleRate, 44100);
            filter.process(samples.data() + 300, samples.data() + 300, 400);
            judge.process(expected.data() + 300, expected.data() + 300, 400);
            CHECK(sameBits(samples, expected));
        }
    });
}

TEST_CASE("a reload of another length begins without a tail") {
    Filter filter(std::vector<float>(10, 1.0f));
    filtered(filter, {1.0f, 1.0f}, 2);
    const std::vector<float> taps(11, 1.0f);
    filter.load(taps.data(), 11, 48000);
    CHECK_EQ(filtered(filter, {0.0f}, 1)[0], 0.0f);
}

TEST_CASE("clearing the overlap ends the tail and nothing else") {
    std::mt19937 random(11);
    for (const int count : {5, 33, 600}) {
        const std::vector<float> taps = randomValues(random, count);
        Filter used(taps);
        Filter fresh(taps);
        filtered(used, randomValues(random, 512), 512);
        used.clearOverlap();
        for (int i = 0; i < used.fftSize / 2; ++i) REQUIRE_EQ(used.overlap[i], 0.0f);
        const std::vector<float> samples = randomValues(random, 512);
        CHECK(sameBits(filtered(used, samples, 512), filtered(fresh, samples, 512)));
    }
}

TEST_CASE("4096 taps yield a transform of 8192; 4097 are refused") {
    std::vector<float> taps(4097, 0.5f);
    Filter filter;
    filter.load(taps.data(), 4096, 48000);
    CHECK_EQ(filter.tapCount, 4096);
    CHECK_EQ(filter.fftSize, 8192);
    const auto before = recordBytes(filter);
    filter.load(taps.data(), 4097, 44100);
    CHECK(recordBytes(filter) == before);
}

TEST_CASE("a load of a negative count, of far too many taps or without taps changes nothing") {
    const std::vector<float> taps(64, 0.5f);
    Filter filter(taps);
    const auto before = recordBytes(filter);
    filter.load(taps.data(), -1, 44100);
    filter.load(taps.data(), INT_MIN, 44100);
    filter.load(taps.data(), INT_MAX, 44100);
    filter.load(nullptr, 64, 44100);
    filter.load(nullptr, 65, 44100);
    CHECK(recordBytes(filter) == before);
    CHECK_EQ(std::vector<float>(filter.taps, filter.taps + 64), taps);
}

TEST_CASE("a filter agrees with a direct convolution") {
    withEachInstructionSet([] {
        std::mt19937 random(12);
        for (const int count : {1, 7, 32, 128, 512, 1024, 4096}) {
            const std::vector<float> taps = randomValues(random, count);
            const std::vector<float> samples = randomValues(random, 2048);
            Filter filter(taps);
            const std::vector<float> result = filtered(filter, samples, 512);
            // An output is a sum of `count` products below 1. f64 arithmetic leaves nothing of that size; each piece that the tail
            // goes through rounds a partial sum to f32, and there are at most 2048 / (fftSize / 2) + 512-sample blocks of them.
            const int pieces = 2 + std::max(1, count / 512) + 2;
            double largest = 0.0;
            for (size_t i = 0; i < samples.size(); ++i) {
                long double sum = 0.0L;
                long double magnitude = 0.0L;
                for (size_t k = 0; k < taps.size() && k <= i; ++k) {
                    const long double term = static_cast<long double>(taps[k]) * static_cast<long double>(samples[i - k]);
                    sum += term;
                    magnitude += std::fabs(term);
                }
                const double error = std::fabs(static_cast<double>(static_cast<long double>(result[i]) - sum));
                const double bound = static_cast<double>(magnitude) * pieces * 0x1p-24 + count * 1e-14;
                REQUIRE(error <= bound);
                largest = std::max(largest, std::fabs(static_cast<double>(sum)));
            }
            CHECK_GT(largest, 0.1);
        }
    });
}

namespace {

// Writes down what a hook saw.
struct Seen {
    std::vector<double> values;
    int calls = 0;
    int size = 0;
};

void note(double *work, void *argument) {
    Seen &seen = *static_cast<Seen *>(argument);
    seen.values.assign(work, work + 2 * seen.size);
    ++seen.calls;
}

void halve(double *work, void *argument) {
    for (int i = 0; i < 2 * *static_cast<int *>(argument); ++i) work[i] *= 0.5;
}

}  // namespace

TEST_CASE("a hook before the transform sees the padded block, one behind it the spectrum, both interleaved") {
    withEachInstructionSet([] {
        std::mt19937 random(13);
        const std::vector<float> taps = randomValues(random, 40);
        const std::vector<float> samples = randomValues(random, 100);
        Filter filter(taps);
        Filter bare(taps);
        Seen before{{}, 0, 128};
        Seen after{{}, 0, 128};
        filter.beforeTransform = note;
        filter.beforeTransformArgument = &before;
        filter.afterTransform = note;
        filter.afterTransformArgument = &after;
        const std::vector<float> result = filtered(filter, samples, 100);
        CHECK_EQ(before.calls, 2);  // pieces of 64 and 36
        CHECK_EQ(after.calls, 2);
        std::vector<plain::Value> expected(128);
        for (size_t i = 0; i < 128; ++i) {
            if (i < 36) expected[i].re = samples[64 + i];
            REQUIRE_EQ(before.values[2 * i], expected[i].re);
            REQUIRE_EQ(before.values[2 * i + 1], 0.0);
        }
        plain::transform(expected, true);
        for (size_t i = 0; i < 128; ++i) {
            REQUIRE_EQ(after.values[2 * i], expected[i].re);
            REQUIRE_EQ(after.values[2 * i + 1], expected[i].im);
        }
        CHECK(sameBits(result, filtered(bare, samples, 100)));
    });
}

TEST_CASE("what a hook changes is what the filter goes on with") {
    int size = 64;
    Filter filter;
    filter.afterTransform = halve;
    filter.afterTransformArgument = &size;
    CHECK_EQ(filtered(filter, {1.0f}, 1)[0], doctest::Approx(0.5f));
    filter.beforeTransform = halve;
    filter.beforeTransformArgument = &size;
    CHECK_EQ(filtered(filter, {1.0f}, 1)[0], doctest::Approx(0.25f));
}

TEST_CASE("input and output may be different buffers, and the input stays as it is") {
    withEachInstructionSet([] {
        std::mt19937 random(14);
        const std::vector<float> taps = randomValues(random, 64);
        const std::vector<float> samples = randomValues(random, 300);
        Filter apart(taps);
        Filter inPlace(taps);
        const std::vector<float> in = samples;
        std::vector<float> out(300, 7.0f);
        apart.process(in.data(), out.data(), 300);
        CHECK(sameBits(in, samples));
        CHECK(sameBits(out, filtered(inPlace, samples, 300)));
    });
}
