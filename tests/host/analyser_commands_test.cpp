// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include <algorithm>
#include <cmath>

#include "measure/band_tables.h"
#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const IOFormat kStereo = formatOf(0x3);

std::vector<uint8_t> readCommand(uint8_t analyser, uint32_t size, int32_t bandsPerOctave = 3, uint8_t integrate = 1) {
    return packed(analyser, uint8_t{0x5A}, integrate, size, bandsPerOctave);
}

// Blocks of a stereo sine with one frequency a channel, through render and capture.
void play(const HostInstance &host, double leftHz, double rightHz, int frames, int rate = 48000) {
    IOFormat format = formatOf(0x3, 480, rate);
    for (int done = 0; done < frames; done += 480) {
        Block block;
        for (int i = 0; i < 480; ++i) {
            const double t = 6.283185307179586 * (done + i) / rate;
            block.slot(0)[i] = static_cast<float>(std::sin(leftHz * t));
            block.slot(1)[i] = static_cast<float>(std::sin(rightHz * t));
        }
        Block captured = block;
        host.process(block, format, format);
        VXDSPAPI_Record(host.handle, &captured.buffers, &format);
    }
}

// The centre of the strongest band of a readout.
float strongest(const HostInstance &host, uint8_t analyser, uint32_t size = 8192, int32_t bandsPerOctave = 12) {
    const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(analyser, size, bandsPerOctave));
    CHECK_EQ(answer.size, 9);
    const float *edges = nullptr;
    const float *centres = nullptr;
    int count = 0;
    BandTables::select(bandsPerOctave, &edges, &centres, &count);
    const float *bands = answer.pointerAt<float>(0);
    return centres[std::max_element(bands, bands + count - 1) - bands];
}

bool isAbout(float hz, double expected) {
    return std::fabs(std::log2(static_cast<double>(hz) / expected)) < 1.0 / 12.0;
}

}  // namespace

TEST_CASE("analysers come up off; the switch stores its byte, lowers its lock and writes nothing") {
    HostInstance host;
    host.setFormat(kStereo);
    for (uint8_t a = 0; a < 3; ++a) {
        CHECK_EQ(host.context().analyser[a].enabled, 0);
        const Answer answer = command(host, VXDSP_DATA_RTA_ENABLE, {a, 5});
        CHECK_EQ(answer.size, 0);
        CHECK(answer.nothingWritten());
        CHECK_EQ(host.context().analyser[a].enabled, 5);
        CHECK_EQ(host.context().analyserLock[a], 0);
    }
    host.setFormat(formatOf(0x3, 480, 44100));
    for (const RealTimeAnalyser &analyser : host.context().analyser) CHECK_EQ(analyser.enabled, 0);
}

TEST_CASE("an analyser that is off is not fed; switching off clears the ring and leaves the indexes") {
    HostInstance host;
    host.setFormat(kStereo);
    play(host, 1000, 1000, 4800);
    CHECK_EQ(*host.context().analyser[0].writeIndex, 1);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1000, 1000, 4800);
    const RealTimeAnalyser &analyser = host.context().analyser[0];
    CHECK_EQ(*analyser.writeIndex, 4801);
    CHECK(std::any_of(analyser.ring, analyser.ring + analyser.capacity, [](float x) { return x != 0.0F; }));
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 0});
    CHECK_FALSE(std::any_of(analyser.ring, analyser.ring + analyser.capacity, [](float x) { return x != 0.0F; }));
    CHECK_EQ(*analyser.writeIndex, 4801);
    CHECK_EQ(*analyser.readIndex, 0);
}

TEST_CASE("the three analysers hear the engine's input, its output and the capture side") {
    HostInstance host;
    host.setFormat(kStereo);
    double phase = 0.0;
    host.engine().onProcess = [&phase](VXEngineHandle, ProcessBuffers *buffers, IOFormat *, IOFormat *) {
        for (int i = 0; i < 480; ++i) {
            phase += 6.283185307179586 * 4000.0 / 48000.0;
            buffers->channels[0][i] = buffers->channels[1][i] = static_cast<float>(std::sin(phase));
        }
    };
    for (uint8_t a = 0; a < 3; ++a) command(host, VXDSP_DATA_RTA_ENABLE, {a, 1});
    play(host, 1000, 1000, 9600);
    CHECK(isAbout(strongest(host, 0), 1000));
    CHECK(isAbout(strongest(host, 1), 4000));
    CHECK(isAbout(strongest(host, 2), 1000));
}

