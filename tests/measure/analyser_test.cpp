// SPDX-License-Identifier: MIT
//
// The analyser: its ring, fed block by block, and its readout, against the steps as they read and against a discrete Fourier
// transform in extended precision.
#include <doctest/doctest.h>

#include <atomic>
#include <cmath>
#include <cstdint>
#include <random>
#include <thread>
#include <vector>

#include "measure/analyser_transform.h"
#include "measure/band_tables.h"
#include "measure_sets.h"
#include "plain_readout.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

bool same(float a, float b) {
    return __builtin_bit_cast(uint32_t, a) == __builtin_bit_cast(uint32_t, b);
}
bool alike(float a, float b) {
    return same(a, b) || (std::isnan(a) && std::isnan(b));
}

struct Analyser : RealTimeAnalyser {
    explicit Analyser(int rate) { create(rate); }
    ~Analyser() { dispose(); }
    Analyser(const Analyser &) = delete;
    Analyser &operator=(const Analyser &) = delete;
};

struct Block {
    std::vector<float> storage;
    float *channels[8];
    Block(int frames, std::mt19937 &random) : storage(8 * static_cast<size_t>(frames) + 8) {
        for (float &sample : storage) sample = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
        for (int c = 0; c < 8; ++c) channels[c] = storage.data() + static_cast<size_t>(frames) * static_cast<size_t>(c);
    }
};

// The rule for one frame.
void plainFeed(std::vector<float> &ring, int &write, int read, int choice, float *const *channels, int channelCount, int frames) {
    const int capacity = static_cast<int>(ring.size());
    for (int f = 0; f < frames; ++f) {
        float value = channels[0][f];
        if (channelCount > 1 && choice >= 2) {
            for (int c = 1; c < channelCount; ++c) value += channels[c][f];
            value /= static_cast<float>(channelCount);
        } else if (channelCount > 1) {
            value = channels[choice][f];
        }
        const int next = (write + 1) % capacity;
        if (next == read) continue;
        ring[static_cast<size_t>(write)] = value;
        write = next;
    }
}

void feedSine(RealTimeAnalyser &analyser, int samples, double hz) {
    std::vector<float> block(static_cast<size_t>(samples));
    for (size_t i = 0; i < block.size(); ++i) {
        block[i] = static_cast<float>(std::sin(6.283185307179586 * hz * static_cast<double>(i) / analyser.sampleRate));
    }
    float *const channel = block.data();
    analyser.feed(2, &channel, 1, samples);
}

// What a readout leaves at the head of `work`, for a ring's newest samples.
std::vector<float> plainWork(const RealTimeAnalyser &analyser, int size) {
    std::vector<float> work(2 * static_cast<size_t>(size));
    const int half = size / 2;
    int from = *analyser.writeIndex - half;
    while (from < 0) from += analyser.capacity;
    for (size_t i = 0; i < static_cast<size_t>(half); ++i) {
        work[2 * i] = analyser.ring[from];
        from = (from + 1) % analyser.capacity;
    }
    plain::spectrum(work, size);
    return work;
}

}  // namespace

TEST_CASE("a new analyser is silent, off, one second long, and begins to write at 1") {
    const Analyser analyser(8000);
    CHECK(analyser.capacity == 8000);
    CHECK(analyser.sampleRate == 8000);
    CHECK(*analyser.writeIndex == 1);
    CHECK(*analyser.readIndex == 0);
    CHECK(analyser.enabled == 0u);
    CHECK(analyser.fftSize == nullptr);
    CHECK(analyser.window == nullptr);
    CHECK(analyser.work == nullptr);
    for (int i = 0; i < 8000; ++i) REQUIRE(analyser.ring[i] == 0.0F);
}

TEST_CASE("the ring holds what the rule for single frames puts there, for any lengths, channels, choices and read positions") {
    onEachInstructionSet([] {
        std::mt19937 random(21);
        Analyser analyser(1500);
        std::vector<float> ring(1500);
        int write = 1;
        for (int n = 0; n < 3000; ++n) {
            const int frames = static_cast<int>(random() % 513), channels = 1 + static_cast<int>(random() % 8);
            const int choice = channels == 1 ? static_cast<int>(random() % 9) : static_cast<int>(random() % 4);
            Block block(frames, random);
            if (random() % 3 == 0) *analyser.readIndex = static_cast<int>(random() % 1500);
            plainFeed(ring, write, *analyser.readIndex, choice, block.channels, channels, frames);
            analyser.feed(choice, block.channels, channels, frames);
            REQUIRE(*analyser.writeIndex == write);
            for (size_t i = 0; i < ring.size(); ++i) REQUIRE(same(analyser.ring[i], ring[i]));
        }
    });
}

