// SPDX-License-Identifier: MIT
//
// The analyser's transform: a complex radix-2 Fourier transform in single precision whose twiddles come from a recurrence. The
// recurrence is drawn once for each stage, on the control thread that needs it first, and kept in tables that are shared and never
// change. [control]
#pragma once

namespace vxcomn {

// The twiddles of one stage: `half` of them, real and imaginary parts apart.
struct StageTwiddles {
    const float *real;
    const float *imaginary;
};

// The table for the stage whose butterflies lie `half` complex points apart, half a power of two. Null parts if memory is out.
StageTwiddles stageTwiddles(int half) noexcept;

// Transforms `size` complex points in place, interleaved, as the formulas are written. size is a power of two.
void transformInPlace(float *points, int size) noexcept;

// Puts the power of the bins 0 to size / 2 at the head of the transformed points.
void powerInPlace(float *points, int size) noexcept;

}  // namespace vxcomn
