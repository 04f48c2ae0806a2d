// SPDX-License-Identifier: MIT
//
// White, pink and plain sine sources against their formulas read one sample after the other.
#include <doctest/doctest.h>

#include <cmath>
#include <cstdint>
#include <random>
#include <thread>
#include <vector>

#include "measure/exact_sine.h"
#include "measure/thread_random.h"
#include "measure/white_noise.h"
#include "measure_sets.h"
#include "plain_generators.h"
#include "platform/thread_random.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

bool same(float a, float b) {
    return __builtin_bit_cast(uint32_t, a) == __builtin_bit_cast(uint32_t, b);
}

// Pink noise through a word of the test's own, so that no test hangs on what another one drew.
uint32_t pinkWord = 1;
uint32_t *testWord() noexcept {
    return &pinkWord;
}

struct OwnPinkWord {
    OwnPinkWord() {
        pinkWord = 1;
        installThreadRandom(testWord);
    }
    ~OwnPinkWord() { installThreadRandom(threadRandomWord); }
};

// Mean power around a frequency: 24 transforms of a few bins each, by the plain sum.
double powerAt(const std::vector<float> &signal, double hz, double rate) {
    constexpr int kLength = 16384;
    double power = 0.0;
    int sums = 0;
    for (size_t from = 0; from + kLength <= signal.size(); from += kLength) {
        for (const double bend : {0.89, 0.94, 1.0, 1.06, 1.12}) {
            const double step = 6.283185307179586 * std::round(hz * bend * kLength / rate) / kLength;
            double re = 0.0, im = 0.0, c = 1.0, s = 0.0;
            for (int i = 0; i < kLength; ++i) {
                const double window = 0.5 - 0.5 * std::cos(6.283185307179586 * i / kLength);
                re += signal[from + static_cast<size_t>(i)] * window * c;
                im += signal[from + static_cast<size_t>(i)] * window * s;
                const double turned = c * std::cos(step) - s * std::sin(step);
                s = s * std::cos(step) + c * std::sin(step);
                c = turned;
            }
            power += re * re + im * im;
            ++sums;
        }
    }
    return power / sums;
}

}  // namespace

TEST_CASE("white noise is the multiplicative generator of modulus 2^31 - 1, for any block lengths") {
    seedWhite(1);
    plain::White judge;
    std::mt19937 random(2);
    std::vector<float> block(512);
    for (int n = 0; n < 400; ++n) {
        const int count = static_cast<int>(random() % 513);
        fillWhite(block.data(), count);
        for (int i = 0; i < count; ++i) REQUIRE(same(block[static_cast<size_t>(i)], judge.next()));
    }
}

TEST_CASE("with white noise on, the mean of a block is close to +1.0 and no sample is negative") {
    std::vector<float> block(48000);
    fillWhite(block.data(), 48000);
    double sum = 0.0;
    for (const float sample : block) {
        REQUIRE(sample > 0.0F);
        REQUIRE(sample <= 2.0F);
        sum += sample;
    }
    CHECK(std::fabs(sum / 48000.0 - 1.0) < 0.02);
}

TEST_CASE("a white block of no samples draws nothing") {
    seedWhite(1);
    float sample = 0.5F, first = 0.0F;
    fillWhite(&sample, 0);
    fillWhite(&sample, -4);
    CHECK(sample == 0.5F);
    fillWhite(&first, 1);
    plain::White judge;
    CHECK(same(first, judge.next()));
}

TEST_CASE("pink noise has the bits of the plain recurrences for every block length and instruction set") {
    const OwnPinkWord own;
    onEachInstructionSet([] {
        pinkWord = 1;
        PinkNoiseGenerator pink;
        pink.create();
        plain::Pink judge;
        std::vector<float> block(520);
        for (int count = 0; count <= 512; ++count) {
            pink.generate(block.data(), 77, count);  // the offset isn't looked at
            for (int i = 0; i < count; ++i) REQUIRE(same(block[static_cast<size_t>(i)], judge.next()));
            for (int k = 0; k < 7; ++k) REQUIRE(same(pink.b[k], judge.b[k]));
        }
        CHECK(pinkWord == judge.x);
    });
}

