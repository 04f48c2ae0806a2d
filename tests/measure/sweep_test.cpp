// SPDX-License-Identifier: MIT
//
// The swept sine and the polarity tone, the two signals that a speaker is measured with.
#include <doctest/doctest.h>

#include <cmath>
#include <cstdint>
#include <vector>

#include "measure/band_tables.h"
#include "measure/exact_sine.h"
#include "measure_sets.h"
#include "plain_generators.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

bool same(float a, float b) {
    return __builtin_bit_cast(uint32_t, a) == __builtin_bit_cast(uint32_t, b);
}

// Runs a sweep in uneven blocks beside its plain form and compares samples and state.
void compare(SweepGenerator sweep, int samples) {
    SweepGenerator judge = sweep;
    std::vector<float> block(512);
    int count = 1;
    for (int done = 0; done < samples; done += count) {
        count = (count * 7 + 3) % 513;
        sweep.generate(block.data(), 0, count);
        for (int i = 0; i < count; ++i) REQUIRE(same(block[static_cast<size_t>(i)], plain::sweepSample(judge, exactSine)));
        REQUIRE(sweep.Position == judge.Position);
        REQUIRE(sweep.TablePosition == judge.TablePosition);
        REQUIRE(sweep.Phase == judge.Phase);
        REQUIRE(sweep.CurrentFrequency == judge.CurrentFrequency);
    }
}

}  // namespace

TEST_CASE("a sweep has the bits of its plain form through lead-in, run and the end of the table") {
    onEachInstructionSet([] {
        for (const int bands : {1, 3, 12, 48, -24}) {
            SweepGenerator sweep;
            sweep.arm(48000, 20, 20000, 600, 30.0F, 10.0F, bands);
            compare(sweep, 48000);
        }
    });
}

TEST_CASE("a sweep goes on for an hour past its end without losing a bit") {
    onEachInstructionSet([] {
        SweepGenerator sweep;
        sweep.arm(48000, 20, 20000, 100, 0.0F, 0.0F, 3);
        sweep.Phase = 3600.0 * 22000.0 * 6.283185307179586;
        sweep.TablePosition = sweep.TableSize - 2.5;
        compare(sweep, 20000);
        sweep.Phase = 1e12;
        compare(sweep, 2000);
    });
}

TEST_CASE("arming takes all numbers, truncates the times to samples and finds the span of the table") {
    SweepGenerator sweep;
    sweep.arm(44100, 20, 20000, 10000, 33.3F, 500.0F, 3);
    CHECK(sweep.SampleRate == 44100);
    CHECK(sweep.StartFrequency == 20);
    CHECK(sweep.StopFrequency == 20000);
    CHECK(sweep.SweepTime == 10000);
    CHECK(sweep.BandsPerOctave == 3);
    CHECK(sweep.RadiansPerHz == 6.283185307179586 / 44100);
    CHECK(sweep.PreDelaySamples == 1468);  // 1468.53
    CHECK(sweep.PostDelaySamples == 22050);
    CHECK(sweep.SweepSamples == 441000);
    CHECK(sweep.TotalSamples == 1468 + 22050 + 441000);
    CHECK(sweep.FadeStep == 1.0 / 1468);
    CHECK(sweep.FadePosition == 0);
    CHECK(sweep.Position == 0);
    CHECK(sweep.Phase == 0.0);
    CHECK(sweep.CurrentFrequency == 20.0);
    CHECK(sweep.TableSize == 35);
    CHECK(sweep.Table[sweep.FirstIndex] < 20.0F);
    CHECK(sweep.Table[sweep.FirstIndex + 1] > 20.0F);
    const int last = sweep.FirstIndex + sweep.IndexSpan - 1;
    CHECK(sweep.Table[last] < 20000.0F);
    CHECK(sweep.Table[last + 1] > 20000.0F);
    CHECK(sweep.TablePosition == sweep.FirstIndex);
    CHECK(sweep.TableStep == (sweep.IndexSpan - 1) / 441000.0);
}

