// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>
#include <xmmintrin.h>

#include <algorithm>
#include <cmath>

#include "tests/support/host_instance.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const IOFormat kStereo = formatOf(0x3);

HostInstance::Options presetInstance() {
    HostInstance::Options options;
    options.presetPath = "C:\\Presets\\Preset.bin";
    return options;
}

IOFormat withFrames(IOFormat format, int frames) {
    format.frames = frames;
    return format;
}

}  // namespace

TEST_CASE("a block of 513 frames yields zeros on the output channels, and totalFrames still grows by 513") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(600, 0.5F);
    host.process(block, withFrames(kStereo, 513), withFrames(kStereo, 513));
    for (int i = 0; i < 513; ++i) {
        REQUIRE_EQ(block.slot(0)[i], 0.0F);
        REQUIRE_EQ(block.slot(1)[i], 0.0F);
    }
    CHECK_EQ(block.slot(0)[513], 0.5F);
    CHECK_EQ(block.slot(2)[0], 0.5F);
    CHECK_EQ(host.context().totalFrames, 513);
    CHECK_EQ(host.context().processStatFrames, 513);
    CHECK_EQ(host.context().inputPeak[0], 1e-6F);
}

TEST_CASE("a block of 0 frames leaves the samples alone, adds 0, and still computes the silent word") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(16, 0.5F);
    const Block before = block;
    block.buffers.silent = 9;
    host.process(block, withFrames(kStereo, 0), withFrames(kStereo, 0));
    CHECK(block == before);
    CHECK_EQ(host.context().totalFrames, 0);
    CHECK_EQ(block.buffers.silent, 0);
}

TEST_CASE("a negative block length touches no sample") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(16, 0.5F);
    const Block before = block;
    host.process(block, withFrames(kStereo, -5), withFrames(kStereo, -5));
    CHECK(block == before);
}

TEST_CASE("silentFrames at exactly sampleRate gives silent 0; one frame more gives 1") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block;
    for (int i = 0; i < 100; ++i) host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().silentFrames, 48000);
    CHECK_EQ(block.buffers.silent, 0);
    host.process(block, withFrames(kStereo, 1), withFrames(kStereo, 1));
    CHECK_EQ(host.context().silentFrames, 48001);
    CHECK_EQ(block.buffers.silent, 1);
}

TEST_CASE("a sample just above 1e-6 anywhere in the block resets silentFrames; one of exactly 1e-6 does not") {
    HostInstance host;
    host.setFormat(kStereo);
    for (int frames = 1; frames <= 70; ++frames) {
        for (int at = 0; at < frames; ++at) {
            for (const float sign : {1.0F, -1.0F}) {
                Block block(80);
                host.context().silentFrames = 10;
                block.slot(1)[at] = sign * 1e-6F;
                host.process(block, withFrames(kStereo, frames), withFrames(kStereo, frames));
                REQUIRE_EQ(host.context().silentFrames, 10 + frames);
                block.slot(1)[at] = sign * std::nextafter(1e-6F, 1.0F);
                host.process(block, withFrames(kStereo, frames), withFrames(kStereo, frames));
                REQUIRE_EQ(host.context().silentFrames, 0);
            }
        }
    }
}

TEST_CASE("a sample behind the block's end is no sound, and a NaN is none either") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(80);
    block.slot(0)[33] = 1.0F;
    block.slot(1)[3] = NAN;
    host.process(block, withFrames(kStereo, 33), withFrames(kStereo, 33));
    CHECK_EQ(host.context().silentFrames, 33);
}

TEST_CASE("days of silence do not wrap the count") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().silentFrames = INT32_MAX - 100;
    Block block;
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().silentFrames, INT32_MAX);
    CHECK_EQ(block.buffers.silent, 1);
}

TEST_CASE("with processStop set the buffers come back bit-identical and only the counters move") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().processStop = 1;
    host.context().silentFrames = 7;
    int called = 0;
    host.engine().onProcess = [&called](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ++called; };
    Block block;
    block.fillNoise(5);
    const Block before = block;
    host.process(block, kStereo, kStereo);
    CHECK(block == before);
    CHECK_EQ(called, 0);
    CHECK_EQ(host.context().totalFrames, 480);
    CHECK_EQ(host.context().processStatFrames, 480);
    CHECK_EQ(host.context().silentFrames, 7);
    CHECK_EQ(host.context().inputPeak[0], 1e-6F);
    CHECK_EQ(host.context().outputPeak[0], 1e-6F);
    host.context().processStop = 0;
}

