// SPDX-License-Identifier: MIT
#include "measure/band_stop_transform.h"

#include <algorithm>
#include <cmath>

#include "measure/elliptic_math.h"

namespace Dsp {
namespace {

using Value = std::complex<double>;
using vxcomn::kPi;
using vxcomn::squareRoot;

// Kept: the lowest and the highest edge, rad/sample. The highest lies 1e-8 below pi as it is written here, digit for digit.
constexpr double kLowestEdge = 1e-8;
constexpr double kHighestEdge = 3.141592643589793;

// The library's own quotient and root differ from compiler to compiler.
Value quotient(Value a, Value b) {
    const double square = b.real() * b.real() + b.imag() * b.imag();
    return {(a.real() * b.real() + a.imag() * b.imag()) / square, (a.imag() * b.real() - a.real() * b.imag()) / square};
}

Value product(Value a, Value b) {
    return {a.real() * b.real() - a.imag() * b.imag(), a.real() * b.imag() + a.imag() * b.real()};
}

Value root(Value z) {
    const double magnitude = squareRoot(z.real() * z.real() + z.imag() * z.imag());
    const double larger = squareRoot((magnitude + std::fabs(z.real())) / 2.0);
    if (larger == 0.0) return {};
    const double smaller = std::fabs(z.imag()) / (2.0 * larger);
    if (z.real() >= 0.0) return {larger, std::copysign(smaller, z.imag())};
    return {smaller, std::copysign(larger, z.imag())};
}

struct Both {
    Value first;
    Value second;
};

class BandStop {
  public:
    BandStop(double center, double width) {
        const double band = 2.0 * kPi * width;
        double low = 2.0 * kPi * center - band / 2.0;
        double high = low + band;
        low = std::max(low, kLowestEdge);
        high = std::min(high, kHighestEdge);
        a_ = vxcomn::cosine((high + low) / 2.0) / vxcomn::cosine((high - low) / 2.0);
        b_ = vxcomn::tangent((high - low) / 2.0);
    }

    // Where an analog pole or zero comes to lie: through the bilinear map, and then as the roots of the substitution.
    Both operator()(Value c) const {
        const Value z = std::isinf(c.real()) ? Value(-1.0) : quotient(1.0 + c, 1.0 - c);
        const Value minus = z - 1.0;
        const Value plus = z + 1.0;
        const Value middle = a_ * minus;
        const Value spread = root((a_ * a_ - 1.0) * product(minus, minus) + (b_ * b_) * product(plus, plus));
        const Value divisor = minus - b_ * plus;
        return {quotient(middle + spread, divisor), quotient(middle - spread, divisor)};
    }

  private:
    double a_;
    double b_;
};

}  // namespace

void transformToBandStop(double center, double width, const Layout<kMaxPrototypePoles> &analog, Layout<kMaxDigitalPoles> &digital) {
    const BandStop transform(center, width);
    digital.poleCount = 2 * analog.poleCount;
    size_t next = 0;
    for (int i = 0; i < analog.poleCount / 2; ++i) {
        const PoleZeroPair &pair = analog.pairs[static_cast<size_t>(i)];
        const Both poles = transform(pair.poles[0]);
        const Both zeros = transform(pair.zeros[0]);
        digital.pairs[next++] = {{poles.first, std::conj(poles.first)}, {zeros.first, std::conj(zeros.first)}};
        digital.pairs[next++] = {{poles.second, std::conj(poles.second)}, {zeros.second, std::conj(zeros.second)}};
    }
    if (analog.poleCount % 2 != 0) {
        const PoleZeroPair &single = analog.pairs[static_cast<size_t>(analog.poleCount / 2)];
        const Both poles = transform(single.poles[0]);
        const Both zeros = transform(single.zeros[0]);
        digital.pairs[next++] = {{poles.first, poles.second}, {zeros.first, zeros.second}};
    }
    digital.normalFrequency = center < 0.25 ? kPi : 0.0;
    digital.normalGain = analog.normalGain;
}

}  // namespace Dsp
