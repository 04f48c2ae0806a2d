// SPDX-License-Identifier: MIT
//
// A long run: hours of audio in accelerated blocks through render and capture, while a second thread toggles modes at random. Every
// sample stays a number, the frame count stays exact across 2^32, and the process does not grow. A few minutes of audio by default,
// `soak --hours 30` for the whole of it.
#include <CLI/CLI.hpp>

#include <atomic>
#include <cmath>
#include <cstdio>
#include <random>
#include <thread>

#include "tests/support/host_instance.h"
#include "tests/support/memory_use.h"
#include "tests/support/random_control.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr int kRate = 48000;
constexpr int kFrames = 480;
constexpr uint64_t kWrapOf32Bits = uint64_t{1} << 32;
// What buffers of changing sizes leave behind in the heap.
constexpr uint64_t kGrowthAllowed = 24u << 20;

// A block's channels, looked at as a whole: a sum is a number only if all its terms are.
bool isWhole(Block &block, int channels) {
    float sum = 0.0F;
    for (int c = 0; c < channels; ++c) {
        for (int i = 0; i < kFrames; ++i) sum += block.slot(c)[i] * 0.0F;
    }
    return sum == 0.0F;
}

struct Run {
    uint64_t blocks;
    uint32_t seed;
    uint64_t damaged = 0;
    uint64_t memoryAfterWarmUp = 0;
    uint64_t memoryAtEnd = 0;
    uint64_t steps = 0;
    uint64_t firstCount = 0;
    uint64_t lastCount = 0;
};

void playBlocks(VXHandle handle, Run &run) {
    Block block;
    IOFormat input = formatOf(0x3F, kFrames, kRate);
    IOFormat output = input;
    Block noise;
    noise.fillNoise(run.seed);
    for (uint64_t n = 0; n < run.blocks; ++n) {
        if (n == run.blocks / 4) run.memoryAfterWarmUp = memoryInUse();
        block = noise;
        VXDSPAPI_Process(handle, &block.buffers, &input, &output);
        if (!isWhole(block, 6)) ++run.damaged;
        // What was rendered is what the microphone hears.
        VXDSPAPI_Record(handle, &block.buffers, &output);
        if (!isWhole(block, 4)) ++run.damaged;
    }
    run.memoryAtEnd = memoryInUse();
}

void soak(VXHandle handle, Run &run) {
    LibraryContext &context = **static_cast<LibraryContext **>(handle);
    IOFormat input = formatOf(0x3F, kFrames, kRate);
    IOFormat output = input;
    VXDSPAPI_SetIOFormat(handle, &input, &output);
    // A short run begins so far below 2^32 that it crosses in its middle; a long one gets there by itself.
    const uint64_t frames = run.blocks * kFrames;
    run.firstCount = frames > kWrapOf32Bits ? 0 : kWrapOf32Bits - frames / 2;
    context.totalFrames = run.firstCount;
    RandomControl control(handle, run.seed);
    std::atomic<bool> end{false};
    std::thread toggles([&] {
        while (!end.load()) {
            control.step();
            ++run.steps;
            std::this_thread::sleep_for(std::chrono::microseconds(500));
        }
    });
    playBlocks(handle, run);
    end = true;
    toggles.join();
    run.lastCount = context.totalFrames;
    VXDSPAPI_FreeLibrary(handle);
}

// Prints what was found; the number of faults.
int report(const Run &run) {
    int faults = 0;
    const auto check = [&faults](bool good, const char *what) {
        std::printf("%-5s %s\n", good ? "ok" : "FAULT", what);
        if (!good) ++faults;
    };
    const uint64_t frames = run.blocks * kFrames;
    const uint64_t growth = run.memoryAtEnd > run.memoryAfterWarmUp ? run.memoryAtEnd - run.memoryAfterWarmUp : 0;
    std::printf("%.2f hours, %llu blocks, %llu control calls, %llu KiB more memory than after the warm-up\n",
                static_cast<double>(frames) / kRate / 3600.0, static_cast<unsigned long long>(run.blocks),
                static_cast<unsigned long long>(run.steps), static_cast<unsigned long long>(growth >> 10));
    check(run.damaged == 0, "every sample is a number");
    check(run.lastCount == run.firstCount + frames, "the frame count is exact");
    check(run.lastCount > kWrapOf32Bits, "the frame count went past 2^32");
    check(growth <= kGrowthAllowed, "the process does not grow");
    check(run.steps > 0, "modes were toggled");
    return faults;
}

}  // namespace

int main(int argc, char **argv) {
    CLI::App app("Runs hours of audio through a host instance while modes change at random.");
    double hours = 0.25;
    uint32_t seed = 1;
    app.add_option("--hours", hours, "hours of audio")->check(CLI::Range(0.001, 10000.0))->capture_default_str();
    app.add_option("--seed", seed, "seed of the audio and of the toggles")->capture_default_str();
    CLI11_PARSE(app, argc, argv);

    std::printf("soak --hours %g --seed %u\n", hours, seed);
    constexpr int32_t kHostType = 3;
    VXHandle handle = VXDSPAPI_InitializeLibrary("SampleEngine", nullptr, 0, nullptr, nullptr, kRate, kHostType);
    if (handle == nullptr) {
        std::fprintf(stderr, "soak: no SampleEngine beside this program\n");
        return 2;
    }
    Run run{static_cast<uint64_t>(hours * 3600.0 * kRate / kFrames), seed};
    soak(handle, run);
    return report(run) == 0 ? 0 : 1;
}