TEST_CASE("after its sweep time a sweep stands at the entry below its stop frequency") {
    SweepGenerator sweep;
    sweep.arm(48000, 20, 20000, 1000, 0.0F, 0.0F, 3);
    std::vector<float> block(48000);
    sweep.generate(block.data(), 0, 48000);
    CHECK(std::fabs(sweep.TablePosition - (sweep.FirstIndex + sweep.IndexSpan - 1)) < 1e-9);
}

TEST_CASE("a stop frequency above the last entry makes the sweep walk down from its start to index 0 and stay there") {
    onEachInstructionSet([] {
        SweepGenerator sweep;
        sweep.arm(48000, 20, 23000, 1000, 0.0F, 0.0F, 3);
        CHECK(sweep.IndexSpan == 0);
        CHECK(sweep.TableStep == -1.0 / 48000);
        compare(sweep, 20000);
        sweep.TableStep = -0.01;
        compare(sweep, 4000);
        std::vector<float> block(4000);
        sweep.generate(block.data(), 0, 4000);
        CHECK(sweep.TablePosition == 0.0);
        CHECK(sweep.CurrentFrequency == sweep.Table[0]);
    });
}

TEST_CASE("a start frequency below or above the whole table starts at index 0") {
    SweepGenerator sweep;
    sweep.arm(48000, 1, 20000, 1000, 0.0F, 0.0F, 3);
    CHECK(sweep.FirstIndex == 0);
    sweep.arm(48000, 23500, 20000, 1000, 0.0F, 0.0F, 3);
    CHECK(sweep.FirstIndex == 0);
}

TEST_CASE("a sweep without a lead-in has no lead-in samples, an infinite fade step and sounds at once") {
    SweepGenerator sweep;
    sweep.arm(48000, 1000, 20000, 1000, 0.0F, 0.0F, 3);
    CHECK(sweep.PreDelaySamples == 0);
    CHECK(std::isinf(sweep.FadeStep));
    float block[4];
    sweep.generate(block, 0, 4);
    CHECK(block[0] == 0.0F);
    CHECK(block[1] != 0.0F);
}

TEST_CASE("negative delays are none") {
    SweepGenerator sweep;
    sweep.arm(48000, 20, 20000, 1000, -5.0F, -1.0F, 3);
    CHECK(sweep.PreDelay == 0.0F);
    CHECK(sweep.PostDelay == 0.0F);
    CHECK(sweep.PreDelaySamples == 0);
    CHECK(sweep.PostDelaySamples == 0);
}

TEST_CASE("absurd arguments of a sweep stay inside its table") {
    for (const int time : {0, -1000, INT32_MAX, INT32_MIN}) {
        for (const float delay : {0.0F, 1e30F, INFINITY, NAN}) {
            for (const int rate : {48000, 1, 0, -48000}) {
                SweepGenerator sweep;
                sweep.arm(rate, -5, 20000, time, delay, delay, 48);
                sweep.Position = sweep.PreDelaySamples;
                std::vector<float> block(300);
                sweep.generate(block.data(), 0, 300);
                CHECK(sweep.TablePosition >= 0.0);
                CHECK(sweep.TablePosition <= sweep.TableSize - 2);
            }
        }
    }
}

TEST_CASE("a sweep block without samples changes nothing") {
    SweepGenerator sweep;
    sweep.arm(48000, 20, 20000, 1000, 0.0F, 0.0F, 3);
    float sample = 7.0F;
    sweep.generate(&sample, 0, 0);
    sweep.generate(&sample, 0, -1);
    CHECK(sample == 7.0F);
    CHECK(sweep.Position == 0);
    CHECK(sweep.Phase == 0.0);
}

