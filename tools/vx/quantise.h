// SPDX-License-Identifier: MIT
//
// f32 samples to integer words: full scale 1.0 becomes 2^(bits - 1), halves go away from zero, what exceeds the words is held at
// their ends and what is no number becomes silence. No dither: the same samples give the same words.
#pragma once

#include <cstdint>

namespace vx {

inline int32_t quantise(float sample, int bits) {
    const double scale = static_cast<double>(int64_t{1} << (bits - 1));
    const double scaled = static_cast<double>(sample) * scale;
    if (!(scaled == scaled)) return 0;
    if (scaled >= scale - 1.0) return static_cast<int32_t>(scale - 1.0);
    if (scaled <= -scale) return static_cast<int32_t>(-scale);
    return static_cast<int32_t>(scaled < 0.0 ? scaled - 0.5 : scaled + 0.5);
}

}  // namespace vx