TEST_CASE("pink noise goes on from any filter state as the plain recurrences do") {
    const OwnPinkWord own;
    onEachInstructionSet([] {
        for (const float state : {1e30F, -3e38F, 1e-40F, -1e-45F, INFINITY, NAN, -0.0F, 12345.678F}) {
            PinkNoiseGenerator pink;
            plain::Pink judge;
            judge.x = pinkWord;
            for (int k = 0; k < 7; ++k) pink.b[k] = judge.b[k] = k % 2 == 0 ? state : 0.0F;
            float block[100];
            pink.generate(block, 0, 100);
            for (const float sample : block) {
                const float expected = judge.next();
                REQUIRE((same(sample, expected) || (std::isnan(sample) && std::isnan(expected))));
            }
        }
    });
}

TEST_CASE("pink noise falls by 3 dB an octave, within half a decibel from 40 Hz to 16 kHz") {
    const OwnPinkWord own;
    PinkNoiseGenerator pink;
    pink.create();
    std::vector<float> signal(16384 * 300);
    for (size_t i = 0; i < signal.size(); i += 512) pink.generate(signal.data() + i, 0, 512);
    // Against the line through all octaves, so that the spread of a single one doesn't tilt it.
    std::vector<double> level;
    for (double hz = 40.0; hz <= 16000.0; hz *= std::sqrt(2.0)) level.push_back(10.0 * std::log10(powerAt(signal, hz, 48000.0)));
    double offset = 0.0;
    const double slope = -10.0 * std::log10(2.0) / 2.0;
    for (size_t i = 0; i < level.size(); ++i)
        offset += (level[i] - slope * static_cast<double>(i)) / static_cast<double>(level.size());
    for (size_t i = 0; i < level.size(); ++i) {
        CAPTURE(40.0 * std::pow(2.0, static_cast<double>(i) / 2.0));
        CHECK(std::fabs(level[i] - slope * static_cast<double>(i) - offset) < 0.5);
    }
}

TEST_CASE("each thread's pink sequence begins with seed 1, whatever other threads have drawn") {
    installThreadRandom(threadRandomWord);
    std::vector<float> first(300), second(300);
    auto draw = [](std::vector<float> &into) {
        PinkNoiseGenerator pink;
        pink.create();
        pink.generate(into.data(), 0, 100);
        pink.generate(into.data() + 100, 0, 200);
    };
    std::thread one([&] { draw(first); });
    one.join();
    std::thread two([&] { draw(second); });
    two.join();
    plain::Pink judge;
    for (size_t i = 0; i < first.size(); ++i) {
        const float expected = judge.next();
        REQUIRE(same(first[i], expected));
        REQUIRE(same(second[i], expected));
    }
}

TEST_CASE("a sine is the exact sine of a phase that grows by the step, in any block lengths") {
    onEachInstructionSet([] {
        for (const int hz : {1, 20, 997, 1000, 12000, 20000, 23999}) {
            SineGenerator sine;
            sine.create(48000);
            sine.setFrequency(hz, 48000);
            double phase = 0.0;
            std::vector<float> block(512);
            for (int count = 0; count <= 512; count += 1 + count / 5) {
                sine.generate(block.data(), 0, count);
                for (int i = 0; i < count; ++i) {
                    REQUIRE(same(block[static_cast<size_t>(i)], exactSine(phase)));
                    phase += sine.PhaseStep;
                }
                if (phase >= 628.3185307179587) phase = std::fmod(phase, 628.3185307179587);
                REQUIRE(sine.Phase == phase);
            }
        }
    });
}

TEST_CASE("a sine block writes from its offset on and nothing else") {
    SineGenerator sine;
    sine.create(48000);
    std::vector<float> block(64, 9.0F);
    sine.generate(block.data(), 10, 21);
    for (size_t i = 0; i < 64; ++i) CHECK((block[i] == 9.0F) == (i < 10 || i >= 31));
}

