// SPDX-License-Identifier: MIT
//
// The handshake between block functions and control calls, under load. What it guards is plain memory, so under the thread
// sanitizer any overlap is a report; elsewhere the test looks for torn pairs.
#include "host/handshake.h"

#include <doctest/doctest.h>

#include <atomic>
#include <thread>

#include "tests/support/host_instance.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

// Two plain words that a control call changes together while it holds the blocks up.
struct Guarded {
    uint64_t first = 0;
    uint64_t second = 0;
};

void runBlocks(const HostInstance &host, const std::atomic<bool> &end, std::atomic<uint64_t> &blocks) {
    Block block(64);
    const IOFormat format = formatOf(0x3, 32);
    while (!end.load()) {
        host.process(block, format, format);
        ++blocks;
    }
}

}  // namespace

TEST_CASE("once a control call has the block path held up, no block touches what it guards") {
    HostInstance host;
    host.setFormat(formatOf(0x3, 32));
    Guarded guarded;
    std::atomic<uint64_t> torn{0};
    host.engine().onProcess = [&](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) {
        if (guarded.first != guarded.second) ++torn;
        ++guarded.first;
        ++guarded.second;
    };
    host.engine().onControl = [&] {
        ++guarded.first;
        if (guarded.second + 1 != guarded.first) ++torn;
        ++guarded.second;
    };
    std::atomic<bool> end{false};
    std::atomic<uint64_t> blocks{0};
    std::thread render([&] { runBlocks(host, end, blocks); });
    uint64_t calls = 0;
    while (blocks.load() < 200000 || calls < 20000) {
        VXDSPAPI_CreateComponent(host.handle, 1, 1, 48000, 48000);
        ++calls;
    }
    end = true;
    render.join();
    CHECK_EQ(torn.load(), 0);
    CHECK_EQ(guarded.first, guarded.second);
}

TEST_CASE("control calls of several threads hold the block path up one after the other") {
    HostInstance host;
    host.setFormat(formatOf(0x3, 32));
    std::atomic<int> inside{0};
    std::atomic<uint64_t> together{0};
    uint64_t plain = 0;
    host.engine().onProcess = [&](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) { ++plain; };
    std::atomic<bool> end{false};
    std::atomic<uint64_t> blocks{0};
    std::thread render([&] { runBlocks(host, end, blocks); });
    std::vector<std::thread> controls;
    for (int i = 0; i < 3; ++i) {
        controls.emplace_back([&] {
            for (int round = 0; round < 5000; ++round) {
                const BlockHold hold(host.context());
                if (inside.fetch_add(1) != 0) ++together;
                ++plain;
                inside.fetch_sub(1);
            }
        });
    }
    for (std::thread &control : controls) control.join();
    end = true;
    render.join();
    CHECK_EQ(together.load(), 0);
    CHECK_EQ(plain >= 15000, true);
}

TEST_CASE("freeing while blocks run waits for the last one and leaves both stops up until the context goes") {
    for (int round = 0; round < 50; ++round) {
        HostInstance host;
        host.setFormat(formatOf(0x3, 32));
        std::atomic<bool> started{false};
        std::atomic<bool> freed{false};
        std::atomic<bool> late{false};
        host.engine().onProcess = [&](VXEngineHandle, ProcessBuffers *, IOFormat *, IOFormat *) {
            started = true;
            if (freed.load()) late = true;
        };
        host.engine().onControl = [&] { freed = host.context().processStop == 1 && host.context().recordStop == 1; };
        // The block thread ends by itself before the memory goes: a block may not begin behind the call.
        std::atomic<bool> end{false};
        std::atomic<uint64_t> blocks{0};
        std::thread render([&] { runBlocks(host, end, blocks); });
        while (!started.load()) std::this_thread::yield();
        stopBlocks(host.context().processStop, host.context().processBusy);
        const uint64_t seen = blocks.load();
        while (blocks.load() < seen + 3) std::this_thread::yield();
        end = true;
        render.join();
        host.free();
        CHECK(freed.load());
        CHECK_FALSE(late.load());
    }
}

TEST_CASE("rates and silence count change under the handshake without a race") {
    HostInstance host;
    host.setFormat(formatOf(0x3, 32));
    std::atomic<bool> end{false};
    std::atomic<uint64_t> blocks{0};
    std::thread render([&] { runBlocks(host, end, blocks); });
    for (int i = 0; blocks.load() < 20000 || i < 2000; ++i) VXDSPAPI_CreateComponent(host.handle, 0, -1, 48000 + i % 2, 48000);
    end = true;
    render.join();
    CHECK(host.context().sampleRate >= 48000);
}
