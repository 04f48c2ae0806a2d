// SPDX-License-Identifier: MIT
#include "measure/exact_sine.h"

#include <cstdint>

#include "measure/realtime.h"
#include "measure/wide_fixed.h"

namespace vxcomn {
namespace {

// The bits of 1/pi behind the binary point, most significant first: enough for the largest f64, whose last bit weighs 2^971, and
// 256 more.
constexpr uint64_t kReciprocalOfPi[21] = {
    0x517CC1B727220A94, 0xFE13ABE8FA9A6EE0, 0x6DB14ACC9E21C820, 0xFF28B1D5EF5DE2B0, 0xDB92371D2126E970, 0x0324977504E8C90E,
    0x7F0EF58E5894D39F, 0x74411AFA975DA242, 0x74CE38135A2FBF20, 0x9CC8EB1CC1A99CFA, 0x4E422FC5DEFC941D, 0x8FFC4BFFEF02CC07,
    0xF79788C5AD05368F, 0xB69B3F6793E584DB, 0xA7A31FB34F2FF516, 0xBA93DD63F5F2F8BD, 0x9E839CFBC5294975, 0x35FDAFD88FC6AE84,
    0x2B0198237E3DB5D5, 0xF867DE104D7A1B0E, 0xD4F1C8B0AF730D84};

constexpr u128 kQuarterPi = wide(0xC90FDAA22168C234, 0xC4C6628B80DC1CD1);  // pi/4 * 2^128

// The factors 4 / (2k * (2k + 1)) of the sine's series, * 2^128. Twenty terms leave less than 2^-120 behind for angles up to pi/2.
constexpr int kTerms = 20;
struct SeriesFactors {
    u128 factor[kTerms + 1];
};
constexpr SeriesFactors makeSeriesFactors() {
    SeriesFactors result{};
    for (int k = 1; k <= kTerms; ++k) result.factor[k] = ~u128{0} / static_cast<unsigned>(k * (2 * k + 1)) * 2;
    return result;
}
constexpr SeriesFactors kSeries = makeSeriesFactors();

// An angle in half turns, without its even whole number: the odd one, and the fraction in units of 2^-256.
struct HalfTurns {
    bool odd;
    u128 high, low;
};

// |x| / pi modulo 2. With x = m * 2^e only those 256 bits of 1/pi matter that the product carries into the result: bits that weigh
// 2 or more after the multiplication are whole turns. `plusHalf` adds a quarter turn, which makes a cosine of the sine.
VXCOMN_RT_INLINE HalfTurns reduce(uint64_t magnitudeBits, bool plusHalf) {
    const int field = static_cast<int>(magnitudeBits >> 52);
    const uint64_t fraction = magnitudeBits & 0xFFFFFFFFFFFFFull;
    const uint64_t m = field == 0 ? fraction : fraction | (uint64_t{1} << 52);
    const int e = (field == 0 ? 1 : field) - 1075;

    const int start = e >= 1 ? e - 1 : 0;
    const int word = start / 64, bit = start % 64;
    uint64_t product[6] = {};  // least significant first; the sixth word stays 0
    u128 carry = 0;
    for (int i = 0; i < 4; ++i) {
        const uint64_t upper = kReciprocalOfPi[word + 3 - i], lower = kReciprocalOfPi[word + 4 - i];
        const uint64_t window = bit == 0 ? upper : (upper << bit) | (lower >> (64 - bit));
        carry += u128{m} * window;
        product[i] = static_cast<uint64_t>(carry);
        carry >>= 64;
    }
    product[4] = static_cast<uint64_t>(carry);

    const int shift = e >= 1 ? 0 : 1 - e;
    uint64_t value[4] = {};
    for (int i = 0; i < 4; ++i) {
        const int from = i + shift / 64;
        if (from > 4) break;
        value[i] = shift % 64 == 0 ? product[from] : (product[from] >> (shift % 64)) | (product[from + 1] << (64 - shift % 64));
    }
    if (plusHalf) value[3] += uint64_t{1} << 62;  // a carry past the top is a whole turn
    const u128 high = wide(value[3], value[2]), low = wide(value[1], value[0]);
    return {(value[3] >> 63) != 0, (high << 1) | (low >> 127), low << 1};
}

// sin(pi * fraction), positive. The fraction isn't 0.
VXCOMN_RT_INLINE Wide sineOfHalfTurns(u128 high, u128 low) {
    if ((high >> 127) != 0) {  // sin(pi - a) = sin(a)
        low = ~low + 1;
        high = ~high + (low == 0 ? 1 : 0);
    }
    int exponent = 0;
    if (high == 0) {
        high = low;
        low = 0;
        exponent = -128;
    }
    const int shift = leadingZeros(high);
    if (shift != 0) high = (high << shift) | (low >> (128 - shift));
    exponent -= shift;
    const Wide angle = normalised({multiplyHigh(high, kQuarterPi), exponent + 2});

    // angle^2 / 4 in units of 2^-128, at most 0.62.
    const u128 squared = multiplyHigh(angle.mantissa, angle.mantissa);
    const int down = 2 - 2 * angle.exponent;
    const u128 quarter = down >= 128 ? 0 : squared >> down;
    u128 sum = u128{1} << 127;
    for (int k = kTerms; k >= 1; --k) sum = (u128{1} << 127) - multiplyHigh(multiplyHigh(quarter, kSeries.factor[k]), sum);
    return normalised({multiplyHigh(angle.mantissa, sum), angle.exponent + 1});
}

}  // namespace

VXCOMN_RT float exactSine(double x) noexcept {
    const auto bits = __builtin_bit_cast(uint64_t, x);
    const uint64_t magnitude = bits & 0x7FFFFFFFFFFFFFFFull;
    if (magnitude >= 0x7FF0000000000000ull) return static_cast<float>(x - x);
    if (magnitude == 0) return static_cast<float>(x);
    // Below 2^-30 the sine is the argument less a sixth of its cube, which is less than an f64's last bit: the f64 next to it on
    // the side of zero rounds as the sine does.
    if (magnitude < 0x3E10000000000000ull) return static_cast<float>(__builtin_bit_cast(double, bits - 1));
    const HalfTurns turns = reduce(magnitude, false);
    const double value = toOddDouble(sineOfHalfTurns(turns.high, turns.low));
    return static_cast<float>(turns.odd != ((bits >> 63) != 0) ? -value : value);
}

double exactCosine(double x) noexcept {
    const uint64_t magnitude = __builtin_bit_cast(uint64_t, x) & 0x7FFFFFFFFFFFFFFFull;
    if (magnitude >= 0x7FF0000000000000ull) return x - x;
    const HalfTurns turns = reduce(magnitude, true);
    if (turns.high == 0 && turns.low == 0) return 0.0;
    const double value = toNearestDouble(sineOfHalfTurns(turns.high, turns.low));
    return turns.odd ? -value : value;
}

}  // namespace vxcomn
