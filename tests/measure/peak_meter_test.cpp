// SPDX-License-Identifier: MIT
#include "measure/peak_meter.h"

#include <doctest/doctest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <random>
#include <vector>

#include "measure/white_noise.h"
#include "measure_sets.h"

using namespace vxcomn;

namespace {

void plainPeaks(float *const *channels, float *peaks, int channelCount, int frameCount) {
    for (int c = 0; c < channelCount; ++c) {
        for (int i = 0; i < frameCount; ++i) {
            const float x = channels[c][i];
            const float a = !(x < 0.0F) ? x : -x;
            if (a > peaks[c]) peaks[c] = a;
        }
    }
}

// Samples of all kinds: loud, denormal, zeros of both signs, infinities and NaN.
float anySample(std::mt19937 &random) {
    switch (random() % 12) {
        case 0:
            return std::numeric_limits<float>::quiet_NaN();
        case 1:
            return -std::numeric_limits<float>::quiet_NaN();
        case 2:
            return static_cast<float>(random() % 1000) * 1e-43F;
        case 3:
            return -0.0F;
        case 4:
            return random() % 40 == 0 ? -std::numeric_limits<float>::infinity() : 0.5F;
        default:
            return static_cast<float>(static_cast<int32_t>(random())) * 0x1p-31F;
    }
}

}  // namespace

TEST_CASE("peaks have the bits of the plain loop for every length, offset and kind of sample") {
    onEachInstructionSet([] {
        std::mt19937 random(11);
        for (int frames = 0; frames <= 512; ++frames) {
            std::vector<float> storage(8 * 520);
            float *channels[8];
            for (int c = 0; c < 8; ++c) channels[c] = storage.data() + 520 * c + random() % 8;
            for (float &sample : storage) sample = anySample(random);
            float expected[8], got[8];
            for (int c = 0; c < 8; ++c) expected[c] = got[c] = static_cast<float>(random() % 3) * 0.4F;
            plainPeaks(channels, expected, 8, frames);
            REQUIRE(updatePeaks(channels, got, 8, frames) == 8);
            for (int c = 0; c < 8; ++c) REQUIRE(__builtin_bit_cast(uint32_t, got[c]) == __builtin_bit_cast(uint32_t, expected[c]));
        }
    });
}

TEST_CASE("a negative sample counts by its magnitude") {
    onEachInstructionSet([] {
        for (int at = 0; at < 100; ++at) {
            float samples[100] = {};
            samples[at] = -0.75F;
            float *const channel = samples;
            float peak = 0.0F;
            updatePeaks(&channel, &peak, 1, 100);
            REQUIRE(peak == 0.75F);
        }
    });
}

TEST_CASE("silence leaves a peak where it stands, and NaN never raises one") {
    onEachInstructionSet([] {
        float samples[64] = {};
        float *const channel = samples;
        float peak = 1e-6F;
        updatePeaks(&channel, &peak, 1, 64);
        CHECK(peak == 1e-6F);
        for (float &sample : samples) sample = std::numeric_limits<float>::quiet_NaN();
        updatePeaks(&channel, &peak, 1, 64);
        CHECK(peak == 1e-6F);
    });
}

TEST_CASE("a full-scale block followed by silence still reads 1.0, and 0.0 once it has been emptied") {
    float samples[512];
    for (float &sample : samples) sample = -1.0F;
    float *const channel = samples;
    float peak = 0.0F;
    updatePeaks(&channel, &peak, 1, 512);
    for (float &sample : samples) sample = 0.0F;
    updatePeaks(&channel, &peak, 1, 512);
    CHECK(peak == 1.0F);
    peak = 0.0F;
    updatePeaks(&channel, &peak, 1, 512);
    CHECK(peak == 0.0F);
}

TEST_CASE("with no channels nothing happens and the count comes back") {
    float peak = 0.25F;
    CHECK(updatePeaks(nullptr, &peak, 0, 512) == 0);
    CHECK(updatePeaks(nullptr, &peak, -3, 512) == -3);
    CHECK(peak == 0.25F);
}

TEST_CASE("the white test signal reads close to 2.0") {
    std::vector<float> samples(512);
    float *const channel = samples.data();
    float peak = 0.0F;
    for (int block = 0; block < 20; ++block) {
        fillWhite(samples.data(), 512);
        updatePeaks(&channel, &peak, 1, 512);
    }
    CHECK(peak > 1.99F);
    CHECK(peak <= 2.0F);
}

TEST_CASE("the silence test sees a single sample above the threshold at every place, and none at or below it") {
    onEachInstructionSet([] {
        for (int count = 0; count <= 200; ++count) {
            std::vector<float> samples(static_cast<size_t>(count), 1e-6F);
            if (count % 3 == 0) samples.assign(samples.size(), std::numeric_limits<float>::quiet_NaN());
            REQUIRE(!anyAbove(samples.data(), count, 1e-6F));
            for (int at = 0; at < count; at += 1 + at / 9) {
                const float kept = samples[static_cast<size_t>(at)];
                samples[static_cast<size_t>(at)] = at % 2 == 0 ? std::nextafter(1e-6F, 1.0F) : -1.1e-6F;
                REQUIRE(anyAbove(samples.data(), count, 1e-6F));
                samples[static_cast<size_t>(at)] = kept;
            }
        }
    });
}
