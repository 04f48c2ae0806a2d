// SPDX-License-Identifier: MIT
//
// The fast forms of the FIR filter's block, one for each instruction set. All give the bits of the plain form.
//
// Where their speed comes from is told in fir_kernels_impl.h. A kernel works on split planes in an order of its own, so it has its
// own tables (fir_kernel_tables.h) and its own arrangement of the response; control calls make both.
#pragma once

#include "measure/instruction_set.h"
#include "measure/realtime.h"

namespace vxcomn {

struct FirKernelTables;

// One call of `process`. No pointer is null, count is at least 1.
struct FirBlock {
    const float *in;
    float *out;  // may be `in`
    int count;
    float *overlap;          // size / 2 values
    double *work;            // firScratchValues() values, on a 64-byte border
    const double *response;  // as firArrangeResponse() put it
    const FirKernelTables *tables;
    int log2Size;
};

struct FirKernels {
    int lanes;        // doubles a register
    int group;        // the last `group` values of the transform are worked on within registers; a power of two
    int levels;       // the most stages that a pass fuses; 2 or 3
    int copies;       // how often the table of the forward factors has each value
    int minLog2Size;  // smaller transforms don't fill the registers
    void (*process)(const FirBlock &block) noexcept;
};

extern const FirKernels kFirKernelsSse2;
extern const FirKernels kFirKernelsAvx2;
extern const FirKernels kFirKernelsAvx512;

// The kernels for a filter of this size with the instruction set in use; null where the plain form serves best.
const FirKernels *firKernels(int log2Size) noexcept;

// Changes the instruction set of filters loaded from now on, for tests. The machine must have it.
void selectFirKernels(InstructionSet set) noexcept;

}  // namespace vxcomn
