// SPDX-License-Identifier: MIT
//
// FftFirFilter while one thread filters and another loads. Meant for the thread sanitizer too.
#include <atomic>
#include <bit>
#include <chrono>
#include <cstdint>
#include <thread>

#include "tests/measure/fir_fixture.h"

namespace {

using fir::Filter;

constexpr int kBlock = 480;

std::vector<float> blockThrough(FftFirFilter &filter, const std::vector<float> &in) {
    std::vector<float> out(in.size());
    filter.process(in.data(), out.data(), static_cast<int>(in.size()));
    return out;
}

bool sameBits(const std::vector<float> &a, const std::vector<float> &b) {
    for (size_t i = 0; i < a.size(); ++i) {
        if (std::bit_cast<uint32_t>(a[i]) != std::bit_cast<uint32_t>(b[i])) return false;
    }
    return true;
}

}  // namespace

TEST_CASE("during reloads of equal length each block is the old filter's or the new one's, never a mix") {
    for (const int count : {4, 600, 2000}) {
        CAPTURE(count);
        std::mt19937 random(16);
        const std::vector<float> taps[2] = {fir::randomValues(random, count), fir::randomValues(random, count)};
        const std::vector<float> in = fir::randomValues(random, kBlock);
        std::vector<float> expected[2];
        for (int i = 0; i < 2; ++i) {
            Filter alone(taps[i]);
            expected[i] = blockThrough(alone, in);
        }

        Filter filter(taps[0]);
        std::atomic<bool> stop{false};
        std::atomic<int> loads{0};
        std::thread loader([&] {
            while (!stop.load()) {
                filter.load(taps[(loads.load() + 1) % 2].data(), count, 48000);
                ++loads;
            }
        });
        int seen[2] = {};
        int mixed = 0;
        const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
        // At least this much of everything, however the threads are scheduled.
        while ((seen[0] < 50 || seen[1] < 50 || seen[0] + seen[1] < 1500 || loads.load() < 200) &&
               std::chrono::steady_clock::now() < end) {
            filter.clearOverlap();
            const std::vector<float> out = blockThrough(filter, in);
            if (sameBits(out, expected[0]))
                ++seen[0];
            else if (sameBits(out, expected[1]))
                ++seen[1];
            else
                ++mixed;
        }
        stop = true;
        loader.join();
        CHECK_EQ(mixed, 0);
        CHECK_GE(seen[0], 50);
        CHECK_GE(seen[1], 50);
        CHECK_GE(loads.load(), 200);
    }
}

TEST_CASE("reloads of other lengths during blocks, without a pause, stay inside memory") {
    std::mt19937 random(17);
    const std::vector<float> taps = fir::randomValues(random, 1024);
    const std::vector<float> in = fir::randomValues(random, kBlock);
    Filter filter;
    std::atomic<bool> stop{false};
    std::thread loader([&] {
        std::mt19937 choice(18);
        while (!stop.load()) filter.load(taps.data(), static_cast<int>(choice() % 5 == 0 ? 0 : choice() % 1025), 48000);
    });
    int changed = 0;
    int passed = 0;
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while ((changed < 200 || passed < 5) && std::chrono::steady_clock::now() < end) {
        filter.clearOverlap();
        std::vector<float> block = in;
        filter.process(block.data(), block.data(), kBlock);
        ++(sameBits(block, in) ? passed : changed);
    }
    stop = true;
    loader.join();
    CHECK_GE(changed, 200);
    CHECK_GE(passed, 5);
}
