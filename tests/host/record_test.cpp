// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>
#include <xmmintrin.h>

#include <cmath>

#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const IOFormat kStereo = formatOf(0x3);
const IOFormat kEight = formatOf(0x63F);

void record(const HostInstance &host, Block &block, IOFormat format) {
    VXDSPAPI_Record(host.handle, &block.buffers, &format);
}

void recordSilence(const HostInstance &host, int frames) {
    for (int done = 0; done < frames; done += 480) {
        Block block;
        IOFormat format = kStereo;
        format.frames = frames - done < 480 ? frames - done : 480;
        record(host, block, format);
    }
}

// A block with a peak and, one sample on, half of it the other way round.
Block impulseAt(int frame, float peak) {
    Block block;
    block.slot(0)[frame] = peak;
    block.slot(0)[frame + 1] = -0.5F * peak;
    return block;
}

}  // namespace

TEST_CASE("a format with eight channels measures the first four only and still passes eight to the engine") {
    HostInstance host;
    host.setFormat(kEight);
    for (uint8_t c = 0; c < 8; ++c) command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, c, 20));
    for (int i = 0; i < 4; ++i) host.context().recordFirEnable[i] = 1;
    int channels = 0;
    int calls = 0;
    host.engine().onRecord = [&](VXEngineHandle, ProcessBuffers *, IOFormat *format) {
        channels = format->channels;
        ++calls;
    };
    for (int i = 0; i < 3; ++i) {
        Block block;
        record(host, block, kEight);
    }
    Block block;
    for (int c = 0; c < 8; ++c) {
        block.slot(c)[10] = 1.0F;
        block.slot(c)[11] = -0.5F;
    }
    record(host, block, kEight);
    CHECK_EQ(channels, 8);
    CHECK_EQ(calls, 4);
    for (uint8_t c = 0; c < 8; ++c) CHECK_EQ(command(host, VXDSP_DATA_POLARITY_RESULT, {c}).at<int32_t>(0), c < 4 ? 1 : 0);
    CHECK_EQ(host.context().recordMeterChannels, 4);
    CHECK_EQ(host.context().recordPeak[4], 1e-6F);
}

TEST_CASE("with recordStop set the engine's record function isn't called, the samples stay, and the timing is still taken") {
    HostInstance host;
    host.setFormat(kStereo);
    bool called = false;
    host.engine().onRecord = [&](VXEngineHandle, ProcessBuffers *, IOFormat *) { called = true; };
    host.context().recordStop = 1;
    Block block(512, 0.5F);
    const Block before = block;
    record(host, block, kStereo);
    CHECK_FALSE(called);
    CHECK(block == before);
    CHECK_EQ(host.context().recordStatFrames, 480);
    CHECK(host.context().recordSeconds > 0.0);
    CHECK_EQ(host.context().recordPeak[0], 1e-6F);
    CHECK_EQ(host.context().recordBusy, 0);
}

TEST_CASE("a block of 513 frames, or of an instance that isn't initialised, returns without touching anything") {
    HostInstance host;
    host.setFormat(kStereo);
    bool called = false;
    host.engine().onRecord = [&](VXEngineHandle, ProcessBuffers *, IOFormat *) { called = true; };
    Block block(600, 0.5F);
    const Block before = block;
    IOFormat format = kStereo;
    format.frames = 513;
    record(host, block, format);
    host.context().initialised = 0;
    record(host, block, kStereo);
    host.context().initialised = 1;
    CHECK_FALSE(called);
    CHECK(block == before);
    CHECK_EQ(host.context().recordStatFrames, 0);
    CHECK_EQ(host.context().recordFirResetPending, 1);
}

TEST_CASE("recordBusy is up while the engine sees the block and down afterwards; the floating-point mode covers it") {
    HostInstance host;
    host.setFormat(kStereo);
    int busy = -1;
    unsigned mode = 0;
    host.engine().onRecord = [&](VXEngineHandle, ProcessBuffers *, IOFormat *) {
        busy = host.context().recordBusy;
        mode = _mm_getcsr();
    };
    const unsigned before = _mm_getcsr();
    Block block;
    record(host, block, kStereo);
    CHECK_EQ(busy, 1);
    CHECK_EQ(mode & 0x8840, 0x8840);
    CHECK_EQ(host.context().recordBusy, 0);
    CHECK_EQ((_mm_getcsr() & ~0x3Fu), (before & ~0x3Fu));
}

