// SPDX-License-Identifier: MIT
#include "tools/vx/load_statistics.h"

#include <doctest/doctest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

TEST_CASE("percentiles agree with a sorted list to 0.4 %, mean and maximum exactly") {
    std::mt19937_64 random(20240611);
    for (const double octaves : {3.0, 12.0, 30.0}) {
        vx::LoadStatistics load;
        std::vector<double> all;
        double sum = 0.0;
        for (int i = 0; i < 20000; ++i) {
            const double share = static_cast<double>(random() >> 11) * 0x1p-53;
            const auto ns = static_cast<uint64_t>(std::exp2(share * octaves));
            load.add(ns);
            all.push_back(static_cast<double>(ns));
            sum += static_cast<double>(ns);
        }
        std::sort(all.begin(), all.end());
        CHECK(load.meanNs() == sum / 20000.0);
        CHECK(load.maximumNs() == all.back());
        for (const double share : {0.5, 0.99, 0.999}) {
            const double exact = all[static_cast<size_t>(std::ceil(share * 20000.0)) - 1];
            CHECK(std::fabs(load.percentileNs(share) - exact) <= std::max(0.5, 0.004 * exact));
        }
        uint64_t blocks = 0;
        for (const vx::LoadBar &bar : load.histogram(8)) blocks += bar.blocks;
        CHECK(blocks == 20000);
    }
}

TEST_CASE("a run without blocks has no load and no bars") {
    const vx::LoadStatistics load;
    CHECK(load.meanNs() == 0.0);
    CHECK(load.percentileNs(0.99) == 0.0);
    CHECK(load.histogram(8).empty());
}

TEST_CASE("times beyond the counters count in the last one and keep their maximum") {
    vx::LoadStatistics load;
    load.add(UINT64_MAX / 2);
    CHECK(load.maximumNs() == static_cast<double>(UINT64_MAX / 2));
    CHECK(load.blocks() == 1);
    CHECK(load.percentileNs(0.5) > 6e10);
}
