// SPDX-License-Identifier: MIT
//
// Where samples enter and leave the engine's f64 arithmetic; the one place that knows the build. The float build reads and writes
// f32 at full scale 1.0. The fixed-point build, chosen by VXCOMN_ENGINE_FIXED_POINT, finds 24-bit samples left-justified in 32-bit
// words behind the same pointers. Render thread.
#pragma once

#include <cstdint>

namespace sample_engine {

// What a stream may hold at most, 24 dB above full scale. Anything that is not a number counts as silence.
inline constexpr double kLargestInput = 16.0;

#ifdef VXCOMN_ENGINE_FIXED_POINT

using Sample = int32_t;

inline double readSample(Sample word) {
    return static_cast<double>(word >> 8) * (1.0 / 8388608.0);
}

inline Sample writeSample(double value) {
    const double scaled = value * 8388608.0;
    const double rounded = scaled < 0.0 ? scaled - 0.5 : scaled + 0.5;
    const int32_t whole = rounded >= 8388607.0 ? 8388607 : rounded > -8388608.0 ? static_cast<int32_t>(rounded) : -8388608;
    return static_cast<Sample>(static_cast<uint32_t>(whole) << 8);
}

inline constexpr bool kFixedPoint = true;

#else

using Sample = float;

inline double readSample(Sample sample) {
    const double value = static_cast<double>(sample);
    if (!(value == value)) return 0.0;
    return value < -kLargestInput ? -kLargestInput : value > kLargestInput ? kLargestInput : value;
}

inline Sample writeSample(double value) {
    return static_cast<float>(value);
}

inline constexpr bool kFixedPoint = false;

#endif

}  // namespace sample_engine
