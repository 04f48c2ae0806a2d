// SPDX-License-Identifier: MIT
//
// Changes glide, and the cut of a stream into blocks is inaudible to the last bit.
#include <doctest/doctest.h>

#include "engine_rig.h"

namespace {

struct Step {
    const char *what;
    void (*apply)(EngineRig &, bool up);
};

const Step kSteps[] = {
    {"input gain", [](EngineRig &rig, bool up) { rig.setInputGain(up ? 2.0F : 0.1F); }},
    {"output gain", [](EngineRig &rig, bool up) { rig.setOutputGain(up ? 2.0F : 0.1F); }},
    {"voice", [](EngineRig &rig, bool up) { rig.setVoice(up ? 4.0F : 0.0F); }},
    {"surround", [](EngineRig &rig, bool up) { rig.setSurround(up ? 4.0F : 0.0F); }},
    {"detail", [](EngineRig &rig, bool up) { rig.setDetail(up ? 4.0F : 0.0F); }},
    {"bass", [](EngineRig &rig, bool up) { rig.setBass(up ? 2.0F : 0.0F); }},
    {"band gain", [](EngineRig &rig, bool up) { rig.setBand(4, 1, 200.0F, 1.44F, up ? 12.0F : -12.0F); }},
    {"band frequency", [](EngineRig &rig, bool up) { rig.setBand(5, 1, up ? 8000.0F : 100.0F, 3.0F, 12.0F); }},
    {"band quality", [](EngineRig &rig, bool up) { rig.setBand(6, 1, 200.0F, up ? 10.0F : 0.3F, 12.0F); }},
    {"equaliser", [](EngineRig &rig, bool up) { rig.setSwitch(5, 115, up); }},
    {"limiter", [](EngineRig &rig, bool up) { rig.setSwitch(4, -6, up); }},
    {"bass enable", [](EngineRig &rig, bool up) { rig.setSwitch(3, -6, up); }},
    {"bypass", [](EngineRig &rig, bool up) { rig.setBypass(up); }},
    {"power", [](EngineRig &rig, bool up) { rig.setPower(up); }},
    {"input gain switch", [](EngineRig &rig, bool up) { rig.setSwitch(-1, -29, up); }},
    {"output gain switch", [](EngineRig &rig, bool up) { rig.setSwitch(-1, -30, up); }},
};

double largestJump(const Stream &stream) {
    double largest = 0.0;
    for (int slot = 0; slot < 2; ++slot)
        for (std::size_t frame = 1; frame < stream[slot].size(); ++frame)
            largest = std::max(largest, std::fabs(static_cast<double>(stream[slot][frame]) - stream[slot][frame - 1]));
    return largest;
}

}  // namespace

TEST_CASE("no parameter clicks when it is stepped during play") {
    // A full-scale sine of 200 Hz moves by at most 0.026 a frame at 48 kHz; a click is many times as large.
    for (const Step &step : kSteps) {
        CAPTURE(std::string(step.what));
        EngineRig rig;
        rig.setFormat(kStereo, 48000);
        rig.setBass(0.5F);
        rig.setInputGain(0.7F);
        rig.setOutputGain(0.5F);
        rig.setBand(1, 1, 200.0F, 1.0F, 6.0F);
        Stream in = sine(96000, 200.0, 48000.0, 0.3);
        for (float &sample : in[1]) sample *= -0.8F;
        bool up = false;
        const Stream out = rig.run(in, evenCuts(480), [&](int position) {
            if (position % 4800 == 2400) step.apply(rig, up = !up);
        });
        CHECK(largestJump(out) < 0.05);
        // The step is heard at all.
        CHECK_FALSE(sameBits(out[0], in[0]));
    }
}

TEST_CASE("random block cuts change no bit while parameters change, whatever the layout") {
    for (const uint32_t mask : {0x4u, 0x3u, 0x3Fu, kSevenOne}) {
        CAPTURE(mask);
        const Stream in = testSignal(48000, 1.5F);
        // Changes come at fixed frames: every cut list stops there.
        const auto play = [&](uint32_t seed) {
            EngineRig rig;
            rig.setFormat(mask, 48000);
            int position = 0;
            std::mt19937 random(seed);
            const Cuts cuts = [&] {
                const int wanted = seed == 0 ? 500 : static_cast<int>(random() % 512 + 1);
                const int count = std::min(wanted, 1500 - position % 1500);
                position += count;
                return count;
            };
            return rig.run(in, cuts, [&](int now) {
                if (now % 1500 != 0) return;
                const auto &step = kSteps[static_cast<std::size_t>(now / 1500) % std::size(kSteps)];
                step.apply(rig, (now / 1500) % 3 != 0);
            });
        };
        const Stream judge = play(0);
        for (const uint32_t seed : {1u, 2u, 3u, 4u}) {
            CAPTURE(seed);
            CHECK(sameBits(judge, play(seed)));
        }
    }
}

TEST_CASE("a parameter written again with the same value changes nothing") {
    const Stream in = testSignal(20000, 0.8F);
    EngineRig once;
    once.setFormat(kStereo, 48000);
    setEverything(once);
    EngineRig often;
    often.setFormat(kStereo, 48000);
    setEverything(often);
    CHECK(sameBits(once.run(in), often.run(in, evenCuts(64), [&](int) { setEverything(often); })));
}
