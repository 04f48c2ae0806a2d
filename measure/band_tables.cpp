// SPDX-License-Identifier: MIT
#include "measure/band_tables.h"

#include "measure/exact_power.h"

namespace vxcomn {
namespace {

constexpr double kUpperLimit = 24000.0;                  // Hz
constexpr double kReference = 7.8125;                    // 1000 / 128 Hz, so that each table has a centre at 1000 Hz exactly
constexpr double kShiftedReference = 9.290680585958757;  // a quarter octave above

BandTable build(int n, double reference) {
    const double ratio = rootOfTwo(n);
    BandTable table;
    int edges = 0, centres = 0;
    double edge = rootOfTwo(2 * n) * reference, centre = reference;
    // The reference itself never becomes a centre: the first edge is its own upper one.
    for (bool first = true; edge <= kUpperLimit; edge *= 2.0, centre *= 2.0, first = false) {
        table.edges[edges++] = static_cast<float>(edge);
        if (!first) table.centres[centres++] = static_cast<float>(centre);
        for (double k = ratio; k < 2.0; k *= ratio) {
            if (k * edge > kUpperLimit) break;
            table.edges[edges++] = static_cast<float>(k * edge);
            table.centres[centres++] = static_cast<float>(k * centre);
        }
    }
    table.size = edges;
    return table;
}

struct Entry {
    int bandsPerOctave;
    BandTable table;
};

// The first stands for every number that isn't listed.
const Entry tables[7] = {{1, build(1, kReference)},          {3, build(3, kReference)},   {6, build(6, kReference)},
                         {12, build(12, kReference)},        {24, build(24, kReference)}, {48, build(48, kReference)},
                         {-24, build(24, kShiftedReference)}};

}  // namespace

void BandTables::select(int bandsPerOctave, const float **edges, const float **centres, int *size) noexcept {
    const BandTable *found = &tables[0].table;
    for (const Entry &entry : tables) {
        if (entry.bandsPerOctave == bandsPerOctave) found = &entry.table;
    }
    if (edges != nullptr) *edges = found->edges;
    if (centres != nullptr) *centres = found->centres;
    if (size != nullptr) *size = found->size;
}

}  // namespace vxcomn
