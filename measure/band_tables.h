// SPDX-License-Identifier: MIT
//
// The seven frequency tables of the analyser, which are also the law of the sweep. Built once while the library loads, read by
// every thread afterwards.
#pragma once

#include "vxcomn/measurement_records.h"

namespace vxcomn {

struct BandTable {
    int size = 0;                      // entries of edges; there is one centre less
    float edges[VX_MAX_BANDS] = {};    // Hz; band i runs from edges[i] to edges[i + 1]
    float centres[VX_MAX_BANDS] = {};  // Hz
};

class BandTables {
  public:
    // The table for 3, 6, 12, 24, 48 or -24 bands per octave (-24: shifted by a quarter octave); any other number gets one band per
    // octave. Each of the three results may be null.
    static void select(int bandsPerOctave, const float **edges, const float **centres, int *size) noexcept;
};

}  // namespace vxcomn
