// SPDX-License-Identifier: MIT
//
// The simulated chain of vx measure, looked at from inside: harmonics of a sine are those that were asked for and fold nowhere, and
// delay, gain, band and noise are what they say.
#include <doctest/doctest.h>

#include <cmath>
#include <complex>
#include <numbers>

#include "measure/band_tables.h"
#include "tools/vx/failure.h"
#include "tools/vx_measure/band_grid.h"
#include "tools/vx_measure/plant.h"

namespace {

constexpr int kRate = 48000;

std::vector<float> throughPlant(const std::string &parts, const std::vector<float> &input, uint32_t seed = 1) {
    vx::Plant plant(vx::parsePlant(parts, kRate), kRate, seed);
    std::vector<float> output(input.size());
    // In two pieces, as blocks come.
    const size_t cut = input.size() / 3;
    plant.process(input.data(), output.data(), cut);
    plant.process(input.data() + cut, output.data() + cut, input.size() - cut);
    return output;
}

std::vector<float> sine(double hz, size_t count) {
    std::vector<float> samples;
    for (size_t i = 0; i < count; ++i)
        samples.push_back(static_cast<float>(std::sin(2.0 * std::numbers::pi * hz * static_cast<double>(i) / kRate)));
    return samples;
}

// The amplitude at a frequency over the last second, of which it has a whole number of turns.
double amplitudeAt(const std::vector<float> &samples, double hz) {
    std::complex<double> sum = 0.0;
    const size_t first = samples.size() - kRate;
    for (size_t i = 0; i < kRate; ++i)
        sum += static_cast<double>(samples[first + i]) *
               std::polar(1.0, -2.0 * std::numbers::pi * hz * static_cast<double>(i) / kRate);
    return 2.0 * std::abs(sum) / kRate;
}

}  // namespace

TEST_CASE("the shaper gives a sine of full scale exactly the harmonics that were asked for") {
    for (const double hz : {50.0, 997.0, 3000.0}) {
        CAPTURE(hz);
        const std::vector<float> heard = throughPlant("h2=-40dB,h3=-50dB,h5=-60dB", sine(hz, 3 * kRate));
        CHECK(amplitudeAt(heard, hz) == doctest::Approx(1.0).epsilon(0.001));
        CHECK(amplitudeAt(heard, 2 * hz) == doctest::Approx(0.01).epsilon(0.01));
        CHECK(amplitudeAt(heard, 3 * hz) == doctest::Approx(0.0031623).epsilon(0.01));
        CHECK(amplitudeAt(heard, 4 * hz) < 1e-5);
        CHECK(amplitudeAt(heard, 5 * hz) == doctest::Approx(0.001).epsilon(0.01));
    }
}

TEST_CASE("harmonics beyond half the sample rate are gone and do not fold back") {
    const std::vector<float> heard = throughPlant("h2=-20dB,h3=-20dB", sine(11000, 3 * kRate));
    CHECK(amplitudeAt(heard, 22000) > 0.02);    // in the filter's slope
    CHECK(amplitudeAt(heard, 15000) < 0.0001);  // where 33 kHz would fold to
    const std::vector<float> higher = throughPlant("h2=-20dB", sine(15000, 3 * kRate));
    CHECK(amplitudeAt(higher, 18000) < 0.0001);
}

TEST_CASE("delay, gain and polarity of the plant are exact, and silence stays silence") {
    std::vector<float> click(4800, 0.0F);
    click[10] = 0.5F;
    const std::vector<float> heard = throughPlant("delay=12ms,gain=-6dB,invert", click);
    CHECK(heard[10 + 576] == doctest::Approx(-0.5 * std::pow(10.0, -0.3)));
    double rest = 0.0;
    for (size_t i = 0; i < heard.size(); ++i) rest += i == 586 ? 0.0 : std::fabs(static_cast<double>(heard[i]));
    CHECK(rest == 0.0);
    CHECK(throughPlant("", click) == click);
    for (const float sample : throughPlant("h2=-10dB,h4=-10dB", std::vector<float>(4800, 0.0F))) REQUIRE(sample == 0.0F);
}

TEST_CASE("the band of the plant has its corners 3 dB down, and its noise the stated power and seed") {
    CHECK(amplitudeAt(throughPlant("band=200-5000", sine(200, 3 * kRate)), 200) == doctest::Approx(0.7071).epsilon(0.005));
    CHECK(amplitudeAt(throughPlant("band=200-5000", sine(5000, 3 * kRate)), 5000) == doctest::Approx(0.7071).epsilon(0.005));
    CHECK(amplitudeAt(throughPlant("band=200-5000", sine(1000, 3 * kRate)), 1000) == doctest::Approx(1.0).epsilon(0.01));
    CHECK(amplitudeAt(throughPlant("band=200-5000", sine(20, 3 * kRate)), 20) == doctest::Approx(0.01).epsilon(0.05));
    const std::vector<float> silence(kRate, 0.0F);
    const std::vector<float> noise = throughPlant("noise=-40dB", silence);
    double square = 0.0;
    for (const float sample : noise) square += static_cast<double>(sample) * static_cast<double>(sample) / kRate;
    CHECK(std::sqrt(square) == doctest::Approx(0.01).epsilon(0.02));
    CHECK(noise == throughPlant("noise=-40dB", silence));
    CHECK(noise != throughPlant("noise=-40dB", silence, 2));
}

TEST_CASE("parts that are none end in a usage error that names the part and what is expected") {
    for (const char *parts : {"delay",
                              "delay=",
                              "delay=12",
                              "delay=-1ms",
                              "delay=1001ms",
                              "delay=nanms",
                              "gain=6",
                              "gain=41dB",
                              "gain=xdB",
                              "invert=1",
                              "h1=-40dB",
                              "h=-40dB",
                              "h10=-40dB",
                              "h2=1dB",
                              "h2=-40",
                              "band=80",
                              "band=80-",
                              "band=0-100",
                              "band=100-80",
                              "band=80-24000",
                              "noise=1dB",
                              "hum=3",
                              "",
                              "delay=1ms,,gain=0dB",
                              "gain=0dB,gain=0dB",
                              "h2=-40dB,H2=-40dB"}) {
        CAPTURE(parts);
        if (*parts == '\0') {
            CHECK(vx::parsePlant(parts, kRate).harmonics.empty());
            continue;
        }
        bool failed = false;
        try {
            vx::parsePlant(parts, kRate);
        } catch (const vx::Failure &failure) {
            failed = failure.status == vx::ExitStatus::usage && std::string(failure.what()).find("expected") != std::string::npos;
        }
        CHECK(failed);
    }
}

TEST_CASE("the bands that vx names are those in which the library measures") {
    for (const int n : {1, 3, 6, 12, 24, 48}) {
        CAPTURE(n);
        const vx::BandGrid grid = vx::makeBandGrid(n);
        const float *edges = nullptr, *centres = nullptr;
        int size = 0;
        vxcomn::BandTables::select(n, &edges, &centres, &size);
        REQUIRE(grid.edges.size() == static_cast<size_t>(size));
        REQUIRE(grid.bands() == size - 1);
        for (int i = 0; i < size; ++i)
            CHECK(grid.edges[static_cast<size_t>(i)] == doctest::Approx(static_cast<double>(edges[i])).epsilon(1e-6));
        for (int i = 0; i + 1 < size; ++i)
            CHECK(grid.centres[static_cast<size_t>(i)] == doctest::Approx(static_cast<double>(centres[i])).epsilon(1e-6));
    }
}
