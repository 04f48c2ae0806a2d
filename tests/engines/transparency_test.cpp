// SPDX-License-Identifier: MIT
//
// When the engine leaves the samples alone, to the bit.
#include <doctest/doctest.h>

#include <limits>

#include "engine_rig.h"

TEST_CASE("neutral settings change no bit up to full scale, at every rate and layout") {
    for (const int rate : {8000, 44100, 48000, 96000, 192000})
        for (const uint32_t mask : {0x4u, 0x3u, 0x33u, 0x3Fu, 0x60Fu, 0x63Fu}) {
            CAPTURE(rate);
            CAPTURE(mask);
            EngineRig rig;
            REQUIRE(rig.setFormat(mask, rate) == 0);
            Stream in = testSignal(3000, 1.0F);
            in[0][100] = 1.0F;
            in[1][100] = -1.0F;
            in[0][200] = -0.0F;
            CHECK(sameBits(in, rig.run(in)));
        }
}

TEST_CASE("bypass gives the input back bit for bit from the first block on, whatever it holds") {
    for (const bool byPower : {false, true}) {
        EngineRig rig;
        rig.setFormat(kSevenOne, 48000);
        setEverything(rig);
        if (byPower)
            rig.setPower(false);
        else
            rig.setBypass(true);
        Stream in = testSignal(5000, 3.0F);
        in[0][10] = std::numeric_limits<float>::quiet_NaN();
        in[1][11] = std::numeric_limits<float>::infinity();
        in[2][12] = std::numeric_limits<float>::denorm_min();
        CHECK(sameBits(in, rig.run(in, randomCuts(3))));
    }
}

TEST_CASE("bypass in the middle of a stream gives the input back bit for bit after 20 ms, and the effects return") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    setEverything(rig);
    const Stream in = testSignal(30000, 0.3F);
    const Stream out = rig.run(in, evenCuts(100), [&](int position) {
        if (position == 10000) rig.setBypass(true);
        if (position == 20000) rig.setBypass(false);
    });
    int lastChanged = 0;
    for (int frame = 0; frame < 20000; ++frame)
        if (in[0][frame] != out[0][frame]) lastChanged = frame;
    CHECK(lastChanged >= 10000);
    CHECK(lastChanged <= 10000 + 960);
    int changed = 0;
    for (int frame = 22000; frame < 30000; ++frame) changed += in[0][frame] != out[0][frame] ? 1 : 0;
    CHECK(changed > 7000);
}

TEST_CASE("channels that the layout does not have stay as they are") {
    EngineRig rig;
    rig.setFormat(0x33, 48000);
    setEverything(rig);
    const Stream in = testSignal(2000, 0.5F);
    const Stream out = rig.run(in);
    for (const int slot : {2, 3, 6, 7}) CHECK(sameBits(in[slot], out[slot]));
    for (const int slot : {0, 1, 4, 5}) CHECK_FALSE(sameBits(in[slot], out[slot]));
}

TEST_CASE("the engine has no latency: an impulse comes out in the frame in which it went in") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    setEverything(rig);
    Stream in = silence(512);
    in[0][100] = 0.5F;
    const Stream out = rig.run(in);
    for (int frame = 0; frame < 100; ++frame) REQUIRE(out[0][frame] == 0.0F);
    CHECK(std::fabs(out[0][100]) > 0.1F);
}

TEST_CASE("Clear forgets the past") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    setEverything(rig);
    const Stream in = testSignal(3000, 0.9F);
    const Stream first = rig.run(in);
    CHECK_FALSE(sameBits(first, rig.run(in)));
    rig.module().clear(rig.handle(), 0);
    CHECK(sameBits(first, rig.run(in)));
}

TEST_CASE("a format set again forgets the past and keeps the settings") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    setEverything(rig);
    const Stream in = testSignal(3000, 0.9F);
    const Stream first = rig.run(in);
    rig.setFormat(kStereo, 44100);
    CHECK_FALSE(sameBits(first, rig.run(in)));
    rig.setFormat(kStereo, 48000);
    CHECK(sameBits(first, rig.run(in)));
}
