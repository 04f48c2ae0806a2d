// SPDX-License-Identifier: MIT
#include "measure/band_integration.h"

#include <doctest/doctest.h>

#include <cmath>
#include <cstdint>
#include <random>
#include <vector>

#include "VXDSPAPI.h"
#include "measure/band_tables.h"
#include "measure_sets.h"
#include "plain_readout.h"

using namespace vxcomn;

namespace {

// A spectrum without anything behind its last value: a sanitizer notices a reader that goes further.
std::vector<float> anySpectrum(int half, unsigned seed) {
    std::mt19937 random(seed);
    std::vector<float> power(static_cast<size_t>(half) + 1);
    for (float &value : power) value = static_cast<float>(random()) * 0x1p-32F;
    return power;
}

constexpr float kUntouched = -7.0F;

}  // namespace

TEST_CASE("bands have the bits of the plain sums for every table, size, rate and mode") {
    onEachInstructionSet([] {
        for (const int half : {1, 2, 16, 100, 1000, 2048, 8192, 32768}) {
            const std::vector<float> power = anySpectrum(half, static_cast<unsigned>(half));
            for (const int rate : {8000, 44100, 48000, 192000}) {
                for (const int perOctave : {1, 3, 6, 12, 24, 48, -24}) {
                    for (const bool integrate : {false, true}) {
                        const float *edges = nullptr, *centres = nullptr;
                        int size = 0;
                        BandTables::select(perOctave, &edges, &centres, &size);
                        const std::vector<float> expected = plain::bands(power, half, edges, centres, size, rate, integrate);
                        std::vector<float> got(static_cast<size_t>(size) - 1, kUntouched);
                        CHECK(VXDSPAPI_RTA_CalcSpectrum(power.data(), 2 * half, got.data(), rate, perOctave, integrate ? 2 : 0) ==
                              size);
                        for (size_t i = 0; i < got.size(); ++i) {
                            REQUIRE(__builtin_bit_cast(uint32_t, got[i]) == __builtin_bit_cast(uint32_t, expected[i]));
                        }
                    }
                }
            }
        }
    });
}

TEST_CASE("integrated bands of a flat spectrum are their widths in bins") {
    const int half = 8192;
    const std::vector<float> power(static_cast<size_t>(half) + 1, 1.0F);
    const float *edges = nullptr;
    int size = 0;
    BandTables::select(12, &edges, nullptr, &size);
    std::vector<float> bands(static_cast<size_t>(size) - 1);
    VXDSPAPI_RTA_CalcSpectrum(power.data(), 2 * half, bands.data(), 48000, 12, 1);
    for (size_t i = 0; i < bands.size(); ++i) {
        const double width = (static_cast<double>(edges[i + 1]) - edges[i]) * 2 * half / 48000.0;
        CHECK(std::fabs(bands[i] - width) < 0.001 + width * 1e-5);
    }
}

TEST_CASE("bands above Nyquist yield 0 when integrated and read nothing behind the spectrum's last value") {
    const int half = 2048;
    const std::vector<float> power = anySpectrum(half, 4);
    std::vector<float> bands(555);
    VXDSPAPI_RTA_CalcSpectrum(power.data(), 2 * half, bands.data(), 44100, 48, 1);
    const float *edges = nullptr;
    BandTables::select(48, &edges, nullptr, nullptr);
    int above = 0;
    for (size_t i = 0; i < bands.size(); ++i) {
        if (edges[i] < 22050.0F) continue;
        CHECK(bands[i] == 0.0F);
        ++above;
    }
    CHECK(above == 5);
}

TEST_CASE("a centre that falls exactly on a bin reads 0") {
    const std::vector<float> power(101, 1.0F);
    const float edges[] = {5.0F, 15.0F, 25.0F}, centres[] = {10.0F, 20.25F};
    float bands[2];
    VXDSPAPI_RTA_FFTToBands(power.data(), 100, edges, centres, 3, bands, 200, 0);
    CHECK(bands[0] == 0.0F);
    CHECK(bands[1] == 1.0F);
}

TEST_CASE("a band within one bin is the trapezoid between its edges") {
    const float power[] = {0.0F, 1.0F, 3.0F, 5.0F};
    const float edges[] = {1.25F, 1.75F}, centres[] = {1.5F};
    float band = 0.0F;
    VXDSPAPI_RTA_FFTToBands(power, 3, edges, centres, 2, &band, 6, 1);
    CHECK(band == 1.0F);  // half a bin wide, 2 high
}

TEST_CASE("bad sizes and rates write nothing") {
    const std::vector<float> power(3, 1.0F);
    float bands[11];
    for (float &band : bands) band = kUntouched;
    CHECK(VXDSPAPI_RTA_CalcSpectrum(power.data(), 0, bands, 48000, 1, 1) == 12);
    CHECK(VXDSPAPI_RTA_CalcSpectrum(power.data(), -4, bands, 48000, 1, 1) == 12);
    CHECK(VXDSPAPI_RTA_CalcSpectrum(power.data(), 4, bands, 0, 1, 1) == 12);
    CHECK(VXDSPAPI_RTA_CalcSpectrum(power.data(), 4, bands, -1, 1, 0) == 12);
    const float edges[] = {1.0F, 2.0F}, centres[] = {1.5F};
    VXDSPAPI_RTA_FFTToBands(power.data(), 2, edges, centres, 1, bands, 4, 1);
    VXDSPAPI_RTA_FFTToBands(power.data(), 2, edges, centres, 0, bands, 4, 1);
    VXDSPAPI_RTA_FFTToBands(power.data(), 2, edges, centres, -5, bands, 4, 1);
    for (const float band : bands) CHECK(band == kUntouched);
}

TEST_CASE("bands of a caller's table that begin below 0 Hz or nowhere keep what their slot holds") {
    const std::vector<float> power(101, 1.0F);
    const float edges[] = {-10.0F, 15.0F, NAN, 35.0F, 1e30F}, centres[] = {-1.0F, NAN, 30.5F, 40.5F};
    for (const int integrate : {0, 1}) {
        float bands[4] = {kUntouched, kUntouched, kUntouched, kUntouched};
        VXDSPAPI_RTA_FFTToBands(power.data(), 100, edges, centres, 5, bands, 200, integrate);
        CHECK(bands[0] == kUntouched);
        CHECK(bands[1] == kUntouched);
        CHECK(bands[3] != kUntouched);
    }
}
