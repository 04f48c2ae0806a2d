// SPDX-License-Identifier: MIT
//
// The transform's twiddles in the order in which the kernels read them, and the layouts of their memory.
//
// The forward transform takes its input in natural order and leaves its output in bit-reversed order, the inverse one the other
// way round, so nothing is ever permuted. Forward stage l then sees l blocks; block b wants the factor whose index is b with its
// bits reversed, the same for the whole block. The inverse stage wants its factors in their own order, value by value.
#pragma once

#include "measure/fir_kernels.h"
#include "measure/fir_memory.h"

namespace vxcomn {

struct FirKernelTables {
    AlignedArray<double> forward;           // factor of block b of stage l: real and imaginary part, `copies` times each
    AlignedArray<double> middle;            // forward factors of the stages within a group, vector by vector as they are used
    AlignedArray<double> inverseReal;       // factor j of stage l at l + j
    AlignedArray<double> inverseImaginary;  // the same
};

// The inverse stages of the last pass. What is left, 2^(log2Size - levels) values, makes a row of the work memory. Large transforms
// have shorter rows, so that a row fits the first cache.
VXCOMN_RT_INLINE int firFinalLevels(const FirKernels &kernels, int log2Size) noexcept {
    const int most = log2Size >= 12 ? 3 : kernels.levels;
    int levels = 0;
    while (levels < most && (kernels.group << (levels + 1)) <= (1 << log2Size)) ++levels;
    return levels;
}

// A row holds the real parts, a gap, the imaginary parts, a gap: eight rows start in different sets of a cache of 4 KiB ways.
inline constexpr int kFirRowGap = 8;

VXCOMN_RT_INLINE int firRowStride(int rowLength) noexcept {
    return 2 * (rowLength + kFirRowGap);
}

// Doubles that `work` holds: the rows, the widened input twice (half the size each), and the output before it is rounded.
int firScratchValues(const FirKernels &kernels, int log2Size) noexcept;

// The tables of one size. [control; locks and, the first time, allocates]
const FirKernelTables &firKernelTables(const FirKernels &kernels, int log2Size);

// Writes the interleaved response of natural order as the kernels want it. Both have 2^log2Size complex values. [control]
void firArrangeResponse(const FirKernels &kernels, int log2Size, const double *response, double *arranged) noexcept;

}  // namespace vxcomn
