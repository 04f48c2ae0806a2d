// SPDX-License-Identifier: MIT
//
// How the host's own parameters meet the block functions. A busy byte is raised by hand; a call that waits runs on a thread of its
// own.
#include <doctest/doctest.h>

#include <atomic>
#include <thread>

#include "tests/support/data_command.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

uint32_t set(const HostInstance &host, int32_t id, std::vector<uint8_t> data) {
    return VXDSPAPI_SetParameter(host.handle, 0, id, 0, data.data(), static_cast<uint32_t>(data.size()));
}

// A FIR load of a number of zeros behind a tap of 1.
std::vector<uint8_t> firLoad(uint16_t count, int channel = -1) {
    std::vector<uint8_t> data = packed(count);
    const auto append = [&data](const std::vector<uint8_t> &more) { data.insert(data.end(), more.begin(), more.end()); };
    if (channel >= 0) append(packed(static_cast<uint16_t>(channel)));
    for (int i = 0; i < count; ++i) append(packed(i == 0 ? 1.0F : 0.0F));
    return data;
}

}  // namespace

TEST_CASE("a filter of another length waits for its block function with the filter marked busy; one of equal length does not") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    LibraryContext &context = host.context();
    const struct {
        int32_t id;
        int channel;
        VXAtomicByte &filterBusy;
        VXAtomicByte &blockBusy;
        VXAtomicByte &otherBusy;
        VXAtomicByte &resetPending;
        const uint32_t &length;
    } loads[] = {
        {-16, -1, context.processFirBusy, context.processBusy, context.recordBusy, context.processFirResetPending,
         context.processFirLength},
        {-14, 2, context.recordFirBusy[2], context.recordBusy, context.processBusy, context.recordFirResetPending,
         context.recordFirLength[2]},
    };
    for (const auto &load : loads) {
        load.resetPending = 0;
        load.blockBusy = 1;
        std::thread control([&] { set(host, load.id, firLoad(64, load.channel)); });
        while (load.filterBusy == 0) std::this_thread::yield();
        CHECK_EQ(load.length, 128);
        CHECK_EQ(context.processStop, 0);
        CHECK_EQ(context.recordStop, 0);
        load.blockBusy = 0;
        control.join();
        CHECK_EQ(load.filterBusy, 0);
        CHECK_EQ(load.length, 64);
        CHECK_EQ(load.resetPending, 1);
        load.resetPending = 0;
        load.blockBusy = 1;
        CHECK(set(host, load.id, firLoad(64, load.channel)) > 0);  // would never come back if it waited
        CHECK_EQ(load.resetPending, 0);
        load.blockBusy = 0;
        load.otherBusy = 1;
        CHECK(set(host, load.id, firLoad(32, load.channel)) > 0);
        load.otherBusy = 0;
    }
}

TEST_CASE("single-channel pink noise waits for the process function without raising a stop") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    LibraryContext &context = host.context();
    context.processBusy = 1;
    context.recordBusy = 1;
    std::atomic<bool> started{false};
    std::thread control([&] {
        started = true;
        set(host, -17, {1});
    });
    while (!started.load()) std::this_thread::yield();
    for (int i = 0; i < 1000; ++i) std::this_thread::yield();
    CHECK_EQ(context.singleChannelPinkNoise, 0);
    CHECK_EQ(context.processStop, 0);
    context.processBusy = 0;
    control.join();
    CHECK_EQ(context.singleChannelPinkNoise, 1);
    context.recordBusy = 0;
}

TEST_CASE("enables, component routing and parameters of the engine wait for nobody") {
    HostInstance host;
    host.setFormat(formatOf(0x3));
    host.context().processBusy = 1;
    host.context().recordBusy = 1;
    for (const int32_t id : {-15, -13, -6, -26, 40}) set(host, id, {1});
    CHECK_EQ(host.context().processFirEnable, 1);
    CHECK_EQ(host.context().recordFirEnable[0], 1);
    CHECK_EQ(host.context().componentOnISST[0], 1);
    host.context().processBusy = 0;
    host.context().recordBusy = 0;
}
