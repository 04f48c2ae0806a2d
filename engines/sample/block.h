// SPDX-License-Identifier: MIT
//
// The working form of a block: f64 samples, two channels side by side in a register, one row for each frame. Every stage reads and
// writes it in place. Rows are filled from the channel buffers and written back by the sample edge (sample_edge.h), so no stage
// knows whether the engine is the float or the fixed-point build. The two lanes are independent, so the pairing changes no bit.
#pragma once

#include <vxcomn/block.h>

namespace sample_engine {

using Pair = double __attribute__((vector_size(16)));

inline constexpr int kMaxPairs = VX_SLOT_COUNT / 2;

inline Pair both(double value) {
    return Pair{value, value};
}

struct Block {
    Pair rows[VX_MAX_FRAMES][kMaxPairs];
    int pairs = 0;  // in use: pairs of slots with at least one speaker of the layout
};

// Calls `work` with the number of pairs as a compile-time constant, so that filter states can stay in registers.
template <class Work>
inline void withPairs(int pairs, Work &&work) {
    switch (pairs) {
        case 1:
            return work.template operator()<1>();
        case 2:
            return work.template operator()<2>();
        case 3:
            return work.template operator()<3>();
        case 4:
            return work.template operator()<4>();
        default:
            return;
    }
}

}  // namespace sample_engine
