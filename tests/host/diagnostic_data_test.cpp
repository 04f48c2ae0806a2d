// SPDX-License-Identifier: MIT
//
// The door of the diagnostic commands: what is run here, what is forwarded, what is refused; meters, loads and plain switches.
#include <doctest/doctest.h>

#include <cmath>

#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Calls = std::vector<std::string>;

const IOFormat kStereo = formatOf(0x3);

std::vector<uint8_t> imageOf(const LibraryContext &context) {
    const auto *first = reinterpret_cast<const uint8_t *>(&context);
    return {first, first + sizeof context};
}

bool isOwn(int32_t id) {
    if (id >= 0 || id < -29) return false;
    for (const int32_t forwarded : {-25, -24, -23, -16, -6, -5, -4}) {
        if (id == forwarded) return false;
    }
    return true;
}

// Fills both stereo channels of a block with one value each and processes it.
void play(const HostInstance &host, float left, float right) {
    Block block;
    std::fill_n(block.slot(0), 480, left);
    std::fill_n(block.slot(1), 480, right);
    host.process(block, kStereo, kStereo);
}

void record(const HostInstance &host, Block &block, IOFormat format) {
    VXDSPAPI_Record(host.handle, &block.buffers, &format);
}

}  // namespace

TEST_CASE("a call before the context is initialised returns 0 and writes nothing") {
    HostInstance host;
    host.context().initialised = 0;
    host.engine().calls.clear();
    host.engine().dataResult = 5;
    for (int32_t id = -40; id < 10; ++id) {
        const Answer answer = command(host, id, std::vector<uint8_t>(64, 1));
        CHECK_EQ(answer.size, 0);
        CHECK(answer.nothingWritten());
    }
    CHECK_EQ(host.engine().calls, Calls{});
    host.context().initialised = 1;
}

TEST_CASE("the numbers of the commands are the interface's") {
    CHECK_EQ(VXDSP_DATA_METER_RECORD, -1);
    CHECK_EQ(VXDSP_DATA_METER_INPUT, -2);
    CHECK_EQ(VXDSP_DATA_METER_OUTPUT, -3);
    CHECK_EQ(VXDSP_DATA_RTA_ENABLE, -7);
    CHECK_EQ(VXDSP_DATA_RTA_CHANNEL, -8);
    CHECK_EQ(VXDSP_DATA_RTA_READ, -9);
    CHECK_EQ(VXDSP_DATA_LOAD_PROCESS, -10);
    CHECK_EQ(VXDSP_DATA_LOAD_RECORD, -11);
    CHECK_EQ(VXDSP_DATA_IGNORED_PAIR, -12);
    CHECK_EQ(VXDSP_DATA_WHITE_NOISE, -13);
    CHECK_EQ(VXDSP_DATA_PINK_NOISE, -14);
    CHECK_EQ(VXDSP_DATA_SINE, -15);
    CHECK_EQ(VXDSP_DATA_SWEEP_START, -17);
    CHECK_EQ(VXDSP_DATA_CAPTURE_ARM, -18);
    CHECK_EQ(VXDSP_DATA_CAPTURE_STOP, -19);
    CHECK_EQ(VXDSP_DATA_SWEEP_RESULT, -20);
    CHECK_EQ(VXDSP_DATA_POLARITY_START, -21);
    CHECK_EQ(VXDSP_DATA_POLARITY_RESULT, -22);
    CHECK_EQ(VXDSP_DATA_ISST_LOADED, -26);
    CHECK_EQ(VXDSP_DATA_MODULE_VERSION, -27);
    CHECK_EQ(VXDSP_DATA_APO_VERSION, -28);
    CHECK_EQ(VXDSP_DATA_ISST_STATE, -29);
}

