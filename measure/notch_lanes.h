// SPDX-License-Identifier: MIT
//
// The coefficients of the tracking notch, written once for one value and for lanes of them: D is double or a vector of doubles, I
// the integer of the same shape. Sine and cosine are good to less than one unit in the last place of an f64, and every lane of
// every instruction set does the same operations, so the coefficients, rounded to f32, are the same everywhere.
#pragma once

#include <cstdint>

#include "measure/kernels.h"
#include "measure/realtime.h"
#include "measure/source_lanes.h"

namespace vxcomn {
namespace {

template <class D>
struct NotchCoefficients {
    D gain;      // b0 and b2
    D feedback;  // b1 and a1
    D a2;
};

// pi/2 in three parts: the product of one of the first two with a whole number below 2^20 is exact.
constexpr double kHalfPi1 = 0x1.921fb544p+0, kHalfPi2 = 0x1.0b4611a4p-34, kHalfPi3 = 0x1.13198a2e03707p-65;
constexpr double kTwoOverPi = 0x1.45f306dc9c883p-1;
// Adding it rounds to a whole number, which then stands in the low bits.
constexpr double kRounder = 0x1.8p52;

// A notch at hz with Q = 2. Angles: a rate of at least 1 Hz and a table that ends at 24 kHz keep them below 2^18.
template <class D, class I>
VXCOMN_RT_INLINE NotchCoefficients<D> notchAt(D hz, double rate) {
    const D w = 6.283185307179586 * hz / rate;
    const D shifted = w * kTwoOverPi + kRounder;
    const D quarters = shifted - kRounder;
    const D r = ((w - quarters * kHalfPi1) - quarters * kHalfPi2) - quarters * kHalfPi3;
    const D z = r * r;
    // Taylor's series on -pi/4 to pi/4; what they leave out is below 2^-58.
    const D sineTail =
        ((((((0x1.952c77030ad4ap-49 * z - 0x1.ae7f3e733b81fp-41) * z + 0x1.6124613a86d09p-33) * z - 0x1.ae64567f544e4p-26) * z +
           0x1.71de3a556c734p-19) *
              z -
          0x1.a01a01a01a01ap-13) *
             z +
         0x1.1111111111111p-7) *
            z -
        0x1.5555555555555p-3;
    const D sine = r + r * z * sineTail;
    const D cosineTail =
        ((((((0x1.ae7f3e733b81fp-45 * z - 0x1.93974a8c07c9dp-37) * z + 0x1.1eed8eff8d898p-29) * z - 0x1.27e4fb7789f5cp-22) * z +
           0x1.a01a01a01a01ap-16) *
              z -
          0x1.6c16c16c16c17p-10) *
             z +
         0x1.5555555555555p-5) *
        z * z;
    const D cosine = 1.0 - 0.5 * z + cosineTail;

    // The quarter turns swap the two and turn their signs.
    const I quarter = __builtin_bit_cast(I, shifted);
    const I swap = -(quarter & 1);
    const I sineBits = __builtin_bit_cast(I, sine), cosineBits = __builtin_bit_cast(I, cosine);
    const I sinePicked = (sineBits & ~swap) | (cosineBits & swap), cosinePicked = (cosineBits & ~swap) | (sineBits & swap);
    const D sinW = __builtin_bit_cast(D, sinePicked ^ ((quarter & 2) << 62));
    const D cosW = __builtin_bit_cast(D, cosinePicked ^ (((quarter + 1) & 2) << 62));

    const D alpha = sinW / 4.0;
    const D g = 1.0 / (1.0 + alpha);
    return {g, -2.0 * cosW * g, (1.0 - alpha) * g};
}

template <class L>
VXCOMN_RT_INLINE void notchInLanes(SweepRun &run, double rate, int count, NotchPiece &piece) {
    using D = typename L::Doubles;
    using I = typename L::Integers;
    alignas(64) double steps[kNotchPiece] = {};
    sweepPiece<L>(run, steps, count);
    for (int i = 0; i < count; i += L::kLanes) {
        const D hz = L::load(steps + i);
        L::store(piece.turn + i, hz * run.radiansPerHz);
        const auto at = notchAt<D, I>(L::roundedToFloat(hz), rate);
        L::storeRounded(piece.gain + 1 + i, at.gain);
        L::storeRounded(piece.feedback + 1 + i, at.feedback);
        L::storeRounded(piece.a2 + 1 + i, at.a2);
    }
}

}  // namespace
}  // namespace vxcomn
