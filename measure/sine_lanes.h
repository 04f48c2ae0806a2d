// SPDX-License-Identifier: MIT
//
// Sines of many phases at once, rounded to f32 as exactly as measure/exact_sine.h does it one at a time. The sine is worked out in
// f64 with a known error bound; where the result lies farther from the middle between two f32 than that, its rounding is that of
// the exact sine. The rare lane that can't tell goes to the exact one. Written for vectors of the compiler; a kernel file names the
// shapes: D f64, I the integers of the same shape, F as many f32.
//
// Bound, in units of 2^-53 of the result: series 1.7, reduction 2, evaluation below 8. The test allows 32.
#pragma once

#include <cstdint>

#include "measure/exact_sine.h"
#include "measure/realtime.h"

namespace vxcomn {
namespace {

// pi in four parts. The products of the first three with a whole number below 2^33 are exact, and so are the first two differences.
constexpr double kPi1 = 0x1.921fap+1, kPi2 = 0x1.54442p-19, kPi3 = 0x1.a308cp-40, kPi4 = 0x1.313198a2e0370p-60;
constexpr double kOneOverPi = 0x1.45f306dc9c883p-2;

template <class L>
VXCOMN_RT_INLINE void sineInLanes(const double *phases, float *samples) {
    using D = typename L::Doubles;
    using I = typename L::Integers;
    const D x = L::load(phases);
    const D shifted = x * kOneOverPi + 0x1.8p52;  // rounds to a whole number, whose low bits stand in the result's low bits
    const D turns = shifted - 0x1.8p52;
    const D r = (((x - turns * kPi1) - turns * kPi2) - turns * kPi3) - turns * kPi4;
    const D z = r * r;
    // The polynomial whose largest relative error on -pi/2 to pi/2 is smallest, 2^-52.3.
    const D tail =
        (((((-0x1.9f1517a210b2bp-41 * z + 0x1.60e6bedfc05fcp-33) * z - 0x1.ae6355aab12a0p-26) * z + 0x1.71de3806ae2eap-19) * z -
          0x1.a01a019a659fbp-13) *
             z +
         0x1.111111110a573p-7) *
            z -
        0x1.55555555554a8p-3;
    const D sine = r + r * z * tail;
    const I odd = __builtin_bit_cast(I, shifted) << 63;
    const I bits = __builtin_bit_cast(I, sine) ^ odd;
    L::storeRounded(samples, __builtin_bit_cast(D, bits));

    // Decided: whole turns small enough for exact products, an angle that is large against the reduction's error and whose sine
    // isn't a denormal f32, and the 29 bits that rounding drops not within 32 of their middle. All false for NaN.
    const I signless = I{} + 0x7FFFFFFFFFFFFFFF;
    const D size = __builtin_bit_cast(D, __builtin_bit_cast(I, turns) & signless);
    const D angle = __builtin_bit_cast(D, __builtin_bit_cast(I, r) & signless);
    const I decided =
        (size < 0x1p33) & (angle > size * 0x1p-60 + 0x1p-120) & ((((bits & 0x1FFFFFFF) - 0x0FFFFFE0) & ~int64_t{63}) != 0);
    if (!L::all(decided)) [[unlikely]] {
        for (int lane = 0; lane < L::kLanes; ++lane) samples[lane] = exactSine(phases[lane]);
    }
}

}  // namespace
}  // namespace vxcomn