TEST_CASE("a new sine has 1000 Hz, the steps of its rate, and no step in use") {
    SineGenerator sine;
    sine.create(44100);
    CHECK(sine.SampleRate == 44100);
    CHECK(sine.Frequency == 1000);
    CHECK(sine.Phase == 0.0);
    CHECK(sine.CurrentStep == 0.0F);
    CHECK(sine.PhaseStep == static_cast<float>(1000 * 6.283185307179586 / 44100));
    CHECK(sine.MinStep == static_cast<float>(125.66370614359172 / 44100));
    CHECK(sine.MaxStep == static_cast<float>(125663.70614359173 / 44100));
    CHECK(sine.NyquistStep == static_cast<float>(3.141592653589793 / 44100));
}

TEST_CASE("a new rate keeps frequency and phase of a sine") {
    SineGenerator sine;
    sine.create(48000);
    float block[10];
    sine.setFrequency(440, 48000);
    sine.generate(block, 0, 10);
    const double phase = sine.Phase;
    sine.setSampleRate(96000);
    CHECK(sine.Phase == phase);
    CHECK(sine.Frequency == 440);
    CHECK(sine.PhaseStep == static_cast<float>(440 * 6.283185307179586 / 96000));
    CHECK(sine.MaxStep == static_cast<float>(125663.70614359173 / 96000));
}

TEST_CASE("setting a frequency at another rate takes the rate, and at the same rate leaves the limits alone") {
    SineGenerator sine;
    sine.create(48000);
    sine.MinStep = 0.0F;
    sine.setFrequency(500, 48000);
    CHECK(sine.MinStep == 0.0F);
    sine.setFrequency(500, 32000);
    CHECK(sine.SampleRate == 32000);
    CHECK(sine.MinStep == static_cast<float>(125.66370614359172 / 32000));
    CHECK(sine.PhaseStep == static_cast<float>(500 * 6.283185307179586 / 32000));
}

TEST_CASE("frequencies outside 20 to 20000 Hz are generated: the clamp shows only in a call without samples") {
    SineGenerator sine;
    sine.create(48000);
    sine.setFrequency(23000, 48000);
    float sample = 5.0F;
    sine.generate(&sample, 0, 1);
    CHECK(sine.CurrentStep == sine.PhaseStep);
    CHECK(sine.Phase == static_cast<double>(sine.PhaseStep));
    sine.generate(&sample, 0, 0);
    CHECK(sine.CurrentStep == sine.MaxStep);
    sine.setFrequency(1, 48000);
    sine.generate(&sample, 0, 1);
    CHECK(sine.CurrentStep == sine.PhaseStep);
    sine.generate(&sample, 0, -1);
    CHECK(sine.CurrentStep == sine.MinStep);
}

TEST_CASE("a sine whose phase stands just below 100 turns overruns them for a block and is then wrapped") {
    SineGenerator sine;
    sine.create(48000);
    sine.Phase = 628.3;
    std::vector<float> block(512);
    sine.generate(block.data(), 0, 512);
    double phase = 628.3;
    for (const float sample : block) {
        CHECK(same(sample, exactSine(phase)));
        phase += sine.PhaseStep;
    }
    CHECK(phase > 690.0);
    CHECK(sine.Phase == std::fmod(phase, 628.3185307179587));
}

TEST_CASE("the wrap is the exact remainder, also many times over the modulus") {
    SineGenerator sine;
    sine.create(48000);
    for (const double phase : {628.3185307179587, 1256.6370614359173, 1e6, 1.23456789e15, 1e300}) {
        sine.Phase = phase;
        float sample = 0.0F;
        sine.generate(&sample, 0, 0);
        CHECK(sine.Phase == std::fmod(phase, 628.3185307179587));
    }
    sine.Phase = INFINITY;
    float sample = 0.0F;
    sine.generate(&sample, 0, 1);
    CHECK(std::isnan(sine.Phase));
}
