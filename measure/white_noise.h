// SPDX-License-Identifier: MIT
//
// The white test signal. One seed serves the whole process: instances and channels draw consecutive stretches of one sequence.
// Real-time safe; two render threads at once may draw the same stretch, which no listener minds.
#pragma once

#include <cstdint>

namespace vxcomn {

// Writes `count` samples, above 0 and up to 2.
// Kept: the signal is not centred; its mean is +1.0.
void fillWhite(float *samples, int count) noexcept;

// Puts the seed, 1 at load, to a value from 1 to 2^31 - 2. For tests that repeat a sequence.
void seedWhite(uint32_t seed) noexcept;

}  // namespace vxcomn