TEST_CASE("a choice of 0 or 1 picks that channel, 2 or more the mean; analyser 0 always hears the mean") {
    HostInstance host;
    host.setFormat(kStereo);
    for (uint8_t a = 0; a < 3; ++a) command(host, VXDSP_DATA_RTA_ENABLE, {a, 1});
    for (const uint8_t choice : {0, 1, 2, 255}) {
        CHECK_EQ(command(host, VXDSP_DATA_RTA_CHANNEL, {choice}).size, 0);
        CHECK_EQ(host.context().analyserFeedMode, choice);
        for (uint8_t a = 0; a < 3; ++a) {
            // In the mean, equal and opposite sines cancel, and what is left is the louder channel's second half.
            play(host, 500, 4000, 9600);
            const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(a, 8192, 1));
            const float *bands = answer.pointerAt<float>(0);
            const double low = static_cast<double>(bands[5]), high = static_cast<double>(bands[8]);  // around 500 and 4000 Hz
            if (a == 0 || choice >= 2) {
                CHECK(low == doctest::Approx(high).epsilon(0.05));
            } else if (choice == 0) {
                CHECK(low > 1000.0 * high);
            } else {
                CHECK(high > 1000.0 * low);
            }
        }
    }
}

TEST_CASE("with one channel the choice does not matter") {
    HostInstance host;
    const IOFormat mono = formatOf(0x1);
    host.setFormat(mono);
    command(host, VXDSP_DATA_RTA_ENABLE, {1, 1});
    for (const uint8_t choice : {0, 1, 2, 7}) {
        command(host, VXDSP_DATA_RTA_CHANNEL, {choice});
        Block block;
        std::fill_n(block.slot(0), 480, 0.5F);
        const int at = *host.context().analyser[1].writeIndex;
        host.process(block, mono, mono);
        CHECK_EQ(host.context().analyser[1].ring[at], 0.5F);
    }
}

TEST_CASE("a readout writes the address of the analyser's bands and a zero byte") {
    HostInstance host;
    host.setFormat(kStereo);
    const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(1, 1024));
    CHECK_EQ(answer.size, 9);
    CHECK_EQ(answer.pointerAt<float>(0), host.context().analyser[1].bands);
    CHECK_EQ(answer.bytes[8], 0);
    CHECK_EQ(answer.bytes[9], Answer::kUntouched);
}

TEST_CASE("a readout of an analyser that was never fed gives the spectrum of silence") {
    HostInstance host;
    host.setFormat(kStereo);
    const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(2, 4096));
    for (int i = 0; i < 34; ++i) CHECK_EQ(answer.pointerAt<float>(0)[i], 0.0F);
}

TEST_CASE("a readout with a new fftSize frees and rebuilds the transform buffers within the call") {
    HostInstance host;
    host.setFormat(kStereo);
    const RealTimeAnalyser &analyser = host.context().analyser[0];
    CHECK_EQ(analyser.fftSize, nullptr);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    for (const uint32_t size : {1024u, 16384u, 2u, 65536u, 4096u}) {
        play(host, 1000, 1000, 480);
        CHECK_EQ(command(host, VXDSP_DATA_RTA_READ, readCommand(0, size)).size, 9);
        REQUIRE(analyser.fftSize != nullptr);
        CHECK_EQ(*analyser.fftSize, size);
        CHECK_EQ(*analyser.readIndex, *analyser.writeIndex);
        if (size > 2) CHECK_EQ(analyser.window[0], static_cast<float>(0.54 - 0.46));
    }
}

TEST_CASE("an fftSize that is no power of two, or too large for the ring, changes nothing and returns 0") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1000, 1000, 9600);
    command(host, VXDSP_DATA_RTA_READ, readCommand(0, 4096));
    const RealTimeAnalyser before = host.context().analyser[0];
    play(host, 4000, 4000, 9600);
    for (const uint32_t size : {0u, 1u, 3u, 1000u, 4095u, 131072u, 1u << 30, 1u << 31, UINT32_MAX}) {
        const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(0, size));
        CHECK_EQ(answer.size, 0);
        CHECK(answer.nothingWritten());
    }
    const RealTimeAnalyser &after = host.context().analyser[0];
    CHECK(std::equal(std::begin(before.bands), std::end(before.bands), std::begin(after.bands)));
    CHECK_EQ(before.work, after.work);
    CHECK_EQ(*after.fftSize, 4096);
}

