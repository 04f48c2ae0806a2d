// SPDX-License-Identifier: MIT
//
// The fast forms of the FIR filter's block, one for each instruction set. All give the bits of the plain form.
//
// A kernel has its own order of the response and its own tables; both are made for it by control calls.
#pragma once

#include <cstddef>

#include "measure/fir_twiddles.h"
#include "measure/instruction_set.h"

namespace vxcomn {

struct FirKernelTables {};
struct FirBlock;

struct FirKernels {
    int minLog2Size;
    size_t (*scratchValues)(int log2Size);
    void (*arrangeResponse)(const double *response, double *arranged, int log2Size);
    void (*process)(const FirBlock &block) noexcept;
};

const FirKernels *firKernels(int log2Size) noexcept;

}  // namespace vxcomn
