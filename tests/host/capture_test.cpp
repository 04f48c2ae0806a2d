// SPDX-License-Identifier: MIT
//
// Capture rings, from the command to the samples, and their hand-over between threads.
#include <doctest/doctest.h>
#include <emmintrin.h>

#include <array>
#include <thread>

#include "measure/capture_ring.h"
#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const IOFormat kStereo = formatOf(0x3);

uint64_t address(const void *p) {
    return static_cast<uint64_t>(reinterpret_cast<uintptr_t>(p));
}

// The application's side of a ring: buffers of a length, and their flags.
template <int kBuffers, int kLength>
struct Buffers {
    std::array<std::array<uint32_t, kLength>, kBuffers> samples{};
    std::array<VXAtomicByte, kBuffers> ready{};

    std::vector<uint8_t> entry(uint8_t slot, uint8_t oneShot) {
        std::vector<uint8_t> bytes = packed(slot, static_cast<uint8_t>(kBuffers));
        const auto add = [&bytes](const std::vector<uint8_t> &more) { bytes.insert(bytes.end(), more.begin(), more.end()); };
        for (const auto &buffer : samples) add(packed(address(buffer.data())));
        add(packed(address(ready.data()), oneShot));
        return bytes;
    }
};

std::vector<uint8_t> armCommand(const std::vector<std::vector<uint8_t>> &entries) {
    std::vector<uint8_t> bytes = {static_cast<uint8_t>(entries.size())};
    for (const auto &entry : entries) bytes.insert(bytes.end(), entry.begin(), entry.end());
    return bytes;
}

void record(const HostInstance &host, Block &block, int frames) {
    IOFormat format = kStereo;
    format.frames = frames;
    VXDSPAPI_Record(host.handle, &block.buffers, &format);
}

// Waits for a flag, and lets others run meanwhile: the machine may have fewer cores than the test has threads.
void waitFor(const VXAtomicByte &flag, uint8_t value) {
    for (int spins = 0; flag.load(std::memory_order_acquire) != value; ++spins) {
        if (spins < 200) {
            _mm_pause();
        } else {
            std::this_thread::yield();
        }
    }
}

// What an application inside the process does to let armed rings run.
void request(const HostInstance &host) {
    host.context().captureRequested = 1;
}

}  // namespace

TEST_CASE("an arm fills the rings as listed and leaves captureRequested down and captureArmed up, so the rings are not fed") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<2, 1> left;
    Buffers<3, 1> right;
    CHECK_EQ(command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({left.entry(0, 1), right.entry(1, 0)})).size, 0);
    const LibraryContext &context = host.context();
    CHECK_EQ(context.captureRequested, 0);
    CHECK_EQ(context.captureArmed, 1);
    CHECK_EQ(context.capture[0].active, 1);
    CHECK_EQ(context.capture[0].bufferCount, 2);
    CHECK_EQ(context.capture[0].bufferLength, 0);
    CHECK_EQ(context.capture[0].oneShot, 1);
    CHECK_EQ(context.capture[0].buffers[1], left.samples[1].data());
    CHECK_EQ(context.capture[0].bufferReady, left.ready.data());
    CHECK_EQ(context.capture[1].bufferCount, 3);
    CHECK_EQ(context.capture[1].oneShot, 0);
    CHECK_EQ(context.capture[2].active, 0);
    Block block(512, 0.5F);
    record(host, block, 480);
    CHECK_EQ(left.ready[0], 0);
    CHECK_EQ(context.capture[0].currentBuffer, 0);
}

TEST_CASE("a ring with two buffers and oneShot: once currentBuffer stands at 2, further calls store nothing") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<2, 1> left;
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({left.entry(0, 1)}));
    request(host);
    Block block;
    block.slot(0)[0] = 0.25F;
    block.slot(0)[1] = -0.5F;
    block.slot(0)[2] = 1.0F;
    record(host, block, 3);
    CHECK_EQ(host.context().capture[0].currentBuffer, 2);
    CHECK_EQ(left.samples[0][0], 0x3E800000);
    CHECK_EQ(left.samples[1][0], 0xBF000000);
    CHECK_EQ(left.ready[0], 1);
    CHECK_EQ(left.ready[1], 1);
    Block more(512, 0.75F);
    record(host, more, 480);
    CHECK_EQ(left.samples[0][0], 0x3E800000);
    CHECK_EQ(left.samples[1][0], 0xBF000000);
}

TEST_CASE("a ring as the command leaves it moves on one buffer with each sample and wraps without oneShot") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<3, 1> left;
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({left.entry(0, 0)}));
    request(host);
    Block block;
    for (int i = 0; i < 5; ++i) block.slot(0)[i] = static_cast<float>(i + 1);
    record(host, block, 5);
    CHECK_EQ(host.context().capture[0].currentBuffer, 2);
    CHECK_EQ(left.samples[0][0], 0x40800000);  // 4.0, behind 1.0
    CHECK_EQ(left.samples[1][0], 0x40A00000);  // 5.0, behind 2.0
    CHECK_EQ(left.samples[2][0], 0x40400000);  // 3.0
}

