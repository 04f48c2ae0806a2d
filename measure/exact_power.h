// SPDX-License-Identifier: MIT
//
// Powers and exponentials to the last bit, for the constants that control calls work out: band edges, decay factors. As with the
// sine, the C libraries' last bits differ between platforms, and these values decide what every later block sounds like. [control]
#pragma once

namespace vxcomn {

// 2 to the power 1/n, the nearest f64. n from 1 to 128.
double rootOfTwo(int n) noexcept;

// 1e-5 to a power, the nearest f32.
float powerOfOneHundredThousandth(double exponent) noexcept;

// e to a power, the nearest f32.
float exactExponential(double exponent) noexcept;

}  // namespace vxcomn