TEST_CASE("the host's own ids never reach the engine; all others do, with all six arguments and the engine's result") {
    HostInstance host;
    host.setFormat(kStereo);
    host.engine().dataResult = 77;
    for (int32_t id = -40; id <= 40; ++id) {
        host.engine().calls.clear();
        uint8_t input[5] = {1, 1, 1, 1, 1};
        uint8_t output[64];
        const uint32_t result = VXDSPAPI_ReadWriteData(host.handle, 9, id, input, 5, output);
        if (isOwn(id)) {
            CHECK_EQ(host.engine().calls, Calls{});
            CHECK(result != 77);
        } else {
            CHECK_EQ(host.engine().calls, Calls{"ReadWriteData(9, " + std::to_string(id) + ", 5)"});
            CHECK_EQ(result, 77);
        }
    }
}

TEST_CASE("an id of -16 with no engine entry returns 0, and so does any other forwarded id") {
    HostInstance host;
    host.context().engineReadWriteData = nullptr;
    for (const int32_t id : {-16, -25, -24, -23, -6, -5, -4, -30, 0, 1, INT32_MIN, INT32_MAX}) {
        const Answer answer = command(host, id, {1, 2, 3});
        CHECK_EQ(answer.size, 0);
        CHECK(answer.nothingWritten());
    }
}

TEST_CASE("a command that is cut off at any length changes nothing and returns 0") {
    HostInstance host;
    host.setFormat(kStereo);
    uint32_t samples[2] = {};
    uint8_t ready = 0;
    const auto address = [](const void *p) { return static_cast<uint64_t>(reinterpret_cast<uintptr_t>(p)); };
    const struct {
        int32_t id;
        std::vector<uint8_t> input;
    } commands[] = {
        {-7, {1, 1}},
        {-8, {1}},
        {-9, packed(uint8_t{1}, uint8_t{0}, uint8_t{1}, uint32_t{1024}, int32_t{3})},
        {-12, packed(int32_t{1}, int32_t{2})},
        {-13, {1}},
        {-14, {1}},
        {-15, packed(uint8_t{1}, uint16_t{440})},
        {-17, SweepCommand{}.bytes()},
        {-18, packed(uint8_t{1}, uint8_t{2}, uint8_t{1}, address(samples), address(&ready), uint8_t{1})},
        {-20, {0}},
        {-21, polarityCommand(1, 0, 20)},
        {-22, {0}},
    };
    const std::vector<uint8_t> before = imageOf(host.context());
    for (const auto &[id, input] : commands) {
        for (size_t size = 0; size < input.size(); ++size) {
            const Answer answer = command(host, id, {input.begin(), input.begin() + static_cast<ptrdiff_t>(size)});
            CHECK_EQ(answer.size, 0);
            CHECK(answer.nothingWritten());
        }
        CHECK(before == imageOf(host.context()));
        CHECK_EQ(VXDSPAPI_ReadWriteData(host.handle, 0, id, input.data(), -1, nullptr), 0);
        CHECK_EQ(VXDSPAPI_ReadWriteData(host.handle, 0, id, nullptr, 100, nullptr), 0);
        CHECK(before == imageOf(host.context()));
    }
}

TEST_CASE("channel and analyser numbers beyond the tables change nothing and return 0") {
    HostInstance host;
    host.setFormat(kStereo);
    const std::vector<uint8_t> before = imageOf(host.context());
    for (const uint8_t number : {8, 9, 100, 255}) {
        SweepCommand sweep;
        sweep.channel = number;
        CHECK_EQ(command(host, -17, sweep.bytes()).size, 0);
        CHECK_EQ(command(host, -20, {number}).size, 0);
        CHECK_EQ(command(host, -21, polarityCommand(1, number, 20)).size, 0);
        CHECK_EQ(command(host, -22, {number}).size, 0);
        CHECK_EQ(command(host, -7, {number, 1}).size, 0);
        CHECK_EQ(command(host, -9, packed(number, uint8_t{0}, uint8_t{1}, uint32_t{1024}, int32_t{3})).size, 0);
    }
    CHECK_EQ(command(host, -7, {3, 1}).size, 0);
    CHECK(before == imageOf(host.context()));
}

