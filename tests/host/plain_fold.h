// SPDX-License-Identifier: MIT
//
// The fold-down written out plainly, rule after rule and sample after sample: the judge of the kernels and of the plans.
#pragma once

#include <cstdint>

namespace vxcomn::testing {

inline void plainAdd(float *to, const float *from, float coefficient, int frames) {
    for (int t = 0; t < frames; ++t) {
        volatile float product = from[t] * coefficient;
        volatile float sum = to[t] + product;
        to[t] = sum;
    }
}

inline void plainFold(float *const *slot, uint32_t m, int n) {
    float *const FL = slot[0], *const FR = slot[1], *const FC = slot[2], *const LFE = slot[3];
    float *const BL = slot[4], *const BR = slot[5], *const SL = slot[6], *const SR = slot[7];
    const auto has = [m](uint32_t bits) { return (m & bits) == bits; };
    const auto one = [n](float *to, const float *from, float c) { plainAdd(to, from, c, n); };
    const auto two = [n](float *a, float *b, const float *from, float c) {
        plainAdd(a, from, c, n);
        plainAdd(b, from, c, n);
    };
    const float side = 0.7083F;
    const float half = 0.5F;
    if (m == 0) return one(FL, FR, 1.0F);

    if (!has(0x1)) {
        if (has(0x200))
            one(SL, FL, side);
        else if (has(0x10))
            one(BL, FL, side);
        else if (has(0x4))
            one(FC, FL, half);
        else if (has(0x8))
            one(LFE, FL, half);
    }
    if (!has(0x2)) {
        if (has(0x400))
            one(SR, FR, side);
        else if (has(0x20))
            one(BR, FR, side);
        else if (has(0x4))
            one(FC, FR, half);
        else if (has(0x8))
            one(LFE, FR, half);
    }
    if (!has(0x200)) {
        if (has(0x1))
            one(FL, SL, side);
        else if (has(0x10))
            one(BL, SL, side);
        else if (has(0x4))
            one(FC, SL, half);
        else if (has(0x8))
            one(LFE, SL, half);
    }
    if (!has(0x400)) {
        if (has(0x2))
            one(FR, SR, side);
        else if (has(0x20))
            one(BR, SR, side);
        else if (has(0x4))
            one(FC, SR, half);
        else if (has(0x8))
            one(LFE, SR, half);
    }
    if (!has(0x10)) {
        if (has(0x1))
            one(FL, BL, side);
        else if (has(0x200))
            one(SL, BL, side);
        else if (has(0x4))
            one(FC, BL, half);
        else if (has(0x8))
            one(LFE, BL, half);
    }
    if (!has(0x20)) {
        if (has(0x2))
            one(FR, BR, side);
        else if (has(0x400))
            one(SR, BR, side);
        else if (has(0x4))
            one(FC, BR, half);
        else if (has(0x8))
            one(LFE, BR, half);
    }
    if (!has(0x4)) {
        if (has(0x3))
            two(FL, FR, FC, half);
        else if (has(0x1))
            one(FL, FC, half);
        else if (has(0x2))
            one(FR, FC, half);
        else if (has(0x600))
            two(SL, SR, FC, side);
        else if (has(0x200))
            one(SL, FC, side);
        else if (has(0x400))
            one(SR, FC, side);
        else if (has(0x30))
            two(BL, BR, FC, side);
        else if (has(0x10))
            one(BL, FC, side);
        else if (has(0x20))
            one(BR, FC, side);
        else if (has(0x8))
            one(LFE, FC, side);
    }
    if (!has(0x8)) {
        if (has(0x4))
            one(FC, LFE, side);
        else if (has(0x3))
            two(FL, FR, LFE, half);
        else if (has(0x1))
            one(FL, LFE, half);
        else if (has(0x2))
            one(FR, LFE, half);
        else if (has(0x600))
            two(SL, SR, LFE, side);
        else if (has(0x200))
            one(SL, LFE, side);
        else if (has(0x400))
            one(SR, LFE, side);
        else if (has(0x30))
            two(BL, BR, LFE, side);
        else if (has(0x10))
            one(BL, LFE, side);
        else if (has(0x20))
            one(BR, LFE, side);
    }
}

}  // namespace vxcomn::testing
