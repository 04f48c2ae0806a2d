// SPDX-License-Identifier: MIT
//
// With y = 1 + 1 / s^2 the pass band is the negative half of the real axis, and the function of equal ripple with given
// transmission zeros f_i has a closed form: with Z^2 = y, m_i = sqrt(1 - 1 / f_i^2) and E(Z) = product of (m_i + Z)^2, times 1 + Z
// for the zero at infinity of an odd order, it is the even part of E over the square root of E(Z) E(-Z). So
//     1 / |H|^2 = (A + e^2 V^2) / A,   A(y) = E(Z) E(-Z),   V(y) = even part of E(Z)
// and the poles are the roots in y of the sum.
#include "measure/elliptic_prototype.h"

#include <algorithm>
#include <cmath>

#include "measure/elliptic_math.h"
#include "measure/elliptic_polynomial.h"

namespace Dsp::Elliptic {
namespace {

using vxcomn::exponential;
using vxcomn::kPi;
using vxcomn::logarithm;
using vxcomn::sine;
using vxcomn::squareRoot;

double tenToThe(double power) {
    return exponential(power * logarithm(10.0));
}

// The complete elliptic integral of the first kind, by the arithmetic-geometric mean.
double completeIntegral(double modulus) {
    double a = 1.0;
    double b = squareRoot(1.0 - modulus * modulus);
    double c = 1.0 - b;
    for (double before = kInfinity; c < before;) {
        before = c;
        const double mean = (a + b) / 2.0;
        c = (a - b) / 2.0;
        b = squareRoot(a * b);
        a = mean;
    }
    return kPi / (2.0 * a);
}

// The transmission zeros' frequencies, order / 2 of them, the highest first.
std::array<double, kMaxPrototypePoles / 2> zeroFrequencies(int order, double xi) {
    const double k = completeIntegral(1.0 / xi);
    const double complement = completeIntegral(squareRoot(1.0 - 1.0 / (xi * xi)));
    const double logQ = -kPi * complement / k;
    std::array<double, kMaxPrototypePoles / 2> frequencies{};
    double u = order % 2 == 0 ? 1.0 : 2.0;
    for (int i = 0; i < order / 2; ++i, u += 2.0) {
        // So narrow a transition that q is 1 would never end; the limit lies far beyond the parameter's range.
        constexpr int kMaxTerms = 10000;
        double sum = 0.0;
        for (int m = 0; m < kMaxTerms; ++m) {
            const double power = exponential((m + 0.5) * logQ);
            sum += power * sine((2 * m + 1) * (kPi / 2.0) * (u / order)) / (1.0 - power * power);
            if (!(power >= 1e-7)) break;
        }
        frequencies[static_cast<size_t>(i)] = 1.0 / ((2.0 * kPi / k) * sum);
    }
    return frequencies;
}

// The even powers of a polynomial in Z, as one in y = Z^2.
Polynomial evenPart(const Polynomial &polynomial) {
    Polynomial even;
    even.degree = polynomial.degree / 2;
    for (int i = 0; i <= even.degree; ++i)
        even.coefficients[static_cast<size_t>(i)] = polynomial.coefficients[static_cast<size_t>(2 * i)];
    return even;
}

struct PolePair {
    double frequency;
    std::complex<double> pole;
};

PolePair poleOf(const Quadratic &quadratic) {
    const double c = 1.0 / (4.0 * kPi * kPi);
    const double sum = 1.0 + quadratic.a + quadratic.b;
    const double x = (1.0 + quadratic.a / 2.0) * c / sum;
    const double w = (1.0 / (2.0 * kPi)) / squareRoot(squareRoot(sum));
    const double q = 1.0 / squareRoot(std::fabs(2.0 * (1.0 - x / (w * w))));
    const double omega = 2.0 * kPi * w;
    const double imaginary = squareRoot(std::fabs(omega * omega / (q * q) - 4.0 * omega * omega)) / 2.0;
    return {w, {-omega / (2.0 * q), imaginary}};
}

}  // namespace

void AnalogLowPass::design(int order, double rippleDb, double width) {
    order = std::clamp(order, 1, kMaxPrototypePoles);
    if (order == order_ && rippleDb == rippleDb_ && width == width_) return;
    order_ = order;
    rippleDb_ = rippleDb;
    width_ = width;

    const double ripple = tenToThe(rippleDb / 10.0) - 1.0;
    const double xi = 5.0 * exponential(width - 1.0) + 1.0;
    const std::array<double, kMaxPrototypePoles / 2> zeros = zeroFrequencies(order, xi);

    Polynomial attenuation;  // A
    Polynomial sum;          // E
    std::array<Quadratic, kMaxDegree / 2> starts{};
    if (order % 2 != 0) {
        attenuation = {1, {1.0, -1.0}};
        sum = {1, {1.0, 1.0}};
    }
    for (int i = 0; i < order / 2; ++i) {
        const double f = zeros[static_cast<size_t>(i)];
        const double square = 1.0 - 1.0 / (f * f);
        const double m = squareRoot(square);
        attenuation = multiply(attenuation, {2, {square * square, -2.0 * square, 1.0}});
        sum = multiply(sum, {2, {square, 2.0 * m, 1.0}});
        starts[static_cast<size_t>(i)] = {-2.0 * square * (1.0 - ripple) / (1.0 + ripple), square * square};
    }
    const Polynomial even = evenPart(sum);
    Polynomial denominator = multiply(even, even);
    for (double &coefficient : denominator.coefficients) coefficient *= ripple;
    for (int i = 0; i <= attenuation.degree; ++i) {
        const auto at = static_cast<size_t>(i);
        if (i > denominator.degree) denominator.coefficients[at] = 0.0;
        denominator.coefficients[at] += attenuation.coefficients[at];
    }
    denominator.degree = attenuation.degree;
    const Factors factors = factorise(denominator, starts);

    // The poles nearest the edge of the pass band go with the zeros nearest to it.
    std::array<PolePair, kMaxPrototypePoles / 2> found{};
    for (int i = 0; i < factors.count; ++i) {
        const PolePair pair = poleOf(factors.quadratics[static_cast<size_t>(i)]);
        int place = i;
        for (; place > 0 && found[static_cast<size_t>(place - 1)].frequency > pair.frequency; --place) {
            found[static_cast<size_t>(place)] = found[static_cast<size_t>(place - 1)];
        }
        found[static_cast<size_t>(place)] = pair;
    }

    poleCount = order;
    for (int i = 0; i < factors.count; ++i) {
        const std::complex<double> pole = found[static_cast<size_t>(i)].pole;
        const std::complex<double> zero(0.0, zeros[static_cast<size_t>(i)]);
        pairs[static_cast<size_t>(i)] = {{pole, std::conj(pole)}, {zero, std::conj(zero)}};
    }
    if (order % 2 != 0) {
        const double c = 1.0 / (4.0 * kPi * kPi);
        const std::complex<double> pole(-2.0 * kPi * squareRoot(c / (factors.realRoot - 1.0)), 0.0);
        pairs[static_cast<size_t>(order / 2)] = {{pole, pole}, {kInfinity, kInfinity}};
    }
    normalFrequency = 0.0;
    normalGain = order % 2 != 0 ? 1.0 : tenToThe(-rippleDb / 20.0);
}

}  // namespace Dsp::Elliptic
