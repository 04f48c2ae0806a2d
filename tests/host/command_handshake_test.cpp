// SPDX-License-Identifier: MIT
//
// How each diagnostic command meets the block functions: which busy byte it waits for, which byte it raises meanwhile, and what
// does not hold it up. A busy byte is raised by hand; a command that waits runs on a thread of its own.
#include <doctest/doctest.h>

#include <atomic>
#include <thread>

#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

struct Waiting {
    int32_t id;
    std::vector<uint8_t> input;
    VXAtomicByte *raised;     // up while the command waits
    VXAtomicByte *busy;       // what it waits for
    VXAtomicByte *ignored;    // what it does not wait for, or null
    VXAtomicByte *notRaised;  // stays down while it waits for that byte, or null
};

std::vector<Waiting> waitingCommands(LibraryContext &c) {
    const std::vector<uint8_t> sweep = SweepCommand{}.bytes();
    const std::vector<uint8_t> tone = polarityCommand(1, 0, 20);
    return {
        {-1, {}, &c.recordMeterLock, &c.processBusy, &c.recordBusy, nullptr},
        {-2, {}, &c.inputMeterLock, &c.processBusy, &c.recordBusy, &c.outputMeterLock},
        {-3, {}, &c.outputMeterLock, &c.processBusy, &c.recordBusy, &c.inputMeterLock},
        {-7, {0, 1}, &c.analyserLock[0], &c.processBusy, &c.recordBusy, &c.analyserLock[1]},
        {-7, {1, 0}, &c.analyserLock[1], &c.processBusy, &c.recordBusy, &c.analyserLock[0]},
        {-7, {2, 1}, &c.analyserLock[2], &c.recordBusy, &c.processBusy, &c.analyserLock[0]},
        {-10, {}, &c.processStatsLock, &c.processBusy, &c.recordBusy, &c.recordStatsLock},
        {-11, {}, &c.recordStatsLock, &c.recordBusy, &c.processBusy, &c.processStatsLock},
        {-12, packed(1, 2), &c.processStop, &c.processBusy, &c.recordBusy, &c.recordStop},
        // Render first, then capture.
        {-17, sweep, &c.processStop, &c.processBusy, nullptr, &c.recordStop},
        {-17, sweep, &c.recordStop, &c.recordBusy, nullptr, nullptr},
        {-21, tone, &c.processStop, &c.processBusy, nullptr, &c.recordStop},
        {-21, tone, &c.recordStop, &c.recordBusy, nullptr, nullptr},
        {-18, {0}, &c.captureRequested, &c.recordBusy, &c.processBusy, &c.recordStop},
    };
}

}  // namespace

TEST_CASE("a command that waits raises its byte, waits for its block function alone and lowers the byte behind it") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    for (const Waiting &waiting : waitingCommands(host.context())) {
        CAPTURE(waiting.id);
        *waiting.busy = 1;
        std::atomic<bool> finished{false};
        std::thread control([&] {
            command(host, waiting.id, waiting.input);
            finished = true;
        });
        while (waiting.raised->load() == 0) std::this_thread::yield();
        CHECK_FALSE(finished.load());
        if (waiting.notRaised != nullptr) CHECK_EQ(waiting.notRaised->load(), 0);
        *waiting.busy = 0;
        control.join();
        CHECK_EQ(waiting.raised->load(), 0);
        if (waiting.ignored == nullptr) continue;
        *waiting.ignored = 1;
        command(host, waiting.id, waiting.input);  // would never come back if it waited
        *waiting.ignored = 0;
    }
}

TEST_CASE("a capture stop waits for the capture side, with the rings switched off meanwhile") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    LibraryContext &context = host.context();
    context.captureRequested = context.captureArmed = 1;
    context.capture[0].active = 1;
    context.recordBusy = 1;
    std::thread control([&] { command(host, VXDSP_DATA_CAPTURE_STOP); });
    while (context.captureRequested != 0) std::this_thread::yield();
    CHECK_EQ(context.captureArmed, 0);
    CHECK_EQ(context.capture[0].active, 1);
    context.recordBusy = 0;
    control.join();
    CHECK_EQ(context.capture[0].active, 0);
}

TEST_CASE("while rings are armed anew they are switched off, so that no block runs half-made ones") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    LibraryContext &context = host.context();
    command(host, VXDSP_DATA_CAPTURE_ARM, {0});
    context.recordBusy = 1;
    std::thread control([&] { command(host, VXDSP_DATA_CAPTURE_ARM, {0}); });
    while (context.captureRequested == 0) std::this_thread::yield();
    CHECK_EQ(context.captureArmed, 0);
    context.recordBusy = 0;
    control.join();
    CHECK_EQ(context.captureRequested, 0);
    CHECK_EQ(context.captureArmed, 1);
}

TEST_CASE("switches, readouts and results wait for nobody") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    host.context().processBusy = 1;
    host.context().recordBusy = 1;
    for (const int32_t id : {-8, -13, -14, -20, -22, -26, -27, -28, -29}) command(host, id, {0});
    command(host, VXDSP_DATA_SINE, packed(uint8_t{1}, uint16_t{440}));
    const Answer answer =
        command(host, VXDSP_DATA_RTA_READ, packed(uint8_t{0}, uint8_t{0}, uint8_t{1}, uint32_t{1024}, int32_t{3}));
    CHECK_EQ(answer.size, 9);
    CHECK_EQ(host.context().sineMode, 1);
    host.context().processBusy = 0;
    host.context().recordBusy = 0;
}