TEST_CASE("with one channel the choice doesn't matter; with two, 0 and 1 pick a channel and any other gives the mean") {
    std::vector<float> left(10, 1.0F), right(10, 0.5F);
    float *const channels[2] = {left.data(), right.data()};
    for (const int choice : {0, 1, 2, 7}) {
        Analyser analyser(100);
        analyser.feed(choice, channels, 1, 10);
        CHECK(analyser.ring[1] == 1.0F);
        *analyser.writeIndex = 1;
        analyser.feed(choice, channels, 2, 10);
        CHECK(analyser.ring[1] == (choice == 0 ? 1.0F : choice == 1 ? 0.5F : 0.75F));
    }
}

TEST_CASE("a full ring drops samples until a readout has moved the read position") {
    Analyser analyser(1000);
    std::vector<float> first(990, 1.0F), second(200, 2.0F);
    float *const one = first.data(), *const two = second.data();
    analyser.feed(2, &one, 1, 990);
    analyser.feed(2, &two, 1, 200);
    CHECK(*analyser.writeIndex == 999);
    int twos = 0;
    for (int i = 0; i < 1000; ++i) twos += analyser.ring[i] == 2.0F ? 1 : 0;
    CHECK(twos == 8);
    analyser.readBands(1, 64, 3);
    CHECK(*analyser.readIndex == 999);
    analyser.feed(2, &two, 1, 200);
    CHECK(*analyser.writeIndex == 199);
}

TEST_CASE("feeding no frames, no channels or a negative choice changes nothing") {
    Analyser analyser(100);
    std::vector<float> block(10, 1.0F);
    float *const channel = block.data();
    analyser.feed(2, &channel, 1, 0);
    analyser.feed(2, &channel, 1, -5);
    analyser.feed(2, &channel, 0, 10);
    analyser.feed(-1, &channel, 1, 10);
    CHECK(*analyser.writeIndex == 1);
    Analyser without(0);
    without.feed(2, &channel, 1, 10);
    without.clear();
    without.readBands(1, 64, 3);
    CHECK(without.ring == nullptr);
}

TEST_CASE("clearing zeroes the samples and leaves both positions") {
    Analyser analyser(1000);
    feedSine(analyser, 600, 100.0);
    *analyser.readIndex = 17;
    analyser.clear();
    CHECK(*analyser.writeIndex == 601);
    CHECK(*analyser.readIndex == 17);
    for (int i = 0; i < 1000; ++i) REQUIRE(analyser.ring[i] == 0.0F);
}

TEST_CASE("a readout has the bits of the plain steps for every size, table and mode") {
    onEachInstructionSet([] {
        std::mt19937 random(31);
        Analyser analyser(48000);
        for (int i = 0; i < 48000; ++i) analyser.ring[i] = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
        for (int size = 2; size <= 65536; size *= 2) {
            CAPTURE(size);
            *analyser.writeIndex = static_cast<int>(random() % 48000);
            const std::vector<float> work = plainWork(analyser, size);
            for (const int perOctave : {1, 3, 48, -24}) {
                for (const int integrate : {0, 1}) {
                    for (float &band : analyser.bands) band = -1.0F;
                    analyser.readBands(integrate, size, perOctave);
                    const float *edges = nullptr, *centres = nullptr;
                    int count = 0;
                    BandTables::select(perOctave, &edges, &centres, &count);
                    const std::vector<float> expected = plain::bands(work, size / 2, edges, centres, count, 48000, integrate != 0);
                    for (size_t i = 0; i < expected.size(); ++i) REQUIRE(same(analyser.bands[i], expected[i]));
                    for (size_t i = expected.size(); i < VX_MAX_BANDS; ++i) REQUIRE(analyser.bands[i] == -1.0F);
                }
            }
            for (size_t k = 0; k <= static_cast<size_t>(size) / 2; ++k) REQUIRE(same(analyser.work[k], work[k]));
            CHECK(*analyser.readIndex == *analyser.writeIndex);
            CHECK(*analyser.fftSize == size);
        }
    });
}

TEST_CASE("samples far out of range are clamped to a million, and NaN makes every bin NaN, as in the plain steps") {
    onEachInstructionSet([] {
        for (const float strange : {1e30F, -INFINITY, INFINITY, NAN, 1e-42F}) {
            Analyser analyser(8000);
            feedSine(analyser, 7000, 440.0);
            analyser.ring[6500] = strange;
            const std::vector<float> work = plainWork(analyser, 4096);
            analyser.readBands(1, 4096, 3);
            for (size_t k = 0; k <= 2048; ++k) REQUIRE(alike(analyser.work[k], work[k]));
            CHECK(std::isnan(analyser.bands[5]) == std::isnan(strange));
        }
    });
}

