// SPDX-License-Identifier: MIT
//
// Turns a linear power spectrum into the bands of a table: interpolated at a band's centre, or integrated between its edges. The
// exported functions of this name give applications the same on spectra of their own. [control]
#pragma once

namespace vxcomn {

// power: halfSize + 1 values. edges: tableSize values, centres and bands: one less. sampleRate in Hz.
// A band that begins below 0 Hz, or whose place is no number, keeps what its slot holds; with halfSize or sampleRate below 1 all
// do.
void integrateBands(const float *power, int halfSize, const float *edges, const float *centres, int tableSize, float *bands,
                    int sampleRate, bool integrate) noexcept;

}  // namespace vxcomn
