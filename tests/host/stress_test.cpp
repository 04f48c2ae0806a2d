// SPDX-License-Identifier: MIT
//
// Blocks, captures and every control call at once. What they share is plain memory behind handshakes, so under the thread sanitizer
// any overlap is a report; elsewhere the test looks for a torn or lost block. VXCOMN_STRESS_SECONDS sets how long it runs.
#include <doctest/doctest.h>

#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdlib>
#include <thread>

#include "tests/support/host_instance.h"
#include "tests/support/random_control.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

std::chrono::seconds duration() {
    const char *text = std::getenv("VXCOMN_STRESS_SECONDS");
    const int seconds = text == nullptr ? 0 : std::atoi(text);
    return std::chrono::seconds(seconds > 0 ? seconds : 4);
}

// The first sample of a channel that is no number, or -1.
int notANumber(Block &block, int channels, int frames) {
    for (int c = 0; c < channels; ++c) {
        for (int i = 0; i < frames; ++i) {
            if (!std::isfinite(block.slot(c)[i])) return i;
        }
    }
    return -1;
}

}  // namespace

TEST_CASE("blocks, captures and every command at once leave the audio whole and the counters exact") {
    constexpr int32_t kHostType = 3;
    VXHandle handle = VXDSPAPI_InitializeLibrary("SampleEngine", nullptr, 0, nullptr, nullptr, 48000, kHostType);
    REQUIRE(handle != nullptr);
    IOFormat input = formatOf(0x33);
    IOFormat output = formatOf(0x33);
    VXDSPAPI_SetIOFormat(handle, &input, &output);
    std::atomic<bool> end{false};
    std::atomic<uint64_t> damaged{0};
    uint64_t rendered = 0;
    uint64_t captured = 0;
    std::thread render([&] {
        Block block;
        for (uint32_t n = 0; !end.load(); ++n) {
            block.fillNoise(n);
            IOFormat in = formatOf(0x33, 32 + static_cast<int>(n % 480));
            IOFormat out = in;
            VXDSPAPI_Process(handle, &block.buffers, &in, &out);
            rendered += static_cast<uint64_t>(in.frames);
            if (notANumber(block, 4, in.frames) >= 0) ++damaged;
            std::this_thread::yield();
        }
    });
    std::thread capture([&] {
        Block block;
        for (uint32_t n = 0; !end.load(); ++n) {
            block.fillNoise(n);
            IOFormat format = formatOf(0x33, 32 + static_cast<int>(n % 480));
            VXDSPAPI_Record(handle, &block.buffers, &format);
            ++captured;
            if (notANumber(block, 4, format.frames) >= 0) ++damaged;
            std::this_thread::yield();
        }
    });
    uint64_t steps[2] = {};
    // The capture rings point into these until the instance is gone.
    RandomControl controls[2] = {{handle, 1}, {handle, 2}};
    std::thread controllers[2];
    for (int i = 0; i < 2; ++i) {
        controllers[i] = std::thread([&, i] {
            while (!end.load()) {
                controls[i].step();
                ++steps[i];
                // Calls in bursts, so that the blocks get their turns between.
                if (steps[i] % 16 == 0) std::this_thread::sleep_for(std::chrono::milliseconds(1));
            }
        });
    }
    std::this_thread::sleep_for(duration());
    end = true;
    for (std::thread &controller : controllers) controller.join();
    render.join();
    capture.join();
    const LibraryContext &context = **static_cast<LibraryContext **>(handle);
    CHECK_EQ(damaged.load(), 0);
    CHECK_EQ(context.totalFrames, rendered);
    CHECK(captured > 0);
    CHECK(steps[0] > 0);
    CHECK(steps[1] > 0);
    CHECK_EQ(context.processStop, 0);
    CHECK_EQ(context.recordStop, 0);
    CHECK_EQ(context.processBusy, 0);
    CHECK_EQ(context.recordBusy, 0);
    MESSAGE(rendered << " frames rendered, " << captured << " blocks captured, " << steps[0] + steps[1] << " control calls");
    CHECK(VXDSPAPI_FreeLibrary(handle) != 0);
}
