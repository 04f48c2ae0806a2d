// SPDX-License-Identifier: MIT
//
// What stands behind the `plan` word of an FftFirFilter: all the memory of one filter length, and what a block needs to know of it.
// Made and freed by control calls; a block reads it. The record's pointers lead into this memory.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <new>

#include "measure/fir_kernels.h"
#include "measure/fir_twiddles.h"

namespace vxcomn {

// Doubles and floats on a cache line's border, for the widest registers.
struct AlignedRelease {
    void operator()(void *memory) const noexcept { ::operator delete (memory, std::align_val_t{64}); }
};
template <typename T>
using AlignedArray = std::unique_ptr<T[], AlignedRelease>;

// `count` zeros.
template <typename T>
AlignedArray<T> makeAlignedArray(size_t count) {
    AlignedArray<T> array(static_cast<T *>(::operator new (count * sizeof(T), std::align_val_t{64})));
    for (size_t i = 0; i < count; ++i) array[i] = T{};
    return array;
}

struct FirPlan {
    int32_t fftSize;  // the plan word itself, so it comes first
    int32_t log2Size;
    const FirTwiddlePair *twiddles;  // shared
    const FirKernels *kernels;       // null: this size is computed in the plain form
    const FirKernelTables *tables;   // shared; null without kernels
    AlignedArray<float> taps;
    AlignedArray<float> overlap;
    AlignedArray<double> work;
    // Two responses: one is in the record, the other is where the next one is made.
    AlignedArray<double> responses[2];
    int current;
};

static_assert(offsetof(FirPlan, fftSize) == 0);

}  // namespace vxcomn