TEST_CASE("a context that isn't initialised zeroes the block") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().initialised = 0;
    Block block(480, 0.5F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(block.slot(0)[479], 0.0F);
    CHECK_EQ(block.slot(2)[0], 0.5F);
    CHECK_EQ(host.context().totalFrames, 480);
    host.context().initialised = 1;
}

TEST_CASE("with a preset path the engine's process function is never reached, even if bound, and the mixer folds to the output") {
    HostInstance host(presetInstance());
    host.setFormat(kStereo);
    int called = 0;
    host.engine().onProcess = [&called](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ++called; };
    Block block(480, 1.0F);
    host.process(block, formatOf(0x63F), kStereo);
    CHECK_EQ(called, 0);
    CHECK_EQ(block.slot(0)[0], 1.0F + 0.7083F + 0.7083F + 0.5F + 0.5F);
}

TEST_CASE("the engine path folds to the negotiated input format and hands the engine the negotiated formats") {
    HostInstance host;
    IOFormat input = kStereo;
    IOFormat output = formatOf(0x33);
    VXDSPAPI_SetIOFormat(host.handle, &input, &output);
    std::vector<int> seen;
    host.engine().onProcess = [&](VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *in, IOFormat *out) {
        seen = {in->channels, out->channels, in->frames, out->frames};
        CHECK_EQ(handle, host.handle);
        CHECK_EQ(in, &host.context().inputFormat);
        buffers->channels[4][0] = 0.125F;
    };
    Block block(64, 1.0F);
    host.process(block, withFrames(input, 32), withFrames(output, 40));
    CHECK_EQ(seen, std::vector<int>{2, 4, 32, 40});
    CHECK_EQ(block.slot(0)[31], 1.0F + 0.7083F + 0.7083F + 0.5F + 0.5F);
    CHECK_EQ(block.slot(0)[32], 1.0F);  // the mixer goes by the input's frames
    CHECK_EQ(block.slot(4)[0], 0.125F);
}

TEST_CASE("before the first format the mixer takes the zero mask: FL = FL + FR") {
    HostInstance host;
    Block block(480, 0.25F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(block.slot(0)[0], 0.5F);
    CHECK_EQ(block.slot(1)[0], 0.25F);
}

TEST_CASE("an input with two channels tests only the slots that its table names for silence") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(480);
    std::fill_n(block.slot(4), 480, 1.0F);
    host.process(block, kStereo, formatOf(0x63F));
    CHECK_EQ(host.context().silentFrames, 480);
    IOFormat back = kStereo;
    back.channelSlot[1] = 4;
    host.process(block, back, formatOf(0x63F));
    CHECK_EQ(host.context().silentFrames, 0);
}

TEST_CASE("channel counts and slots beyond eight stay inside the block") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block(480, 0.5F);
    IOFormat format = kStereo;
    format.channels = 1000;
    std::fill(std::begin(format.channelSlot), std::end(format.channelSlot), uint8_t{200});
    host.process(block, format, format);
    CHECK_EQ(host.context().inputMeterChannels, 8);
    CHECK_EQ(host.context().inputPeak[7], 0.5F);
}

TEST_CASE("the meters see the block ahead of the mixer and behind the engine, slot by slot, on the output's channels") {
    HostInstance host;
    host.setFormat(kStereo);
    host.engine().onProcess = [](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *) {
        buffers->channels[1][5] = -2.0F;
    };
    Block block(480, 0.25F);
    host.process(block, formatOf(0x63F), kStereo);
    CHECK_EQ(host.context().inputPeak[0], 0.25F);
    CHECK_EQ(host.context().inputPeak[2], 1e-6F);
    CHECK_EQ(host.context().inputMeterChannels, 2);
    CHECK_EQ(host.context().outputPeak[1], 2.0F);
    CHECK_EQ(host.context().outputMeterChannels, 2);
}

TEST_CASE("a meter that is being read is left alone") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().inputMeterLock = 1;
    Block block(480);
    std::fill_n(block.slot(0), 480, 0.25F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().inputPeak[0], 1e-6F);
    CHECK_EQ(host.context().inputMeterChannels, 0);
    CHECK_EQ(host.context().outputPeak[0], 0.25F);
    host.context().inputMeterLock = 0;
    host.context().outputMeterLock = 1;
    std::fill_n(block.slot(0), 480, 0.75F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().inputPeak[0], 0.75F);
    CHECK_EQ(host.context().outputPeak[0], 0.25F);
}

