// SPDX-License-Identifier: MIT
//
// Nothing leaves the engine above full scale, and nothing that comes in breaks it.
#include <doctest/doctest.h>

#include <bit>
#include <limits>

#include "engine_rig.h"

namespace {

void checkBounded(const Stream &out, int channels = 8) {
    for (int slot = 0; slot < channels; ++slot)
        for (const float sample : out[slot]) REQUIRE(std::fabs(sample) <= 1.0F);
}

void setLoudest(EngineRig &rig) {
    rig.setInputGain(1000.0F);
    for (int component = 0; component < 4; ++component) rig.setFloat(component, -12, 1000.0F);
    for (int band = 1; band <= 10; ++band) rig.setBand(band, 1, 1000.0F, 0.5F, 1000.0F);
    rig.setOutputGain(1000.0F);
}

}  // namespace

TEST_CASE("no setting takes a full-scale square wave beyond full scale, with or without component 4") {
    for (const bool limiter : {true, false})
        for (const int period : {2, 3, 48, 480, 4800}) {
            EngineRig rig;
            rig.setFormat(kSevenOne, 48000);
            rig.setSwitch(4, -6, limiter);
            setLoudest(rig);
            Stream in = silence(24000);
            for (auto &plane : in)
                for (std::size_t frame = 0; frame < plane.size(); ++frame)
                    plane[frame] = static_cast<int>(frame) % period < period / 2 ? 1.0F : -1.0F;
            checkBounded(rig.run(in, randomCuts(9)));
        }
}

TEST_CASE("a full-scale square wave with 20 dB of input gain comes out at full scale, not above") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(10.0F);
    Stream in = silence(48000);
    for (auto &plane : in)
        for (std::size_t frame = 0; frame < plane.size(); ++frame) plane[frame] = frame / 24 % 2 == 0 ? 1.0F : -1.0F;
    const Stream out = rig.run(in);
    checkBounded(out, 2);
    CHECK(std::fabs(out[0][40000]) > 0.999F);
}

TEST_CASE("the limiter keeps the balance of the channels") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(4.0F);
    Stream in = sine(48000, 500.0, 48000.0, 0.8);
    for (float &sample : in[1]) sample *= 0.25F;
    const Stream out = rig.run(in);
    CHECK(std::fabs(amplitudeAt(out[1], 500.0, 48000.0) / amplitudeAt(out[0], 500.0, 48000.0) - 0.25) < 0.001);
}

TEST_CASE("component 4 stands ahead of the equaliser, as its position says, and can be switched off") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(4.0F);
    rig.setBand(6, 1, 1000.0F, 1.44F, -18.0F);
    const Stream in = sine(96000, 1000.0, 48000.0, 1.0);
    const double cut = std::pow(10.0, -18.0 / 20.0);
    CHECK(std::fabs(amplitudeAt(rig.run(in)[0], 1000.0, 48000.0) - cut) < 0.005);
    rig.setSwitch(4, -6, false);
    CHECK(std::fabs(amplitudeAt(rig.run(in)[0], 1000.0, 48000.0) - 4.0 * cut) < 0.005);
}

TEST_CASE("a limited sine stays a sine: the fundamental holds nearly all of its power") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(4.0F);
    const Stream out = rig.run(sine(96000, 1000.0, 48000.0, 1.0));
    CHECK(amplitudeAt(out[0], 1000.0, 48000.0) > 0.98);
    CHECK(amplitudeAt(out[0], 3000.0, 48000.0) < 0.01);
}

TEST_CASE("after something loud the gain returns to exactly one") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    Stream in = testSignal(48000 * 4, 0.5F);
    for (int frame = 0; frame < 4800; ++frame) in[0][frame] *= 16.0F;
    const Stream out = rig.run(in);
    CHECK_FALSE(sameBits(std::vector<float>(in[0].begin(), in[0].begin() + 9600),
                         std::vector<float>(out[0].begin(), out[0].begin() + 9600)));
    CHECK(sameBits(std::vector<float>(in[0].end() - 4800, in[0].end()), std::vector<float>(out[0].end() - 4800, out[0].end())));
}

TEST_CASE("NaN, infinities and denormals come out finite and bounded, and the engine recovers") {
    EngineRig rig;
    rig.setFormat(kSevenOne, 48000);
    setEverything(rig);
    Stream in = testSignal(48000 * 3, 0.4F);
    constexpr float kHostile[] = {std::numeric_limits<float>::quiet_NaN(),  std::numeric_limits<float>::infinity(),
                                  -std::numeric_limits<float>::infinity(),  std::numeric_limits<float>::max(),
                                  -std::numeric_limits<float>::max(),       std::numeric_limits<float>::denorm_min(),
                                  -std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::signaling_NaN()};
    std::mt19937 random(5);
    for (auto &plane : in)
        for (int frame = 0; frame < 24000; ++frame)
            if (random() % 3 == 0) plane[frame] = kHostile[random() % std::size(kHostile)];
    const Stream out = rig.run(in);
    checkBounded(out);

    EngineRig calm;
    calm.setFormat(kSevenOne, 48000);
    setEverything(calm);
    Stream quiet = in;
    for (auto &plane : quiet) std::fill(plane.begin(), plane.begin() + 24000, 0.0F);
    const Stream judge = calm.run(quiet);
    for (int slot = 0; slot < 8; ++slot)
        for (std::size_t frame = 48000 * 5 / 2; frame < out[slot].size(); ++frame)
            REQUIRE(std::fabs(out[slot][frame] - judge[slot][frame]) < 1e-5F);
}

TEST_CASE("the gain reduction readout tells what each channel asked for since the last reading") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(2.0F);
    Stream in = silence(4800);
    for (std::size_t frame = 0; frame < 4800; ++frame) in[0][frame] = frame / 24 % 2 == 0 ? 1.0F : -1.0F;
    rig.run(in);
    const auto read = [&] {
        std::array<uint8_t, 64> bytes = {};
        REQUIRE(rig.module().readWriteData(rig.handle(), 4, 0, nullptr, 0, bytes.data()) == 12);
        uint32_t count = 0;
        std::array<float, 2> values = {};
        std::memcpy(&count, bytes.data(), 4);
        std::memcpy(values.data(), bytes.data() + 4, 8);
        REQUIRE(count == 2);
        return values;
    };
    const auto first = read();
    CHECK(std::fabs(first[0] - 6.0206F) < 0.001F);
    CHECK(first[1] == 0.0F);
    CHECK(read()[0] == 0.0F);
    std::array<uint8_t, 64> bytes = {};
    CHECK(rig.module().readWriteData(rig.handle(), 4, 1, nullptr, 0, bytes.data()) == 0);
    CHECK(rig.module().readWriteData(rig.handle(), 4, -30, nullptr, 0, bytes.data()) == 0);
}