TEST_CASE("a command that writes refuses a null output; one that writes nothing needs none") {
    HostInstance host;
    host.setFormat(kStereo);
    play(host, 0.5F, 0.25F);
    for (const int32_t id : {-1, -2, -3, -10, -11, -26, -27, -28, -29}) {
        CHECK_EQ(VXDSPAPI_ReadWriteData(host.handle, 0, id, nullptr, 0, nullptr), 0);
    }
    CHECK_EQ(host.context().inputPeak[0], 0.5F);
    const uint8_t on = 1;
    CHECK_EQ(VXDSPAPI_ReadWriteData(host.handle, 0, -13, &on, 1, nullptr), 0);
    CHECK_EQ(host.context().whiteNoiseMode, 1);
}

TEST_CASE("a meter before the first block answers a count of 0 and no peaks") {
    HostInstance host;
    host.setFormat(kStereo);
    for (const int32_t id : {-1, -2, -3}) {
        const Answer answer = command(host, id);
        CHECK_EQ(answer.size, 4);
        CHECK_EQ(answer.at<int32_t>(0), 0);
        CHECK_EQ(answer.bytes[4], Answer::kUntouched);
    }
    CHECK_EQ(host.context().inputPeak[0], 1e-6F);
}

TEST_CASE(
    "before the first read a silent block leaves the peaks at 1e-6; after a read, silence leaves them at 0 and the count stands") {
    HostInstance host;
    host.setFormat(kStereo);
    play(host, 0.0F, 0.0F);
    const Answer first = command(host, VXDSP_DATA_METER_INPUT);
    CHECK_EQ(first.size, 12);
    CHECK_EQ(first.at<int32_t>(0), 2);
    CHECK_EQ(first.at<float>(4), 1e-6F);
    CHECK_EQ(first.at<float>(8), 1e-6F);
    play(host, 0.0F, 0.0F);
    const Answer second = command(host, VXDSP_DATA_METER_INPUT);
    CHECK_EQ(second.at<int32_t>(0), 2);
    CHECK_EQ(second.at<float>(4), 0.0F);
}

TEST_CASE(
    "a full-scale block followed by silence still reads 1.0, and 0.0 at the read after; a negative sample counts by magnitude") {
    HostInstance host;
    host.setFormat(kStereo);
    for (const int32_t id : {VXDSP_DATA_METER_INPUT, VXDSP_DATA_METER_OUTPUT}) {
        play(host, 1.0F, -0.75F);
        play(host, 0.0F, 0.0F);
        const Answer answer = command(host, id);
        CHECK_EQ(answer.size, 12);
        CHECK_EQ(answer.at<float>(4), 1.0F);
        CHECK_EQ(answer.at<float>(8), 0.75F);
        CHECK_EQ(command(host, id).at<float>(4), 0.0F);
    }
}

TEST_CASE("the output meter reads what the engine made of the block, the input meter what came in") {
    HostInstance host;
    host.setFormat(kStereo);
    host.engine().onProcess = [](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *output) {
        for (int i = 0; i < output->frames; ++i) buffers->channels[0][i] *= 0.5F;
    };
    play(host, 0.5F, 0.5F);
    CHECK_EQ(command(host, VXDSP_DATA_METER_INPUT).at<float>(4), 0.5F);
    CHECK_EQ(command(host, VXDSP_DATA_METER_OUTPUT).at<float>(4), 0.25F);
}

TEST_CASE("the record meter counts at most four channels and reads empty the second time") {
    HostInstance host;
    host.setFormat(formatOf(0x63F));
    Block block;
    for (int i = 0; i < 8; ++i) block.slot(i)[100] = static_cast<float>(i + 1) * -0.1F;
    record(host, block, formatOf(0x63F));
    const Answer answer = command(host, VXDSP_DATA_METER_RECORD);
    CHECK_EQ(answer.size, 4 + 4 * 4);
    CHECK_EQ(answer.at<int32_t>(0), 4);
    for (int i = 0; i < 4; ++i) CHECK_EQ(answer.at<float>(4 + 4 * static_cast<size_t>(i)), static_cast<float>(i + 1) * 0.1F);
    const Answer again = command(host, VXDSP_DATA_METER_RECORD);
    for (size_t i = 0; i < 4; ++i) CHECK_EQ(again.at<float>(4 + 4 * i), 0.0F);
}