TEST_CASE("a polarity tone is a slow negative swell, a flip to +1.0 and a decay") {
    PolarityToneGenerator tone;
    tone.arm(48000, 100.0F);
    CHECK(tone.HalfLength == 4800);
    CHECK(tone.GrowthFactor == 2.0F - tone.DecayFactor);
    CHECK(tone.PeakIndex == -1);
    std::vector<float> signal(9600);
    CHECK(tone.generate(signal.data(), 0, 9600) == 1);
    CHECK(tone.PeakIndex == 4800);
    CHECK(signal[0] == -1e-5F * tone.GrowthFactor);
    for (size_t i = 1; i < 4800; ++i) REQUIRE(same(signal[i], signal[i - 1] * tone.GrowthFactor));
    CHECK(std::fabs(signal[4799] + 1.0F) < 0.05F);
    CHECK(signal[4800] == 1.0F);
    for (size_t i = 4801; i < 9600; ++i) REQUIRE(same(signal[i], signal[i - 1] * tone.DecayFactor));
    CHECK(std::fabs(signal[9599] - 1e-5F) < 1e-6F);
    CHECK(tone.generate(signal.data(), 0, 512) == 0);
}

TEST_CASE("a tone that ends in mid-block writes one zero and leaves the rest of the block alone") {
    PolarityToneGenerator tone;
    tone.arm(1000, 10.0F);
    std::vector<float> block(40, 3.0F);
    CHECK(tone.generate(block.data(), 0, 40) == 0);
    CHECK(tone.Value == 0.0F);
    CHECK(block[20] == 0.0F);
    for (size_t i = 21; i < 40; ++i) CHECK(block[i] == 3.0F);
    CHECK(block[19] > 0.0F);
}

TEST_CASE("a tone armed with 0 milliseconds writes one zero sample and has ended") {
    PolarityToneGenerator tone;
    tone.arm(48000, 0.0F);
    CHECK(tone.HalfLength == 0);
    CHECK(tone.DecayFactor == 1.0F);
    CHECK(tone.GrowthFactor == 1.0F);
    float block[3] = {5.0F, 5.0F, 5.0F};
    CHECK(tone.generate(block, 0, 3) == 0);
    CHECK(block[0] == 0.0F);
    CHECK(block[1] == 5.0F);
}

TEST_CASE("a tone block without samples leaves the buffer and says that the tone lasts") {
    PolarityToneGenerator tone;
    tone.arm(48000, 0.0F);
    float sample = 5.0F;
    CHECK(tone.generate(&sample, 0, 0) == 1);
    CHECK(sample == 5.0F);
}

TEST_CASE("a new tone is armed for 100 ms") {
    PolarityToneGenerator created, armed;
    for (const int rate : {8000, 44100, 48000, 96000, 192000}) {
        created.create(rate);
        armed.arm(rate, 100.0F);
        CHECK(created.HalfLength == armed.HalfLength);
        CHECK(same(created.DecayFactor, armed.DecayFactor));
        CHECK(same(created.Value, armed.Value));
        CHECK(__builtin_bit_cast(uint32_t, created.Value) == 0xB727C5ACu);
    }
}

TEST_CASE("the decay factor of a tone brings 1.0 down to 1e-5 over its half length") {
    for (const float ms : {1.0F, 10.0F, 64.0F, 250.0F}) {
        PolarityToneGenerator tone;
        tone.arm(48000, ms);
        const double after = std::pow(static_cast<double>(tone.DecayFactor), tone.HalfLength);
        CHECK(std::fabs(std::log(after / 1e-5)) < 0.01);
    }
}

TEST_CASE("absurd arguments of a tone end it or let it run, and stay inside the block") {
    for (const float ms : {-1.0F, 1e30F, INFINITY, NAN, 1e-20F}) {
        for (const int rate : {48000, 0, -1, INT32_MAX}) {
            PolarityToneGenerator tone;
            tone.arm(rate, ms);
            std::vector<float> block(64, 2.0F);
            const int lasts = tone.generate(block.data(), 0, 64);
            CHECK((lasts == 0 || tone.Position == 64));
        }
    }
}
