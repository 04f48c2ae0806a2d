// SPDX-License-Identifier: MIT
#include "measure/band_tables.h"

#include <doctest/doctest.h>

#include <cmath>

using namespace vxcomn;

namespace {

struct Figures {
    int bandsPerOctave, size;
    double firstEdge, lastEdge, firstCentre;
};

}  // namespace

TEST_CASE("the seven tables have their known sizes, edges and centres") {
    for (const Figures &figures : {Figures{1, 12, 11.0485, 22627.418, 15.625}, Figures{3, 35, 8.7692, 22627.418, 9.8431},
                                   Figures{6, 70, 8.2771, 23972.914, 8.7692}, Figures{12, 139, 8.0414, 23290.451, 8.2771},
                                   Figures{24, 278, 7.9261, 23629.219, 8.0414}, Figures{48, 556, 7.8691, 23800.445, 7.9261},
                                   Figures{-24, 272, 9.4258, 23629.219, 9.5629}}) {
        CAPTURE(figures.bandsPerOctave);
        const float *edges = nullptr, *centres = nullptr;
        int size = 0;
        BandTables::select(figures.bandsPerOctave, &edges, &centres, &size);
        REQUIRE(size == figures.size);
        CHECK(std::fabs(edges[0] - figures.firstEdge) < 0.00006);
        CHECK(std::fabs(edges[size - 1] - figures.lastEdge) < 0.0006);
        CHECK(std::fabs(centres[0] - figures.firstCentre) < 0.00006);
    }
}

TEST_CASE("edges and centres rise, and each centre lies between its two edges") {
    for (const int bands : {1, 3, 6, 12, 24, 48, -24}) {
        const float *edges = nullptr, *centres = nullptr;
        int size = 0;
        BandTables::select(bands, &edges, &centres, &size);
        for (int i = 0; i + 1 < size; ++i) {
            REQUIRE(edges[i] < centres[i]);
            REQUIRE(centres[i] < edges[i + 1]);
        }
    }
}

TEST_CASE("each table but the shifted one has a centre at 1000 Hz exactly") {
    for (const int bands : {1, 3, 6, 12, 24, 48}) {
        const float *centres = nullptr;
        int size = 0;
        BandTables::select(bands, nullptr, &centres, &size);
        bool found = false;
        for (int i = 0; i + 1 < size; ++i) found = found || centres[i] == 1000.0F;
        CHECK(found);
    }
}

TEST_CASE("each entry of a table is its power of two to the last bit but one") {
    for (const int n : {1, 3, 6, 12, 24, 48}) {
        const float *edges = nullptr, *centres = nullptr;
        int size = 0;
        BandTables::select(n, &edges, &centres, &size);
        for (int i = 0; i < size; ++i) {
            const double edge = 7.8125 * std::pow(2.0, (i + 0.5) / n);
            REQUIRE(std::fabs(edges[i] / edge - 1.0) < 0x1p-23);
            if (i + 1 < size) REQUIRE(std::fabs(centres[i] / (7.8125 * std::pow(2.0, (i + 1.0) / n)) - 1.0) < 0x1p-23);
        }
    }
}

TEST_CASE("2, 0 and every other number select one band per octave without complaint") {
    const float *one = nullptr;
    BandTables::select(1, &one, nullptr, nullptr);
    for (const int bands : {2, 0, -1, -3, -48, 5, 7, 96, 2147483647, -2147483647 - 1}) {
        const float *edges = nullptr;
        int size = 0;
        BandTables::select(bands, &edges, nullptr, &size);
        CHECK(edges == one);
        CHECK(size == 12);
    }
}
