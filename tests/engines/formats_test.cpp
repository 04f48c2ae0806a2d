// SPDX-License-Identifier: MIT
//
// Negotiation, layouts, and calls in every order.
#include <doctest/doctest.h>

#include "engine_rig.h"

TEST_CASE("layouts of the eight speakers at 8 to 192 kHz are supported and left as they are") {
    EngineRig rig;
    for (const uint32_t mask : {0x4u, 0x3u, 0x7u, 0x33u, 0x37u, 0x3Fu, 0x60Fu, 0x63Fu})
        for (const int rate : {8000, 11025, 44100, 48000, 96000, 192000}) {
            IOFormat tested = makeFormat(mask, rate);
            const IOFormat before = tested;
            IOFormat other = makeFormat(kStereo, 48000);
            CHECK(rig.module().isInputFormatSupported(rig.handle(), &tested, &other) == 0);
            CHECK(rig.module().isOutputFormatSupported(rig.handle(), &tested, &other) == 0);
            CHECK(std::memcmp(&tested, &before, sizeof tested) == 0);
        }
}

TEST_CASE("anything else is answered with stereo, 1 on the input side and 2 on the output side") {
    EngineRig rig;
    IOFormat other = makeFormat(kStereo, 48000);
    const auto check = [&](IOFormat tested) {
        for (const bool input : {true, false}) {
            IOFormat offered = tested;
            if (input)
                CHECK(rig.module().isInputFormatSupported(rig.handle(), &offered, &other) == 1);
            else
                CHECK(rig.module().isOutputFormatSupported(rig.handle(), &offered, &other) == 2);
            CHECK(offered.channels == 2);
            CHECK(offered.channelMask == 3);
            CHECK(offered.channelSlot[0] == 0);
            CHECK(offered.channelSlot[1] == 1);
            CHECK(offered.slotSpeaker[0] == 1);
            CHECK(offered.slotSpeaker[1] == 2);
            for (int slot = 2; slot < 8; ++slot) CHECK(offered.slotSpeaker[slot] == 0);
            CHECK(rig.module().isInputFormatSupported(rig.handle(), &offered, &other) == 0);
        }
    };
    check({});
    IOFormat format = makeFormat(kSevenOne, 48000);
    format.channels = 9;
    check(format);
    format = makeFormat(kSevenOne, 48000);
    format.channels = -1;
    check(format);
    format = makeFormat(kSevenOne, 48000);
    format.channels = 6;
    check(format);
    format = makeFormat(0x3, 48000);
    format.channelMask = 0;
    check(format);
    format = makeFormat(0x3, 48000);
    format.channelMask = 0xC0;
    check(format);
    check(makeFormat(0x3, 7999));
    check(makeFormat(0x3, 192001));
    check(makeFormat(0x3, -48000));
}

TEST_CASE("blocks ahead of any format, and behind an unsupported or an all-zero one, pass as they are") {
    EngineRig rig;
    setEverything(rig);
    const Stream in = testSignal(2000, 0.5F);
    CHECK(sameBits(in, rig.run(in)));
    CHECK(rig.setFormat(kStereo, 48000) == 0);
    CHECK_FALSE(sameBits(in, rig.run(in)));
    CHECK(rig.setFormat(kStereo, 1000) == 1);
    CHECK(sameBits(in, rig.run(in)));
    CHECK(rig.setFormat(kStereo, 48000) == 0);
    CHECK(rig.setFormat(0, 0) == 0);
    CHECK(sameBits(in, rig.run(in)));
}

TEST_CASE("blocks of no, negative and too many frames change nothing") {
    EngineRig rig;
    rig.setFormat(kStereo, 48000);
    setEverything(rig);
    const Stream in = testSignal(512, 0.5F);
    for (const int frames : {0, -1, -2147483647 - 1, 513, 2147483647}) {
        for (int slot = 0; slot < 8; ++slot) rig.buffer(slot) = in[slot];
        rig.block(frames);
        for (int slot = 0; slot < 8; ++slot) CHECK(sameBits(rig.buffer(slot), in[slot]));
    }
}

TEST_CASE("formats, components and parameters may come in any order") {
    const Stream in = testSignal(4000, 0.5F);
    const auto play = [&](const std::vector<int> &order) {
        EngineRig rig;
        for (const int what : order) {
            if (what == 0) rig.setFormat(kStereo, 48000);
            if (what == 1) setEverything(rig);
            if (what == 2) {
                constexpr uint32_t types[6] = {1, 3, 2, 0, 4, 5};
                for (int id = 0; id < 6; ++id) rig.module().createComponent(rig.handle(), types[id], id, 48000, 48000);
            }
        }
        return rig.run(in);
    };
    const Stream judge = play({0, 2, 1});
    for (const auto &order :
         std::vector<std::vector<int>>{{0, 1, 2}, {1, 0, 2}, {1, 2, 0}, {2, 0, 1}, {2, 1, 0}, {1, 0}, {0, 0, 1}})
        CHECK(sameBits(judge, play(order)));
}

TEST_CASE("mono goes to both front speakers, and speakers that the input lacks stay silent") {
    EngineRig rig;
    rig.setFormats(0x4, 0x3, 48000);
    const Stream in = testSignal(1000, 0.5F);
    Stream out = rig.run(in);
    CHECK(sameBits(out[0], in[2]));
    CHECK(sameBits(out[1], in[2]));
    rig.setFormats(0x3, 0x3F, 48000);
    out = rig.run(in);
    CHECK(sameBits(out[0], in[0]));
    CHECK(sameBits(out[1], in[1]));
    for (int slot = 2; slot < 6; ++slot)
        for (const float sample : out[slot]) REQUIRE(sample == 0.0F);
    CHECK(sameBits(out[6], in[6]));
}

TEST_CASE("every export takes a null handle and null pointers") {
    EngineModule module("SampleEngine");
    IOFormat format = makeFormat(kStereo, 48000);
    ProcessBuffers buffers = {};
    uint8_t byte = 1;
    module.free(nullptr);
    CHECK(module.isInputFormatSupported(nullptr, &format, &format) == 0);
    CHECK(module.isOutputFormatSupported(nullptr, &format, &format) == 0);
    CHECK(module.setIOFormat(nullptr, &format, &format) == 1);
    module.setInputGain(nullptr, 1.0F);
    module.createComponent(nullptr, 1, 0, 48000, 48000);
    module.disposeComponent(nullptr, 1, 0);
    module.clear(nullptr, 0);
    CHECK(module.setParameter(nullptr, 3, -12, 0, &byte, 1) == 0);
    CHECK(module.readWriteData(nullptr, 0, 0, nullptr, 0, &byte) == 0);
    module.process(nullptr, &buffers, &format, &format);
    module.record(nullptr, &buffers, &format);
    module.onIdle(nullptr);
    EngineRig rig;
    CHECK(module.setIOFormat(rig.handle(), nullptr, &format) == 1);
    CHECK(module.setIOFormat(rig.handle(), &format, nullptr) == 1);
    CHECK(module.isInputFormatSupported(rig.handle(), nullptr, nullptr) == 0);
    CHECK(module.readWriteData(rig.handle(), 0, 0, nullptr, 0, nullptr) == 0);
    module.process(rig.handle(), nullptr, &format, &format);
    module.process(rig.handle(), &buffers, &format, &format);
    module.process(rig.handle(), &buffers, &format, nullptr);
}