TEST_CASE("a block with no channels or no frames reaches the engine, and the meter's count follows the channels") {
    HostInstance host;
    host.setFormat(kStereo);
    int calls = 0;
    host.engine().onRecord = [&](VXEngineHandle, ProcessBuffers *, IOFormat *) { ++calls; };
    Block block(512, 0.5F);
    record(host, block, kStereo);
    CHECK_EQ(host.context().recordMeterChannels, 2);
    IOFormat format = kStereo;
    format.channels = 0;
    record(host, block, format);
    CHECK_EQ(host.context().recordMeterChannels, 0);
    format.channels = -3;
    record(host, block, format);
    CHECK_EQ(host.context().recordMeterChannels, 0);
    format.channels = 2;
    format.frames = 0;
    record(host, block, format);
    CHECK_EQ(calls, 4);
    CHECK_EQ(host.context().recordStatFrames, 3 * 480);
}

TEST_CASE("the record meter keeps the highest peak of all blocks, and one that is being read is left alone") {
    HostInstance host;
    host.setFormat(kStereo);
    Block loud(512, 0.5F);
    Block soft(512, 0.25F);
    record(host, loud, kStereo);
    record(host, soft, kStereo);
    CHECK_EQ(host.context().recordPeak[0], 0.5F);
    host.context().recordMeterLock = 1;
    Block louder(512, 0.75F);
    record(host, louder, kStereo);
    CHECK_EQ(host.context().recordPeak[0], 0.5F);
    host.context().recordMeterLock = 0;
    Block notANumber(512, NAN);
    record(host, notANumber, kStereo);
    CHECK_EQ(host.context().recordPeak[1], 0.5F);
}

TEST_CASE("a record filter runs when it is enabled, not being replaced, and single-channel pink noise is off") {
    HostInstance host;
    host.setFormat(kStereo);
    std::vector<uint8_t> taps = packed(uint16_t{4}, uint16_t{1}, 0.5F, 0.0F, 0.0F, 0.0F);
    VXDSPAPI_SetParameter(host.handle, 0, -14, 0, taps.data(), static_cast<uint32_t>(taps.size()));
    const auto level = [&] {
        Block block(512, 0.5F);
        record(host, block, kStereo);
        CHECK_EQ(block.slot(0)[7], 0.5F);
        return block.slot(1)[7];
    };
    CHECK_EQ(level(), 0.5F);
    host.context().recordFirEnable[1] = 1;
    CHECK(level() == doctest::Approx(0.25F));
    host.context().recordFirBusy[1] = 1;
    CHECK_EQ(level(), 0.5F);
    host.context().recordFirBusy[1] = 0;
    host.context().singleChannelPinkNoise = 1;
    CHECK_EQ(level(), 0.5F);
    host.context().singleChannelPinkNoise = 0;
    CHECK(level() == doctest::Approx(0.25F));
}

TEST_CASE("a clear request empties the overlaps of all filters but the one that is being replaced") {
    HostInstance host;
    host.setFormat(kStereo);
    for (uint16_t c = 0; c < 2; ++c) {
        std::vector<uint8_t> taps = packed(uint16_t{3}, c, 0.0F, 0.0F, 1.0F);  // two samples late
        VXDSPAPI_SetParameter(host.handle, 0, -14, 0, taps.data(), static_cast<uint32_t>(taps.size()));
        host.context().recordFirEnable[c] = 1;
    }
    Block first(512, 0.5F);
    record(host, first, kStereo);
    CHECK_EQ(host.context().recordFirResetPending, 0);
    host.context().recordFirResetPending = 1;
    host.context().recordFirBusy[1] = 1;
    Block held(512);
    record(host, held, kStereo);
    CHECK_EQ(host.context().recordFirResetPending, 0);
    CHECK_EQ(held.slot(0)[0], 0.0F);
    host.context().recordFirBusy[1] = 0;
    Block after(512);
    record(host, after, kStereo);
    CHECK(after.slot(1)[0] == doctest::Approx(0.5F));
}

