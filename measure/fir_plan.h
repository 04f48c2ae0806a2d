// SPDX-License-Identifier: MIT
//
// What stands behind the `plan` word of an FftFirFilter: all the memory of one filter length, and what a block needs to know of it.
// Made and freed by control calls; a block reads it. The record's pointers lead into this memory.
#pragma once

#include <cstddef>
#include <cstdint>

#include "measure/fir_kernel_tables.h"
#include "measure/fir_memory.h"
#include "measure/fir_twiddles.h"

namespace vxcomn {

struct FirPlan {
    int32_t fftSize;  // the plan word itself, so it comes first
    int32_t log2Size;
    const FirTwiddlePair *twiddles;  // shared
    const FirKernels *kernels;       // null: this size is computed in the plain form
    const FirKernelTables *tables;   // shared; null without kernels
    AlignedArray<float> taps;
    AlignedArray<float> overlap;
    AlignedArray<double> work;
    // Two responses: one is in the record, the other is where the next one is made. Each is followed by the kernels' arrangement.
    AlignedArray<double> responses[2];
    int current;
};

static_assert(offsetof(FirPlan, fftSize) == 0);

}  // namespace vxcomn