TEST_CASE("while processStop is set the meters stay as they are") {
    HostInstance host;
    host.setFormat(kStereo);
    play(host, 0.25F, 0.25F);
    host.context().processStop = 1;
    play(host, 1.0F, 1.0F);
    host.context().processStop = 0;
    CHECK_EQ(command(host, VXDSP_DATA_METER_INPUT).at<float>(4), 0.25F);
    CHECK_EQ(command(host, VXDSP_DATA_METER_OUTPUT).at<float>(4), 0.25F);
}

TEST_CASE("while singleChannelPinkNoise is set the input and output meters do not move") {
    HostInstance host;
    host.setFormat(kStereo);
    host.context().singleChannelPinkNoise = 1;
    play(host, 1.0F, 1.0F);
    CHECK_EQ(command(host, VXDSP_DATA_METER_INPUT).at<int32_t>(0), 0);
    CHECK_EQ(command(host, VXDSP_DATA_METER_OUTPUT).at<int32_t>(0), 0);
}

TEST_CASE("white noise by command reads close to 2 on the input meter and switches off again") {
    HostInstance host;
    host.setFormat(kStereo);
    CHECK_EQ(command(host, VXDSP_DATA_WHITE_NOISE, {7}).size, 0);
    CHECK_EQ(host.context().whiteNoiseMode, 1);
    for (int i = 0; i < 20; ++i) play(host, 0.0F, 0.0F);
    const Answer answer = command(host, VXDSP_DATA_METER_INPUT);
    CHECK(answer.at<float>(4) > 1.99F);
    CHECK(answer.at<float>(4) <= 2.0F);
    command(host, VXDSP_DATA_WHITE_NOISE, {0});
    play(host, 0.0F, 0.0F);
    CHECK_EQ(command(host, VXDSP_DATA_METER_INPUT).at<float>(4), 0.0F);
}

TEST_CASE("white noise goes before pink, and pink before the sine") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SINE, packed(uint8_t{1}, uint16_t{12000}));
    Block sine;
    host.process(sine, kStereo, kStereo);
    CHECK_EQ(sine.slot(0)[1], 1.0F);  // a quarter of a turn a sample
    command(host, VXDSP_DATA_PINK_NOISE, {1});
    CHECK_EQ(host.context().pinkNoiseMode, 1);
    Block pink;
    host.process(pink, kStereo, kStereo);
    CHECK(std::fabs(pink.slot(0)[1]) < 0.5F);
    CHECK(pink.slot(0)[5] != pink.slot(1)[5]);
    command(host, VXDSP_DATA_WHITE_NOISE, {1});
    Block white;
    host.process(white, kStereo, kStereo);
    double mean = 0.0;
    for (int i = 0; i < 480; ++i) mean += static_cast<double>(white.slot(0)[i]) / 480.0;
    CHECK(mean == doctest::Approx(1.0).epsilon(0.1));
}

TEST_CASE("a frequency of 0 in the sine command leaves the frequency as it is and changes only the mode") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_SINE, packed(uint8_t{1}, uint16_t{440}));
    for (const SineGenerator &sine : host.context().sine) {
        CHECK_EQ(sine.Frequency, 440);
        CHECK_EQ(sine.PhaseStep, static_cast<float>(440 * 6.283185307179586 / 48000));
    }
    CHECK_EQ(host.context().sineMode, 1);
    command(host, VXDSP_DATA_SINE, packed(uint8_t{0}, uint16_t{0}));
    CHECK_EQ(host.context().sineMode, 0);
    for (const SineGenerator &sine : host.context().sine) CHECK_EQ(sine.Frequency, 440);
}

TEST_CASE("the sine command takes the rate that component -1 has set") {
    HostInstance host;
    host.setFormat(kStereo);
    VXDSPAPI_CreateComponent(host.handle, 0, -1, 96000, 44100);
    command(host, VXDSP_DATA_SINE, packed(uint8_t{1}, uint16_t{1000}));
    CHECK_EQ(host.context().sine[3].SampleRate, 96000);
    CHECK_EQ(host.context().sine[3].PhaseStep, static_cast<float>(1000 * 6.283185307179586 / 96000));
}

