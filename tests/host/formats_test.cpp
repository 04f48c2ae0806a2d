// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include "tests/support/host_instance.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Calls = std::vector<std::string>;

HostInstance::Options bare() {
    HostInstance::Options options;
    options.engine = "BareEngine";
    return options;
}

uint32_t setFormats(const HostInstance &host, IOFormat input, IOFormat output) {
    return VXDSPAPI_SetIOFormat(host.handle, &input, &output);
}

}  // namespace

TEST_CASE("the same formats twice: the second call returns 0 and doesn't reach the engine") {
    HostInstance host;
    host.engine().setFormatResult = 7;
    CHECK_EQ(setFormats(host, formatOf(0x3), formatOf(0x3)), 7);
    CHECK_EQ(host.context().sampleRate, 48000);
    host.engine().calls.clear();
    CHECK_EQ(setFormats(host, formatOf(0x3), formatOf(0x3)), 0);
    CHECK_EQ(host.engine().calls, Calls{});
}

TEST_CASE("formats that differ only in channelSlot count as unchanged") {
    HostInstance host;
    setFormats(host, formatOf(0x3), formatOf(0x3));
    IOFormat other = formatOf(0x3);
    other.channelSlot[1] = 5;
    host.engine().calls.clear();
    CHECK_EQ(setFormats(host, other, formatOf(0x3)), 0);
    CHECK_EQ(host.engine().calls, Calls{});
    CHECK_EQ(host.context().inputFormat.channelSlot[1], 1);
}

TEST_CASE("each of the four words of either side makes a change") {
    for (int word = 0; word < 8; ++word) {
        HostInstance host;
        IOFormat formats[2] = {formatOf(0x3), formatOf(0x3)};
        setFormats(host, formats[0], formats[1]);
        IOFormat &changed = formats[word / 4];
        switch (word % 4) {
            case 0:
                changed.channels = 1;
                break;
            case 1:
                changed.channelMask = 0x30;
                break;
            case 2:
                changed.frames = 240;
                break;
            default:
                changed.sampleRate = 44100;
                break;
        }
        host.engine().calls.clear();
        setFormats(host, formats[0], formats[1]);
        CHECK_EQ(host.engine().calls.size(), 1);
    }
}

TEST_CASE("the same formats offered again after blocks of another length count as a change") {
    HostInstance host;
    setFormats(host, formatOf(0x3), formatOf(0x3));
    Block block;
    host.process(block, formatOf(0x3, 100), formatOf(0x3, 100));
    host.engine().calls.clear();
    setFormats(host, formatOf(0x3), formatOf(0x3));
    CHECK_EQ(host.engine().calls, Calls{"SetIOFormat(2, 2)"});
}

TEST_CASE("an input query without an engine: stereo is supported, and frames come back as 512 in both records") {
    HostInstance host(bare());
    IOFormat tested = formatOf(0x3, 100);
    IOFormat other = formatOf(0x3F, 200);
    CHECK_EQ(VXDSPAPI_IsInputFormatSupported(host.handle, &tested, &other), 0);
    CHECK_EQ(tested.frames, 512);
    CHECK_EQ(other.frames, 512);
    CHECK_EQ(tested.channels, 2);
}

TEST_CASE("an output query without an engine: six channels return 2, rewritten to two channels and mask 3") {
    HostInstance host(bare());
    IOFormat tested = formatOf(0x3F);
    IOFormat other = formatOf(0x3);
    CHECK_EQ(VXDSPAPI_IsOutputFormatSupported(host.handle, &tested, &other), 2);
    CHECK_EQ(tested.channels, 2);
    CHECK_EQ(tested.channelMask, 3);
    CHECK_EQ(tested.channelSlot[1], 1);
    CHECK_EQ(tested.slotSpeaker[2], 0);
    IOFormat input = formatOf(0x4);
    CHECK_EQ(VXDSPAPI_IsInputFormatSupported(host.handle, &input, &other), 1);
    CHECK_EQ(input.channelMask, 3);
}

TEST_CASE("an engine that answers format queries has the last word, and sees 512 frames") {
    HostInstance host;
    host.engine().formatResult = 9;
    IOFormat tested = formatOf(0x3F, 7);
    IOFormat other = formatOf(0x3, 8);
    CHECK_EQ(VXDSPAPI_IsInputFormatSupported(host.handle, &tested, &other), 9);
    CHECK_EQ(VXDSPAPI_IsOutputFormatSupported(host.handle, &tested, &other), 9);
    CHECK_EQ(tested.channels, 6);
    CHECK_EQ(host.engine().calls, Calls{"Initialize", "IsInputFormatSupported(512, 512)", "IsOutputFormatSupported(512, 512)"});
}