TEST_CASE("the spectrum agrees with a discrete Fourier transform in extended precision") {
    onEachInstructionSet([] {
        const int size = 1024;
        Analyser analyser(8000);
        std::mt19937 random(41);
        for (int i = 0; i < 8000; ++i) analyser.ring[i] = static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
        *analyser.writeIndex = 3000;
        analyser.readBands(1, size, 3);
        long double largest = 0.0L, worst = 0.0L;
        for (int k = 0; k <= size / 2; ++k) {
            long double re = 0.0L, im = 0.0L;
            for (int i = 0; i < size / 2; ++i) {
                const long double angle = 6.283185307179586476925L * k * i / size;
                const long double w = 0.54L - 0.46L * std::cos(6.283185307179586476925L * i / (size / 2));
                re += analyser.ring[3000 - size / 2 + i] * w * std::cos(angle);
                im += analyser.ring[3000 - size / 2 + i] * w * std::sin(angle);
            }
            const long double power =
                (k == 0 || k == size / 2 ? 1.0L : 2.0L) * (re * re + im * im) / (static_cast<long double>(size) * size);
            largest = std::max(largest, power);
            worst = std::max(worst, std::fabs(power - static_cast<long double>(analyser.work[k])));
        }
        CHECK(worst < largest * 2e-6L);
    });
}

TEST_CASE("a full-scale sine shows in the band of its frequency and hardly anywhere else") {
    Analyser analyser(48000);
    feedSine(analyser, 40000, 1000.0);
    analyser.readBands(1, 16384, 3);
    const float *centres = nullptr;
    BandTables::select(3, nullptr, &centres, nullptr);
    float sum = 0.0F;
    for (int i = 0; i < 34; ++i) sum += analyser.bands[i];
    for (int i = 0; i < 34; ++i) {
        if (centres[i] == 1000.0F) {
            CHECK(analyser.bands[i] > 0.99F * sum);
        } else {
            CHECK(analyser.bands[i] < 0.005F * sum);
        }
    }
}

TEST_CASE("a readout of an analyser that was never fed is all zero") {
    Analyser analyser(48000);
    for (float &band : analyser.bands) band = 1.0F;
    analyser.readBands(1, 4096, 3);
    for (int i = 0; i < 34; ++i) CHECK(analyser.bands[i] == 0.0F);
}

TEST_CASE("a readout right after another takes the newest samples again") {
    Analyser analyser(48000);
    feedSine(analyser, 30000, 300.0);
    analyser.readBands(1, 4096, 12);
    const std::vector<float> first(analyser.bands, analyser.bands + 138);
    analyser.readBands(1, 4096, 12);
    for (size_t i = 0; i < first.size(); ++i) CHECK(same(first[i], analyser.bands[i]));
}

TEST_CASE("a frame as long as the ring copies nothing and analyses what the last transform left") {
    onEachInstructionSet([] {
        Analyser analyser(512);
        feedSine(analyser, 400, 60.0);
        analyser.readBands(1, 1024, 3);
        CHECK(analyser.work[3] == 0.0F);  // nothing was copied, and there was no earlier transform
        for (int i = 0; i < 1024; ++i) analyser.work[i] = std::sin(static_cast<float>(i)) * 0.5F;
        std::vector<float> work(analyser.work, analyser.work + 2048);
        for (int round = 0; round < 3; ++round) {
            plain::spectrum(work, 1024);
            analyser.readBands(1, 1024, 3);
            for (size_t k = 0; k < 2048; ++k) REQUIRE(same(analyser.work[k], work[k]));
        }
    });
}

TEST_CASE("a size that is no power of two, too small, negative or longer than the ring changes nothing") {
    Analyser analyser(1000);
    feedSine(analyser, 600, 100.0);
    analyser.readBands(1, 512, 3);
    const std::vector<float> before(analyser.bands, analyser.bands + VX_MAX_BANDS);
    *analyser.readIndex = 3;
    for (const int size : {0, 1, -1, -512, 3, 513, 1000, 4096, 1 << 30, INT32_MIN, INT32_MAX}) {
        analyser.readBands(1, size, 3);
        CHECK(*analyser.fftSize == 512);
        CHECK(*analyser.readIndex == 3);
    }
    for (size_t i = 0; i < before.size(); ++i) CHECK(same(analyser.bands[i], before[i]));
}

TEST_CASE("another size makes new buffers, and the window is the periodic Hamming form over half the size") {
    Analyser analyser(48000);
    for (const int size : {64, 4096, 2}) {
        analyser.readBands(1, size, 3);
        CHECK(*analyser.fftSize == size);
        for (int i = 0; i < size / 2; ++i) {
            CHECK(std::fabs(analyser.window[i] - (0.54 - 0.46 * std::cos(6.283185307179586 * i / (size / 2)))) < 1e-7);
        }
    }
}

TEST_CASE("a reader beside a running feed sees samples in the order in which they were fed") {
    Analyser analyser(4096);
    std::atomic<bool> stop{false};
    std::thread feeder([&] {
        std::vector<float> block(64);
        float *const channel = block.data();
        float next = 1.0F;
        while (!stop.load()) {
            for (float &sample : block) sample = next;
            next = next < 1000.0F ? next + 1.0F : 1.0F;
            analyser.feed(0, &channel, 1, 64);
            std::this_thread::yield();
        }
    });
    for (int i = 0; i < 2000; ++i) analyser.readBands(1, 256, 3);
    stop.store(true);
    feeder.join();
    CHECK(*analyser.readIndex >= 0);
    CHECK(*analyser.readIndex < 4096);
}
