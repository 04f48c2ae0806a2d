// SPDX-License-Identifier: MIT
//
// Sine and cosine to the last bit, one value at a time: for any argument, of any size, the result is the exact value rounded once.
// The generators use the vector kernels (measure/sine_lanes.h) and come here for the rare lane whose rounding those can't prove;
// control calls come here for twiddles and windows. The C library is not asked, because its last bits differ between platforms.
// Any thread, real-time safe.
#pragma once

namespace vxcomn {

// The f32 nearest to the sine of x. NaN for infinities and NaN.
float exactSine(double x) noexcept;

// The f64 nearest to the cosine of x. NaN for infinities and NaN.
double exactCosine(double x) noexcept;

}  // namespace vxcomn