TEST_CASE("windowLength is 480 at 48000 Hz and 1920 at 192000 Hz and above") {
    for (const auto &[rate, window] : {std::pair{48000, 480}, {44100, 441}, {96000, 960}, {192000, 1920}, {384000, 1920}}) {
        HostInstance host;
        host.setFormat(formatOf(0x3, 480, rate));
        command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 0, 20));
        command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
        CHECK_EQ(host.context().polarityDetector[0].windowLength, window);
        CHECK_EQ(host.context().sweepDetector[0].windowLength, window);
    }
}

TEST_CASE("a pure impulse of +1.0 with an undershoot of -0.5 gives polarityResult 1; its inverse gives -1") {
    for (const float peak : {1.0F, -1.0F}) {
        HostInstance host;
        host.setFormat(kStereo);
        command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 0, 20));
        recordSilence(host, 1440);
        Block block = impulseAt(5, peak);
        record(host, block, kStereo);
        CHECK_EQ(command(host, VXDSP_DATA_POLARITY_RESULT, {0}).at<int32_t>(0), peak > 0.0F ? 1 : -1);
        CHECK_EQ(host.context().polarityOnsetPending[0], 0);
        CHECK_EQ(command(host, VXDSP_DATA_POLARITY_RESULT, {1}).at<int32_t>(0), 0);
    }
}

TEST_CASE("an impulse within the first 20 ms is not looked at by itself") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_POLARITY_START, polarityCommand(1, 0, 20));
    Block block = impulseAt(5, 1.0F);
    record(host, block, kStereo);
    CHECK_EQ(host.context().polarityOnsetPending[0], 1);
    recordSilence(host, 4800);
    CHECK_EQ(command(host, VXDSP_DATA_POLARITY_RESULT, {0}).at<int32_t>(0), 0);
}

TEST_CASE("the tracker's pre-delay is the onset's place in the block in ms plus half the sweep's, cut to whole ms") {
    struct Case {
        int frame;
        uint16_t preDelay;
        float expected;
    };
    for (const Case &c : {Case{0, 100, 50.0F}, Case{48, 100, 51.0F}, Case{47, 100, 50.0F}, Case{47, 101, 51.0F},
                          Case{95, 101, 52.0F}, Case{470, 0, 9.0F}}) {
        HostInstance host;
        host.setFormat(kStereo);
        SweepCommand sweep;
        sweep.preDelay = c.preDelay;
        sweep.postDelay = 77;
        command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
        recordSilence(host, 1440);
        CHECK_EQ(host.context().sweepOnsetPending[0], 1);
        Block block = impulseAt(c.frame, 1.0F);
        record(host, block, kStereo);
        const LibraryContext &context = host.context();
        CHECK_EQ(context.sweepOnsetPending[0], 0);
        CHECK_EQ(context.sweepTracking[0], 1);
        CHECK_EQ(context.sweepTracker[0].PreDelay, c.expected);
        CHECK_EQ(context.sweepTracker[0].PostDelay, 77.0F);
        CHECK_EQ(context.sweepTracker[0].StartFrequency, 100);
        CHECK_EQ(context.sweepTracker[0].StopFrequency, 10000);
        CHECK_EQ(context.sweepTracker[0].SweepTime, 1000);
        CHECK_EQ(context.sweepTracker[0].BandsPerOctave, 3);
        // Tracking began in that same block, at its first frame.
        CHECK_EQ(context.sweepTracker[0].Position, 480);
    }
}

TEST_CASE("an onset whose peak lies in the block before has a negative delay") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
    recordSilence(host, 1440);
    Block up;
    up.slot(0)[384] = 1.0F;  // 2 ms ahead of the block's end
    record(host, up, kStereo);
    CHECK_EQ(host.context().sweepTracking[0], 0);
    Block down;
    down.slot(0)[3] = -0.5F;
    record(host, down, kStereo);
    CHECK_EQ(host.context().sweepTracking[0], 1);
    CHECK_EQ(host.context().sweepTracker[0].PreDelay, 48.0F);
}

