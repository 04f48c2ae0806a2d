// SPDX-License-Identifier: MIT
//
// One sample of the second-order section, shared by the plain filter and the tracking one. The caller keeps the histories in locals
// for a block. Real-time safe.
#pragma once

#include "measure/realtime.h"

namespace vxcomn {

struct BiquadHistory {
    float x1, x2;
    double y1, y2;
};

// Kept: the feed-forward sum is f32, left to right; the feedback is f64, and its history isn't rounded to the sample that goes out.
VXCOMN_RT_INLINE float biquadStep(BiquadHistory &h, float b0, float b1, float b2, float a1, float a2, float x) {
    const float forward = b0 * x + b1 * h.x1 + b2 * h.x2;
    const double y = static_cast<double>(forward) - static_cast<double>(a1) * h.y1 - static_cast<double>(a2) * h.y2;
    h.x2 = h.x1;
    h.x1 = x;
    h.y2 = h.y1;
    h.y1 = y;
    return static_cast<float>(y);
}

}  // namespace vxcomn
