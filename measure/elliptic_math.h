// SPDX-License-Identifier: MIT
//
// Elementary functions that give the same bits on every platform and compiler, for the filter design and the resampling of taps.
//
// The C libraries differ in the last bit of a sine, and one of them works in extended precision. These use nothing but additions,
// multiplications, divisions and square roots in double precision, and stay within about two units of the last place where they are
// used here (angles below a few thousand). They are for control calls: plain, not fast.
#pragma once

#include <emmintrin.h>

namespace vxcomn {

inline constexpr double kPi = 3.14159265358979323846;

double sine(double angle) noexcept;
double cosine(double angle) noexcept;
double tangent(double angle) noexcept;
double exponential(double power) noexcept;  // e to the power
double logarithm(double value) noexcept;    // natural; NaN below 0, -infinity at 0

// The machine's own square root: correctly rounded, on every platform.
inline double squareRoot(double value) noexcept {
    const __m128d wide = _mm_set_sd(value);
    return _mm_cvtsd_f64(_mm_sqrt_sd(wide, wide));
}

}  // namespace vxcomn
