// SPDX-License-Identifier: MIT
//
// The parts of control_bench, and what they share.
#pragma once

#include <algorithm>
#include <vector>

#include "bench/support/require.h"

namespace vxcomn::bench {

inline double medianOf(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

void printOpeningFigures();
void printEnumerationFigures();
void printSliderFigures();

}  // namespace vxcomn::bench
