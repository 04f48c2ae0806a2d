// SPDX-License-Identifier: MIT
//
// The bare memory traffic of the host's kernels, with the same registers and without the arithmetic: what a kernel would take if
// computing were free. One set for each instruction set.
#pragma once

#include <cstdint>

#include "measure/instruction_set.h"

namespace vxcomn::bench {

struct Bare {
    // Loads all planes.
    void (*load)(float *const *planes, int count, int frames);
    // Loads eight planes and stores the first two, as a fold to stereo has to.
    void (*foldTraffic)(float *const *planes, int frames);
    // Loads a plane of samples and stores words, loads the words and stores samples.
    void (*thereAndBack)(float *samples, int32_t *words, int frames);
};

extern const Bare kBareSse2;
extern const Bare kBareAvx2;
extern const Bare kBareAvx512;

inline const Bare &bareOf(InstructionSet set) {
    return set == InstructionSet::avx512 ? kBareAvx512 : set == InstructionSet::avx2 ? kBareAvx2 : kBareSse2;
}

}  // namespace vxcomn::bench
