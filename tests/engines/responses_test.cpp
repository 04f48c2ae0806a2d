// SPDX-License-Identifier: MIT
//
// What the sliders do to the sound, measured with sines.
#include <doctest/doctest.h>

#include "engine_rig.h"

namespace {

// The gain in dB at a frequency, in slot 0, on the same sine in all slots.
double responseAt(EngineRig &rig, double frequencyHz, double rate) {
    rig.module().clear(rig.handle(), 0);
    const int frames = static_cast<int>(rate);
    const Stream in = sine(frames, frequencyHz, rate, 0.05);
    const Stream out = rig.run(in);
    return decibels(amplitudeAt(out[0], frequencyHz, rate) / amplitudeAt(in[0], frequencyHz, rate));
}

}  // namespace

TEST_CASE("the 1 kHz band at +6 dB lifts 1 kHz by 6.0 dB within 0.1 at every usual rate") {
    for (const int rate : {44100, 48000, 96000, 192000}) {
        CAPTURE(rate);
        EngineRig rig;
        REQUIRE(rig.setFormat(kStereo, rate) == 0);
        rig.setSwitch(5, 115, true);
        REQUIRE(rig.setBand(6, 1, 1000.0F, 1.44F, 6.0F) == 13);
        CHECK(std::fabs(responseAt(rig, 1000.0, rate) - 6.0) < 0.1);
        CHECK(std::fabs(responseAt(rig, 100.0, rate)) < 0.1);
        CHECK(std::fabs(responseAt(rig, 10000.0, rate)) < 0.2);
    }
}

TEST_CASE("each of the ten bands reaches its gain at its frequency, up and down") {
    constexpr double frequencies[10] = {31, 62, 125, 250, 500, 1000, 2000, 4000, 8000, 16000};
    for (const float gain : {-18.0F, -6.0F, 3.0F, 18.0F}) {
        EngineRig rig;
        rig.setFormat(kStereo, 48000);
        for (int band = 1; band <= 10; ++band) {
            rig.setBand(band, 1, static_cast<float>(frequencies[band - 1]), 1.44F, gain);
            CAPTURE(band);
            CHECK(std::fabs(responseAt(rig, frequencies[band - 1], 48000.0) - gain) < 0.1);
            rig.setBand(band, 1, static_cast<float>(frequencies[band - 1]), 1.44F, 0.0F);
        }
    }
}

TEST_CASE("a boost and a cut of the same band cancel out") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setBand(1, 1, 700.0F, 1.0F, 9.0F);
    rig.setBand(2, 1, 700.0F, 1.0F, -9.0F);
    for (const double frequency : {100.0, 500.0, 700.0, 1000.0, 5000.0})
        CHECK(std::fabs(responseAt(rig, frequency, 48000.0)) < 0.01);
}

TEST_CASE("bass lifts the low end and leaves the middle and the top") {
    for (const int rate : {44100, 48000, 96000, 192000}) {
        CAPTURE(rate);
        EngineRig rig;
        rig.setFormat(kStereo, rate);
        rig.setBass(1.0F);
        CHECK(std::fabs(responseAt(rig, 25.0, rate) - 6.0) < 0.3);
        CHECK(std::fabs(responseAt(rig, 110.0, rate) - 3.0) < 0.2);
        CHECK(std::fabs(responseAt(rig, 1000.0, rate)) < 0.2);
        CHECK(std::fabs(responseAt(rig, 8000.0, rate)) < 0.1);
    }
}

TEST_CASE("voice lifts 1 to 4 kHz and leaves the low end") {
    for (const int rate : {44100, 48000, 96000, 192000}) {
        CAPTURE(rate);
        EngineRig rig;
        rig.setFormat(kStereo, rate);
        rig.setVoice(1.0F);
        CHECK(responseAt(rig, 1000.0, rate) > 2.5);
        CHECK(std::fabs(responseAt(rig, 2000.0, rate) - 6.02) < 0.1);
        CHECK(responseAt(rig, 4000.0, rate) > 2.5);
        CHECK(std::fabs(responseAt(rig, 60.0, rate)) < 0.2);
    }
}

