// SPDX-License-Identifier: MIT
//
// The twiddle factors of the FIR filter's transform, one table for each size, and the transform itself in its plain form.
//
// The transform is a complex radix-2 one in double precision, and its twiddles are what a recurrence makes of them, rounding errors
// and all. They are part of the result's bits, so every faster form reads them from here. A table is drawn once by the first filter
// of its size, on a control thread, and stays until the process ends: blocks read it without a lock.
#pragma once

#include <memory>

#include "measure/realtime.h"

namespace vxcomn {

inline constexpr int kFirMaxLog2Size = 13;  // twice VX_MAX_FIR_TAPS

// One direction of one size. Stage l (1, 2, 4, ... size / 2) has l factors, at the indexes l to 2 l - 1.
struct FirTwiddles {
    std::unique_ptr<double[]> real;
    std::unique_ptr<double[]> imaginary;
};

struct FirTwiddlePair {
    FirTwiddles forward;
    FirTwiddles inverse;
};

// The table of the size 2^log2Size; 1 to kFirMaxLog2Size. [control; locks and, the first time, allocates]
const FirTwiddlePair &firTwiddles(int log2Size);

// Transforms 2^log2Size interleaved complex values in place, without the division that follows an inverse transform.
VXCOMN_RT void firTransform(double *values, int log2Size, const FirTwiddles &twiddles) noexcept;

}  // namespace vxcomn
