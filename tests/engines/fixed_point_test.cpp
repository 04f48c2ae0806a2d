// SPDX-License-Identifier: MIT
//
// The fixed-point build against the float build: 24-bit samples, left-justified in the words behind the same pointers.
#include <doctest/doctest.h>

#include <bit>

#include "engine_rig.h"

namespace {

int32_t toSample(float value) {
    return std::clamp(static_cast<int32_t>(value * 8388608.0F), -8388608, 8388607);
}

// What the host's adapter hands to a fixed-point engine; words travel in the bits of the stream's floats.
Stream toWords(const Stream &stream) {
    Stream words = stream;
    for (auto &plane : words)
        for (float &value : plane) value = std::bit_cast<float>(static_cast<uint32_t>(toSample(value)) << 8);
    return words;
}

int32_t fromWord(float word) {
    return std::bit_cast<int32_t>(word) >> 8;
}

Stream quantised(const Stream &stream) {
    Stream result = stream;
    for (auto &plane : result)
        for (float &value : plane) value = static_cast<float>(toSample(value)) * 1.1920929e-7F;
    return result;
}

}  // namespace

TEST_CASE("the fixed-point build equals the float build within one step of 24 bits, under each of its names") {
    const Stream in = quantised(testSignal(20000, 0.9F));
    EngineRig judge;
    judge.setFormat(kSevenOne, 48000);
    setEverything(judge);
    const Stream expected = judge.run(in);
    for (const char *name : {"SampleEngine.DSP.HiFi2", "SampleEngine.DSP.AIC326x", "Tarnlight.Orlo.DSP.HiFi2", "VXORHF64U"}) {
        CAPTURE(std::string(name));
        EngineRig rig(name);
        rig.setFormat(kSevenOne, 48000);
        setEverything(rig);
        const Stream out = rig.run(toWords(in), randomCuts(1));
        int64_t largest = 0;
        for (int slot = 0; slot < 8; ++slot)
            for (std::size_t frame = 0; frame < out[slot].size(); ++frame) {
                const int64_t difference = int64_t{fromWord(out[slot][frame])} - toSample(expected[slot][frame]);
                largest = std::max(largest, difference < 0 ? -difference : difference);
            }
        CHECK(largest <= 1);
    }
}

TEST_CASE("neutral and bypassed, the fixed-point build gives every sample back") {
    const Stream words = toWords(testSignal(5000, 2.0F));
    for (const bool bypass : {false, true}) {
        EngineRig rig("SampleEngine.DSP.HiFi2");
        rig.setFormat(kSevenOne, 48000);
        if (bypass) {
            setEverything(rig);
            rig.setBypass(true);
        }
        CHECK(sameBits(words, rig.run(words)));
    }
}

TEST_CASE("the fixed-point build keeps to both ends of the range") {
    EngineRig rig("VXORHF64U");
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(16.0F);
    Stream in = silence(4800);
    for (std::size_t frame = 0; frame < 4800; ++frame) in[0][frame] = frame / 24 % 2 == 0 ? 1.0F : -1.0F;
    const Stream out = rig.run(toWords(in));
    CHECK(fromWord(out[0][0]) == 8388607);
    CHECK(fromWord(out[0][24]) == -8388608);
    for (const float word : out[0]) REQUIRE((std::bit_cast<uint32_t>(word) & 0xFFu) == 0);
}

TEST_CASE("the fixed-point build keeps off slots that the host does not convert") {
    EngineRig rig("SampleEngine.DSP.HiFi2");
    rig.setFormat(0x60F, 48000);  // slots 6 and 7 lie beyond six channels
    setEverything(rig);
    const Stream words = toWords(testSignal(2000, 0.5F));
    const Stream out = rig.run(words);
    CHECK(sameBits(words[6], out[6]));
    CHECK(sameBits(words[7], out[7]));
    CHECK_FALSE(sameBits(words[0], out[0]));
}
