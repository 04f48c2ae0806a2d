// SPDX-License-Identifier: MIT
//
// Truncation to whole samples for durations that come from outside: what doesn't fit stops at the end of the range, and NaN is 0.
// Sums of two such 64-bit counts fit as well. [any]
#pragma once

#include <cstdint>

namespace vxcomn {

constexpr int64_t truncateToSamples(double value) {
    constexpr double kLimit = 0x1p60;
    if (!(value > -kLimit)) return value <= -kLimit ? -(int64_t{1} << 60) : 0;
    return value < kLimit ? static_cast<int64_t>(value) : int64_t{1} << 60;
}

constexpr int32_t truncateToInt32(double value) {
    if (!(value > -2147483648.0)) return value <= -2147483648.0 ? INT32_MIN : 0;
    return value < 2147483647.0 ? static_cast<int32_t>(value) : INT32_MAX;
}

}  // namespace vxcomn