TEST_CASE("the tracker runs at the capture side's rate") {
    HostInstance::Options options;
    options.recordRate = 96000;
    HostInstance host(options);
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
    recordSilence(host, 1440);
    Block block = impulseAt(96, 1.0F);
    record(host, block, kStereo);
    CHECK_EQ(host.context().sweepTracker[0].SampleRate, 96000);
    CHECK_EQ(host.context().sweepTracker[0].PreDelay, 51.0F);
    CHECK_EQ(host.context().sweepTracker[0].PreDelaySamples, 51 * 96);
}

TEST_CASE("after an onset, frames of the same block before the onset are also notched") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
    const auto quiet = [](int i) { return 0.01F * static_cast<float>((i * 7919) % 101 - 50) / 50.0F; };
    for (int b = 0; b < 3; ++b) {
        Block block;
        for (int i = 0; i < 480; ++i) block.slot(0)[i] = quiet(i);
        const Block before = block;
        record(host, block, kStereo);
        CHECK(block == before);
    }
    Block block;
    for (int i = 0; i < 480; ++i) block.slot(0)[i] = quiet(i);
    block.slot(0)[300] = 1.0F;
    block.slot(0)[301] = -0.5F;
    Block before = block;
    record(host, block, kStereo);
    REQUIRE_EQ(host.context().sweepTracking[0], 1);
    int changed = 0;
    for (int i = 0; i < 300; ++i) changed += block.slot(0)[i] != before.slot(0)[i] ? 1 : 0;
    CHECK(changed > 290);
    for (int i = 0; i < 480; ++i) REQUIRE_EQ(block.slot(1)[i], before.slot(1)[i]);
}

TEST_CASE("with notchInputSum exactly 0.0 at a band edge the band's result is 1.0, and the next bands go on") {
    HostInstance host;
    host.setFormat(kStereo);
    SweepCommand sweep;
    sweep.preDelay = 0;
    command(host, VXDSP_DATA_SWEEP_START, sweep.bytes());
    LibraryContext &context = host.context();
    const int first = context.distortionIndex[0];
    context.distortion[0][first] = 0.5F;
    recordSilence(host, 1440);
    Block block = impulseAt(0, 1.0F);
    record(host, block, kStereo);
    // What rings on in the notch behind the impulse has to die away first.
    context.trackingNotch[0] = BiquadState{};
    context.notchInputSum[0] = 0.0;
    context.notchOutputSum[0] = 0.0;
    recordSilence(host, 48000);
    const Answer answer = command(host, VXDSP_DATA_SWEEP_RESULT, {0});
    CHECK(answer.at<int32_t>(4) > first + 10);
    for (int band = first; band < answer.at<int32_t>(4); ++band) REQUIRE_EQ(answer.pointerAt<float>(8)[band], 1.0F);
}

TEST_CASE("a signal that never shows a peak leaves the search on and all results at 1.0") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
    for (int b = 0; b < 100; ++b) {
        Block block;
        for (int i = 0; i < 480; ++i) block.slot(0)[i] = std::sin(static_cast<float>(b * 480 + i) * 0.1F);
        record(host, block, kStereo);
    }
    CHECK_EQ(host.context().sweepOnsetPending[0], 1);
    const Answer answer = command(host, VXDSP_DATA_SWEEP_RESULT, {0});
    for (int band = 0; band < answer.at<int32_t>(0); ++band) CHECK_EQ(answer.pointerAt<float>(8)[band], 1.0F);
}

TEST_CASE("a search that never ends survives the wrap of its count") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SWEEP_START, SweepCommand{}.bytes());
    recordSilence(host, 1440);
    host.context().sweepDetector[0].sampleIndex = INT32_MAX - 100;
    Block up;
    up.slot(0)[50] = 1.0F;
    record(host, up, kStereo);
    recordSilence(host, 960);
    Block down;
    down.slot(0)[3] = -0.5F;
    record(host, down, kStereo);
    CHECK(host.context().sweepDetector[0].sampleIndex < 0);
}
