// SPDX-License-Identifier: MIT
//
// The analyser's transform: a complex radix-2 Fourier transform in single precision whose twiddles come from a recurrence. The
// recurrence is drawn once for each stage, on the control thread that needs it first, and kept in tables that are shared and never
// change. [control]
#pragma once

#include "measure/kernels.h"

namespace vxcomn {

// The table for the stage whose butterflies lie `half` complex points apart, half a power of two. Null parts if memory is out.
StageTwiddles stageTwiddles(int half) noexcept;

// The plain form, for transforms that have no kernel and for frames that begin with an earlier one's leavings: clamps and windows
// the real slots of `size` interleaved points, clears all else, transforms them in place and puts the power of the bins 0 to size /
// 2 at their head.
void plainSpectrum(float *points, const float *window, int size, const StageTwiddles *stages) noexcept;

}  // namespace vxcomn