TEST_CASE("rings see the samples behind the record filters and ahead of the notch") {
    HostInstance host;
    host.setFormat(kStereo);
    std::vector<uint8_t> taps = packed(uint16_t{1}, 0.5F);
    VXDSPAPI_SetParameter(host.handle, 0, -14, 0, taps.data(), static_cast<uint32_t>(taps.size()));
    host.context().recordFirEnable[0] = 1;
    Buffers<1, 1> left;
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({left.entry(0, 1)}));
    request(host);
    Block block(512, 1.0F);
    record(host, block, 1);
    CHECK_EQ(left.samples[0][0], 0x3F000000);
}

TEST_CASE("a ring number from 4 on ends the list; a count of 8 or more is stored and ends it too") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<1, 1> first;
    Buffers<1, 1> second;
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({first.entry(0, 1), {4}, second.entry(1, 1)}));
    CHECK_EQ(host.context().capture[0].active, 1);
    CHECK_EQ(host.context().capture[1].active, 0);
    CHECK_EQ(host.context().captureArmed, 1);
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({first.entry(2, 1), {3, 8}, second.entry(1, 1)}));
    CHECK_EQ(host.context().capture[0].active, 0);
    CHECK_EQ(host.context().capture[2].active, 1);
    CHECK_EQ(host.context().capture[3].bufferCount, 8);
    CHECK_EQ(host.context().capture[3].active, 0);
    CHECK_EQ(host.context().capture[1].active, 0);
}

TEST_CASE("an active ring whose count a later entry has raised beyond its buffers stays inside memory") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<1, 1> buffers;
    for (const uint8_t count : {8, 200, 255}) {
        command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({buffers.entry(0, 0), {0, count}}));
        CHECK_EQ(host.context().capture[0].active, 1);
        CHECK_EQ(host.context().capture[0].bufferCount, count);
        request(host);
        Block block(512, 0.5F);
        record(host, block, 480);
        CHECK_EQ(buffers.samples[0][0], 0x3F000000);
    }
}

TEST_CASE("entries with null addresses or no buffers store nothing") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<1, 1> buffers;
    const std::vector<uint8_t> noFlags =
        packed(uint8_t{0}, uint8_t{1}, address(buffers.samples[0].data()), uint64_t{0}, uint8_t{0});
    const std::vector<uint8_t> noBuffer = packed(uint8_t{1}, uint8_t{1}, uint64_t{0}, address(buffers.ready.data()), uint8_t{0});
    const std::vector<uint8_t> none = packed(uint8_t{2}, uint8_t{0}, address(buffers.ready.data()), uint8_t{0});
    command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({noFlags, noBuffer, none}));
    request(host);
    Block block(512, 0.5F);
    record(host, block, 480);
    CHECK_EQ(buffers.samples[0][0], 0);
    CHECK_EQ(buffers.ready[0], 0);
}

TEST_CASE("an empty arm and a stop clear all rings; the stop clears both bytes") {
    HostInstance host;
    host.setFormat(kStereo);
    Buffers<1, 1> buffers;
    for (const int32_t id : {VXDSP_DATA_CAPTURE_ARM, VXDSP_DATA_CAPTURE_STOP}) {
        command(host, VXDSP_DATA_CAPTURE_ARM, armCommand({buffers.entry(3, 1)}));
        request(host);
        CHECK_EQ(command(host, id, {0}).size, 0);
        CHECK_EQ(host.context().capture[3].active, 0);
        CHECK_EQ(host.context().capture[3].bufferReady, nullptr);
        CHECK_EQ(host.context().captureRequested, 0);
        CHECK_EQ(host.context().captureArmed, id == VXDSP_DATA_CAPTURE_ARM ? 1 : 0);
    }
}

TEST_CASE("ten million hand-overs between capture and application show no torn value") {
    constexpr int kBuffers = 7;
    constexpr int kLength = 4;
    constexpr uint32_t kHandOvers = 10000000;
    static Buffers<kBuffers, kLength> buffers;
    CaptureRing ring{};
    ring.active = 1;
    ring.bufferCount = kBuffers;
    ring.bufferLength = kLength;
    for (size_t i = 0; i < kBuffers; ++i) ring.buffers[i] = buffers.samples[i].data();
    ring.bufferReady = buffers.ready.data();
    std::thread capture([&ring] {
        for (uint32_t n = 1; n <= kHandOvers; ++n) {
            // The ring itself waits for nobody; the test keeps it from lapping the application.
            waitFor(buffers.ready[static_cast<size_t>(ring.currentBuffer)], 0);
            const uint32_t samples[kLength] = {n, n ^ 0x5A5A5A5A, ~n, n * 2654435761u};
            feedCaptureRing(ring, samples, kLength);
        }
    });
    uint32_t torn = 0;
    for (uint32_t n = 1; n <= kHandOvers; ++n) {
        const size_t at = (n - 1) % kBuffers;
        waitFor(buffers.ready[at], 1);
        const auto &s = buffers.samples[at];
        if (s[0] != n || s[1] != (n ^ 0x5A5A5A5A) || s[2] != ~n || s[3] != n * 2654435761u) ++torn;
        buffers.ready[at].store(0, std::memory_order_release);
    }
    capture.join();
    CHECK_EQ(torn, 0);
}