TEST_CASE("detail lifts the treble and leaves the low end") {
    for (const int rate : {44100, 48000, 96000, 192000}) {
        CAPTURE(rate);
        EngineRig rig;
        rig.setFormat(kStereo, rate);
        rig.setDetail(1.0F);
        CHECK(std::fabs(responseAt(rig, 15000.0, rate) - 6.0) < 0.4);
        CHECK(std::fabs(responseAt(rig, 5000.0, rate) - 3.0) < 0.2);
        CHECK(std::fabs(responseAt(rig, 300.0, rate)) < 0.1);
    }
}

TEST_CASE("surround raises the side signal of each left and right pair and keeps the middle") {
    EngineRig rig;
    rig.setFormat(kSevenOne, 48000);
    rig.setSurround(1.0F);
    const Stream middle = sine(48000, 1000.0, 48000.0, 0.1);
    Stream side = middle;
    for (const int right : {1, 3, 5, 7})
        for (float &sample : side[right]) sample = -sample;

    const Stream middleOut = rig.run(middle);
    for (int slot = 0; slot < 8; ++slot) CHECK(sameBits(middle[slot], middleOut[slot]));

    rig.module().clear(rig.handle(), 0);
    const Stream sideOut = rig.run(side);
    for (const int slot : {0, 1, 4, 5, 6, 7}) {
        CAPTURE(slot);
        CHECK(std::fabs(decibels(amplitudeAt(sideOut[slot], 1000.0, 48000.0) / 0.1) - 6.0) < 0.2);
    }
    for (const int slot : {2, 3}) CHECK(sameBits(side[slot], sideOut[slot]));
}

TEST_CASE("input and output gain are linear factors, and their switches take them out") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setInputGain(0.5F);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0) - decibels(0.5)) < 0.001);
    rig.setSwitch(-1, -29, true);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0)) < 0.001);
    rig.setOutputGain(0.25F);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0) - decibels(0.25)) < 0.001);
    rig.setSwitch(-1, -30, true);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0)) < 0.001);
    rig.setSwitch(-1, -29, false);
    rig.setSwitch(-1, -30, false);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0) - decibels(0.125)) < 0.001);
}

TEST_CASE("a component that is switched off or disposed of leaves the sound, and comes back with its setting") {
    constexpr double heardAt[6] = {2000.0, 0.0, 15000.0, 25.0, 0.0, 500.0};
    for (const int component : {0, 2, 3, 5}) {
        CAPTURE(component);
        EngineRig rig;
        rig.setFormat(kStereo, 48000);
        if (component == 5)
            rig.setBand(5, 1, 500.0F, 1.0F, 6.0F);
        else
            rig.setFloat(component, -12, 1.0F);
        CHECK(responseAt(rig, heardAt[component], 48000.0) > 5.0);
        rig.setSwitch(component, -6, false);
        CHECK(std::fabs(responseAt(rig, heardAt[component], 48000.0)) < 0.001);
        rig.setSwitch(component, -6, true);
        CHECK(responseAt(rig, heardAt[component], 48000.0) > 5.0);
        rig.module().disposeComponent(rig.handle(), 0, static_cast<uint32_t>(component));
        CHECK(std::fabs(responseAt(rig, heardAt[component], 48000.0)) < 0.001);
        rig.module().createComponent(rig.handle(), 0, component, 48000, 48000);
        CHECK(responseAt(rig, heardAt[component], 48000.0) > 5.0);
    }
}

TEST_CASE("the equaliser switch takes all bands out") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    rig.setBand(6, 1, 1000.0F, 1.44F, 12.0F);
    rig.setSwitch(5, 115, false);
    CHECK(std::fabs(responseAt(rig, 1000.0, 48000.0)) < 0.001);
}

TEST_CASE("a band of another type, or beyond what the rate can hold, is neutral") {
    EngineRig rig;
    rig.setFormat(kStereo, 16000);
    rig.setBand(1, 0, 1000.0F, 1.44F, 12.0F);
    rig.setBand(2, 7, 1000.0F, 1.44F, 12.0F);
    rig.setBand(3, 1, 16000.0F, 1.44F, 12.0F);
    rig.setBand(4, 1, 0.0F, 1.44F, 12.0F);
    rig.setBand(5, 1, -500.0F, 1.44F, 12.0F);
    const Stream in = testSignal(4096, 0.5F);
    CHECK(sameBits(in, rig.run(in)));
}