TEST_CASE("a load is worked out from a quarter of a second of audio on, and then the sums begin anew") {
    HostInstance host;
    host.setFormat(kStereo);
    LibraryContext &context = host.context();
    context.processLoadPercent = 12.5F;
    context.processSeconds = 0.125;
    context.processStatFrames = 11999;
    Answer answer = command(host, VXDSP_DATA_LOAD_PROCESS);
    CHECK_EQ(answer.size, 4);
    CHECK_EQ(answer.at<float>(0), 12.5F);
    CHECK_EQ(context.processStatFrames, 11999);
    context.processStatFrames = 12000;
    answer = command(host, VXDSP_DATA_LOAD_PROCESS);
    CHECK_EQ(answer.at<float>(0), 50.0F);
    CHECK_EQ(context.processLoadPercent, 50.0F);
    CHECK_EQ(context.processStatFrames, 0);
    CHECK_EQ(context.processSeconds, 0.0);
    CHECK_EQ(command(host, VXDSP_DATA_LOAD_PROCESS).at<float>(0), 50.0F);
}

TEST_CASE("reading a load twice within a quarter second of audio returns the same value") {
    HostInstance host;
    host.setFormat(kStereo);
    for (int i = 0; i < 30; ++i) play(host, 0.1F, 0.1F);
    const float load = command(host, VXDSP_DATA_LOAD_PROCESS).at<float>(0);
    CHECK(load > 0.0F);
    for (int i = 0; i < 24; ++i) play(host, 0.1F, 0.1F);
    CHECK_EQ(command(host, VXDSP_DATA_LOAD_PROCESS).at<float>(0), load);
    CHECK_EQ(host.context().processStatFrames, 24 * 480);
}

TEST_CASE("the record side's load goes by the output rate, also when the capture side runs at another one") {
    HostInstance host;
    host.setFormat(kStereo);
    VXDSPAPI_CreateComponent(host.handle, 0, -1, 48000, 96000);
    LibraryContext &context = host.context();
    context.recordSeconds = 0.125;
    context.recordStatFrames = 12000;
    CHECK_EQ(command(host, VXDSP_DATA_LOAD_RECORD).at<float>(0), 50.0F);
    CHECK_EQ(context.recordStatFrames, 0);
    CHECK_EQ(context.recordStatsLock, 0);
}

TEST_CASE("a load without a format and without a block is 0") {
    HostInstance host;
    CHECK_EQ(command(host, VXDSP_DATA_LOAD_PROCESS).at<float>(0), 0.0F);
    CHECK_EQ(command(host, VXDSP_DATA_LOAD_RECORD).at<float>(0), 0.0F);
}

TEST_CASE("-12 consumes eight input bytes and has no further effect") {
    HostInstance host;
    host.setFormat(kStereo);
    const std::vector<uint8_t> before = imageOf(host.context());
    const Answer answer = command(host, VXDSP_DATA_IGNORED_PAIR, packed(int32_t{-1}, int32_t{77}));
    CHECK_EQ(answer.size, 0);
    CHECK(answer.nothingWritten());
    CHECK(before == imageOf(host.context()));
}

TEST_CASE("versions and the state without an iSST module") {
    HostInstance host;
    host.context().thisModuleVersion = 0x0002000100030004;
    host.context().apoModuleVersion = 0x0005000600070008;
    Answer answer = command(host, VXDSP_DATA_MODULE_VERSION);
    CHECK_EQ(answer.size, 8);
    CHECK_EQ(answer.at<uint64_t>(0), 0x0002000100030004);
    answer = command(host, VXDSP_DATA_APO_VERSION);
    CHECK_EQ(answer.size, 8);
    CHECK_EQ(answer.at<uint64_t>(0), 0x0005000600070008);
    for (const int32_t id : {VXDSP_DATA_ISST_LOADED, VXDSP_DATA_ISST_STATE}) {
        answer = command(host, id);
        CHECK_EQ(answer.size, 1);
        CHECK_EQ(answer.bytes[0], 0);
    }
}
