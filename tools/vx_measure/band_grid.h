// SPDX-License-Identifier: MIT
//
// The frequency bands in which the library measures, by the rule of its tables: centres at 1000 Hz * 2^(k/n), edges half a band
// away, up to 24 kHz. The library hands its tables to nobody, so that whoever names a band's frequency works them out.
#pragma once

#include <string>
#include <vector>

namespace vx {

struct BandGrid {
    int bandsPerOctave = 0;
    std::vector<double> edges;  // band i runs from edges[i] to edges[i + 1]
    std::vector<double> centres;

    int bands() const { return static_cast<int>(centres.size()); }
    // "1/3 octave"
    std::string name() const { return bandsPerOctave == 1 ? "octave" : "1/" + std::to_string(bandsPerOctave) + " octave"; }
};

// For 1, 3, 6, 12, 24 or 48 bands an octave.
BandGrid makeBandGrid(int bandsPerOctave);

}  // namespace vx