TEST_CASE("component -1 changes both rates without touching outputFormat; the engine sees no call and maxComponentId stays") {
    HostInstance host;
    setFormats(host, formatOf(0x3), formatOf(0x3));
    host.context().silentFrames = 99;
    host.engine().calls.clear();
    VXDSPAPI_CreateComponent(host.handle, 0, -1, 96000, 32000);
    CHECK_EQ(host.context().sampleRate, 96000);
    CHECK_EQ(host.context().recordSampleRate, 32000);
    CHECK_EQ(host.context().outputFormat.sampleRate, 48000);
    CHECK_EQ(host.context().silentFrames, 0);
    CHECK_EQ(host.context().maxComponentId, 0);
    CHECK_EQ(host.engine().calls, Calls{});
    for (const SineGenerator &sine : host.context().sine) {
        CHECK_EQ(sine.SampleRate, 96000);
        CHECK_EQ(sine.Frequency, 1000);
    }
}

TEST_CASE("components reach the engine with both block functions held up, and the highest id is kept") {
    std::vector<int> held;  // outlives the host, whose end the engine sees too
    HostInstance host;
    setFormats(host, formatOf(0x3), formatOf(0x3));
    host.engine().calls.clear();
    host.engine().onControl = [&] {
        held.push_back(host.context().processStop);
        held.push_back(host.context().recordStop);
    };
    VXDSPAPI_CreateComponent(host.handle, 4, 9, 48000, 44100);
    VXDSPAPI_CreateComponent(host.handle, 3, 2, 48000, 44100);
    VXDSPAPI_DisposeComponent(host.handle, 4, 9);
    CHECK_EQ(host.engine().calls,
             Calls{"CreateComponent(4, 9, 48000, 44100)", "CreateComponent(3, 2, 48000, 44100)", "DisposeComponent(4, 9)"});
    CHECK_EQ(held, std::vector<int>{1, 1, 1, 1, 1, 1});
    CHECK_EQ(host.context().processStop, 0);
    CHECK_EQ(host.context().recordStop, 0);
    CHECK_EQ(host.context().maxComponentId, 9);
}

TEST_CASE("all-zero formats on a fresh context return 0 with no teardown and no engine call") {
    HostInstance host;
    host.engine().calls.clear();
    host.engine().setFormatResult = 3;
    CHECK_EQ(setFormats(host, IOFormat{}, IOFormat{}), 0);
    CHECK_EQ(host.engine().calls, Calls{});
}

TEST_CASE("all-zero formats after a format tear down without an engine call") {
    HostInstance host;
    setFormats(host, formatOf(0x3), formatOf(0x3));
    REQUIRE_NE(host.context().analyser[0].ring, nullptr);
    host.engine().calls.clear();
    CHECK_EQ(setFormats(host, IOFormat{}, IOFormat{}), 0);
    CHECK_EQ(host.engine().calls, Calls{});
    CHECK_EQ(host.context().analyser[0].ring, nullptr);
    CHECK_EQ(host.context().processFir.taps, nullptr);
    CHECK_EQ(host.context().sampleRate, 48000);
}

TEST_CASE("a format makes all measuring objects at its rates") {
    HostInstance::Options options;
    options.recordRate = 32000;
    HostInstance host(options);
    setFormats(host, formatOf(0x3, 480, 44100), formatOf(0x3, 480, 96000));
    const LibraryContext &context = host.context();
    CHECK_EQ(context.sampleRate, 96000);
    CHECK_EQ(context.analyser[0].capacity, 96000);
    CHECK_EQ(context.analyser[1].sampleRate, 96000);
    CHECK_EQ(context.analyser[2].sampleRate, 32000);
    CHECK_EQ(context.processFir.tapCount, 32);
    CHECK_EQ(context.recordFir[3].tapCount, 32);
    CHECK_EQ(context.sine[3].SampleRate, 96000);
    CHECK_EQ(context.sine[3].Frequency, 1000);
    for (const SweepGenerator &sweep : context.sweep) {
        CHECK_EQ(sweep.SampleRate, 96000);
        CHECK_EQ(sweep.StartFrequency, 20);
        CHECK_EQ(sweep.StopFrequency, 20000);
        CHECK_EQ(sweep.SweepTime, 10000);
        CHECK_EQ(sweep.PreDelay, 500.0F);
        CHECK_EQ(sweep.PostDelay, 500.0F);
        CHECK_EQ(sweep.BandsPerOctave, 3);
    }
    CHECK_EQ(context.polarityTone[7].HalfLength, 9600);
}

TEST_CASE("gain, clear and idle calls reach the engine") {
    HostInstance host;
    host.engine().calls.clear();
    VXDSPAPI_SetInputGain(host.handle, 0.5F);
    VXDSPAPI_Clear(host.handle, 3);
    VXDSPAPI_OnIdle(host.handle);
    CHECK_EQ(host.engine().calls, Calls{"SetInputGain(0.5)", "Clear(3)", "OnIdle"});
    host.context().initialised = 0;
    VXDSPAPI_Clear(host.handle, 3);
    VXDSPAPI_OnIdle(host.handle);
    VXDSPAPI_CreateComponent(host.handle, 1, 1, 1, 1);
    VXDSPAPI_DisposeComponent(host.handle, 1, 1);
    CHECK_EQ(host.engine().calls.size(), 3);
    host.context().initialised = 1;
}
