// SPDX-License-Identifier: MIT
//
// The host's loops over samples, one set for each instruction set. All sets give the same bits. The table is chosen when the
// library is loaded; SSE2 stands there from the beginning, so that no call ever meets an empty one.
//
// Counts may be 0 or negative, which does nothing. Buffers need no alignment.
#pragma once

#include <cstdint>

#include "host/fold_plan.h"
#include "measure/instruction_set.h"

namespace vxcomn {

struct HostKernels {
    // Adds each destination's sources to it, product and sum each rounded to f32, in the plan's order. No destination overlaps any
    // other buffer.
    void (*fold)(float *const *channels, const FoldPlan &plan, int frames);
    // f32 to a 24-bit sample, x 8388608 truncated and clamped, shifted left by 8. What no 32-bit integer holds becomes -8388608.
    void (*toProcessWords)(const float *samples, int32_t *words, int count);
    // The same, shifted left by 6.
    void (*toRecordWords)(const float *samples, int32_t *words, int count);
    // A word's upper 24 bits to f32, x 2 to the power -23.
    void (*fromProcessWords)(const int32_t *words, float *samples, int count);
    // Writes zeros.
    void (*zero)(float *samples, int count);
};

extern const HostKernels kHostKernelsSse2;
extern const HostKernels kHostKernelsAvx2;
extern const HostKernels kHostKernelsAvx512;

namespace detail {
extern const HostKernels *chosenHostKernels;
}

// The table in use. [any]
[[gnu::always_inline]] inline const HostKernels &hostKernels() noexcept {
    return *detail::chosenHostKernels;
}

// The table of an instruction set that this machine has. [control]
const HostKernels &hostKernelsOf(InstructionSet set) noexcept;

// Puts another table to use, for comparing. [control, no block runs]
void selectHostKernels(InstructionSet set) noexcept;

}  // namespace vxcomn