TEST_CASE("load figures rest while they are being read") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block;
    host.process(block, kStereo, kStereo);
    CHECK(host.context().processSeconds > 0.0);
    const double seconds = host.context().processSeconds;
    host.context().processStatsLock = 1;
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().processSeconds, seconds);
    CHECK_EQ(host.context().processStatFrames, 480);
    CHECK_EQ(host.context().totalFrames, 960);
}

TEST_CASE("the thread's floating-point mode covers the engine and is the same before and after") {
    HostInstance host;
    host.setFormat(kStereo);
    const unsigned before = _mm_getcsr();
    unsigned inside = 0;
    host.engine().onProcess = [&inside](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { inside = _mm_getcsr(); };
    Block block;
    for (const int frames : {480, 513, 0}) {
        for (const unsigned mode : {0x1F80U, 0x9FC0U, 0x3F80U}) {
            _mm_setcsr(mode);
            host.process(block, withFrames(kStereo, frames > 512 ? 0 : frames), withFrames(kStereo, frames > 512 ? 0 : frames));
            CHECK_EQ(_mm_getcsr() & ~0x3FU, mode);
            CHECK_EQ(inside & 0x8840U, 0x8840U);
            host.context().processStop = 1;
            host.process(block, kStereo, kStereo);
            CHECK_EQ(_mm_getcsr() & ~0x3FU, mode);
            host.context().processStop = 0;
        }
    }
    _mm_setcsr(before);
}

TEST_CASE("busy is up while the engine runs and down afterwards") {
    HostInstance host;
    host.setFormat(kStereo);
    int busy = -1;
    host.engine().onProcess = [&](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { busy = host.context().processBusy; };
    Block block;
    host.process(block, kStereo, kStereo);
    CHECK_EQ(busy, 1);
    CHECK_EQ(host.context().processBusy, 0);
}

TEST_CASE("a block rewrites the frames of both negotiated formats, also when it is held up") {
    HostInstance host;
    host.setFormat(kStereo);
    Block block;
    host.context().processStop = 1;
    host.process(block, withFrames(kStereo, 100), withFrames(kStereo, 120));
    CHECK_EQ(host.context().inputFormat.frames, 100);
    CHECK_EQ(host.context().outputFormat.frames, 120);
    host.context().processStop = 0;
}

TEST_CASE("white noise mode never yields a negative sample and reads close to 2 on the input meter") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().whiteNoiseMode = 1;
    Block block;
    for (int i = 0; i < 20; ++i) {
        host.process(block, kStereo, kStereo);
        for (int slot = 0; slot < 2; ++slot) CHECK(*std::min_element(block.slot(slot), block.slot(slot) + 480) >= 0.0F);
    }
    CHECK(host.context().inputPeak[0] > 1.99F);
    CHECK(host.context().inputPeak[0] <= 2.0F);
}

TEST_CASE("with single-channel pink noise on, meters, silence count and engine rest, and the other channels are zero") {
    HostInstance host;
    host.setFormat(kStereo);
    int called = 0;
    host.engine().onProcess = [&called](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ++called; };
    host.context().singleChannelPinkNoise = 1;
    host.context().silentFrames = 5;
    Block block(480, 0.5F);
    host.process(block, kStereo, kStereo);
    CHECK_EQ(host.context().inputPeak[0], 1e-6F);
    CHECK_EQ(host.context().outputPeak[0], 1e-6F);
    CHECK_EQ(host.context().silentFrames, 5);
    CHECK_EQ(called, 0);
    CHECK(std::any_of(block.slot(0), block.slot(0) + 480, [](float x) { return x != 0.0F && x != 0.5F; }));
    CHECK(std::all_of(block.slot(1), block.slot(1) + 480, [](float x) { return x == 0.0F; }));
    CHECK_EQ(block.slot(2)[0], 0.5F);
}

TEST_CASE("sine mode stops at four channels: the others keep the caller's samples") {
    HostInstance host;
    host.setFormat(formatOf(0x63F));
    host.context().sineMode = 1;
    Block block(480, 0.5F);
    host.process(block, formatOf(0x63F), formatOf(0x63F));
    for (int slot = 0; slot < 4; ++slot) CHECK(std::fabs(static_cast<double>(block.slot(slot)[12]) - 1.0) < 1e-6);
    for (int slot = 4; slot < 8; ++slot) CHECK_EQ(block.slot(slot)[12], 0.5F);
}

TEST_CASE("the address functions return the block functions themselves") {
    CHECK((VXDSPAPI_GetProcessFuncAddress() == &VXDSPAPI_Process));
    CHECK((VXDSPAPI_GetRecordFuncAddress() == &VXDSPAPI_Record));
}