TEST_CASE("a readout before the first format returns 0") {
    HostInstance host;
    CHECK_EQ(command(host, VXDSP_DATA_RTA_READ, readCommand(0, 1024)).size, 0);
    CHECK_EQ(command(host, VXDSP_DATA_RTA_ENABLE, {0, 0}).size, 0);
}

TEST_CASE("bandsPerOctave of 2 or 0 selects the one-band-per-octave table without complaint") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1000, 1000, 9600);
    std::vector<std::vector<float>> results;
    for (const int32_t n : {1, 2, 0, -1, 49, INT32_MIN}) {
        const float *bands = command(host, VXDSP_DATA_RTA_READ, readCommand(0, 4096, n)).pointerAt<float>(0);
        results.emplace_back(bands, bands + 11);
    }
    for (const auto &result : results) CHECK_EQ(result, results[0]);
    CHECK(results[0][6] > 0.01F);  // the octave around 1000 Hz
}

TEST_CASE("any integrate byte other than 0 sums the band's power; 0 takes the value at the centre") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1010, 1010, 9600);
    const auto bandAt1000 = [&](uint8_t integrate) {
        return command(host, VXDSP_DATA_RTA_READ, readCommand(0, 8192, 1, integrate)).pointerAt<float>(0)[6];
    };
    CHECK_EQ(bandAt1000(1), bandAt1000(200));
    CHECK(bandAt1000(1) > bandAt1000(0));
}

TEST_CASE("at 44100 Hz the top bands of the 48-per-octave table lie above Nyquist and yield 0") {
    HostInstance host;
    host.setFormat(formatOf(0x3, 480, 44100));
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 21000, 21000, 9600, 44100);
    const float *bands = command(host, VXDSP_DATA_RTA_READ, readCommand(0, 8192, 48)).pointerAt<float>(0);
    const float *edges = nullptr;
    const float *centres = nullptr;
    int count = 0;
    BandTables::select(48, &edges, &centres, &count);
    int above = 0;
    for (int i = 0; i < count - 1; ++i) {
        if (edges[i] < 22050.0F) continue;
        CHECK_EQ(bands[i], 0.0F);
        ++above;
    }
    CHECK(above > 3);
}

TEST_CASE("an application that stops polling finds audio up to a second old, and the feed goes on behind the readout") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1000, 1000, 48000);
    play(host, 4000, 4000, 48000);  // dropped: the ring is full
    const RealTimeAnalyser &analyser = host.context().analyser[0];
    CHECK_EQ((*analyser.writeIndex + 1) % analyser.capacity, *analyser.readIndex);
    CHECK(isAbout(strongest(host, 0), 1000));
    play(host, 4000, 4000, 9600);
    CHECK(isAbout(strongest(host, 0), 4000));
}

TEST_CASE("a readout right after another analyses the same samples again") {
    HostInstance host;
    host.setFormat(kStereo);
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 1000, 3000, 9600);
    const float *bands = command(host, VXDSP_DATA_RTA_READ, readCommand(0, 8192, 48)).pointerAt<float>(0);
    const std::vector<float> first(bands, bands + 555);
    command(host, VXDSP_DATA_RTA_READ, readCommand(0, 8192, 48));
    CHECK_EQ(first, std::vector<float>(bands, bands + 555));
    CHECK_EQ(*host.context().analyser[0].readIndex, *host.context().analyser[0].writeIndex);
}

TEST_CASE("a frame as long as the ring copies nothing: what the last transform left is analysed") {
    HostInstance host;
    host.setFormat(formatOf(0x3, 480, 4096));
    command(host, VXDSP_DATA_RTA_ENABLE, {0, 1});
    play(host, 500, 500, 3840, 4096);
    const Answer answer = command(host, VXDSP_DATA_RTA_READ, readCommand(0, 8192, 3));
    CHECK_EQ(answer.size, 9);
    for (int i = 0; i < 34; ++i) CHECK_EQ(answer.pointerAt<float>(0)[i], 0.0F);
}
