// SPDX-License-Identifier: MIT
//
// The judge of the elliptic band-stop design: the same formulas in long double, on a road of its own. The prototype's poles
// come from the zeros of the squared magnitude, found one by one in the complex plane, not from factored polynomials.
#pragma once

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

namespace reference {

using Real = long double;

inline constexpr Real kPi = 3.14159265358979323846264338327950288L;

struct Complex {
    Real re = 0;
    Real im = 0;
};

inline Complex operator+(Complex a, Complex b) {
    return {a.re + b.re, a.im + b.im};
}
inline Complex operator-(Complex a, Complex b) {
    return {a.re - b.re, a.im - b.im};
}
inline Complex operator*(Complex a, Complex b) {
    return {a.re * b.re - a.im * b.im, a.re * b.im + a.im * b.re};
}
inline Complex operator/(Complex a, Complex b) {
    const Real d = b.re * b.re + b.im * b.im;
    return {(a.re * b.re + a.im * b.im) / d, (a.im * b.re - a.re * b.im) / d};
}
inline Real magnitude(Complex z) {
    return std::hypot(z.re, z.im);
}
inline Complex root(Complex z) {
    const Real larger = std::sqrt((magnitude(z) + std::fabs(z.re)) / 2);
    if (larger == 0) return {};
    const Real smaller = std::fabs(z.im) / (2 * larger);
    const Real sign = z.im < 0 ? -1 : 1;
    return z.re >= 0 ? Complex{larger, sign * smaller} : Complex{smaller, sign * larger};
}

inline Real completeIntegral(Real modulus) {
    Real a = 1;
    Real b = std::sqrt(1 - modulus * modulus);
    for (int i = 0; i < 40; ++i) {
        const Real mean = (a + b) / 2;
        b = std::sqrt(a * b);
        a = mean;
    }
    return kPi / (2 * a);
}

struct Prototype {
    std::vector<Complex> poles;  // one of each pair, im >= 0, by rising magnitude; a real one last
    std::vector<Real> zeros;     // frequencies, falling
    Real gain = 1;
};

// The poles are the roots in y = 1 + 1 / s^2 of A + e^2 V^2; A has roots at m_i^2, V is the even part of the product of (m_i +
// Z)^2.
inline Prototype prototype(int order, double rippleDb, double width) {
    Prototype result;
    const Real ripple = std::pow(Real(10), Real(rippleDb) / 10) - 1;
    const Real xi = 5 * std::exp(Real(width) - 1) + 1;
    const Real k = completeIntegral(1 / xi);
    const Real q = std::exp(-kPi * completeIntegral(std::sqrt(1 - 1 / (xi * xi))) / k);
    std::vector<Real> m;
    for (int i = 0; i < order / 2; ++i) {
        const Real u = (order % 2 == 0 ? 1 : 2) + 2 * i;
        Real sum = 0;
        for (int n = 0; n < 10000; ++n) {
            const Real power = std::pow(q, n + Real(0.5));
            sum += power * std::sin((2 * n + 1) * (kPi / 2) * (u / order)) / (1 - power * power);
            if (power < Real(1e-7)) break;
        }
        result.zeros.push_back(1 / ((2 * kPi / k) * sum));
        m.push_back(std::sqrt(1 - 1 / (result.zeros.back() * result.zeros.back())));
    }
    const bool odd = order % 2 != 0;
    const auto value = [&](Complex y) {
        const Complex z = root(y);
        Complex plus{1, 0};
        Complex minus{1, 0};
        for (const Real mi : m) {
            plus = plus * (Complex{mi, 0} + z) * (Complex{mi, 0} + z);
            minus = minus * (Complex{mi, 0} - z) * (Complex{mi, 0} - z);
        }
        if (odd) {
            plus = plus * (Complex{1, 0} + z);
            minus = minus * (Complex{1, 0} - z);
        }
        const Complex even = (plus + minus) * Complex{Real(0.5), 0};
        return plus * minus + even * even * Complex{ripple, 0};
    };
    // All roots at once, each pushed off by the others.
    std::vector<Complex> roots;
    for (int i = 0; i < order; ++i)
        roots.push_back(Complex{std::cos(Real(0.4) + i), std::sin(Real(0.4) + i)} * Complex{Real(0.9), 0});
    // The leading coefficient. Of an even order it comes from A and from V; of an odd one V's square falls short of A's degree.
    const Complex lead = odd ? Complex{-1, 0} : Complex{1 + ripple, 0};
    for (int step = 0; step < 300; ++step) {
        Real moved = 0;
        for (size_t i = 0; i < roots.size(); ++i) {
            Complex divisor = lead;
            for (size_t j = 0; j < roots.size(); ++j) {
                if (j != i) divisor = divisor * (roots[i] - roots[j]);
            }
            const Complex delta = value(roots[i]) / divisor;
            roots[i] = roots[i] - delta;
            moved = std::max(moved, magnitude(delta));
        }
        if (moved < Real(1e-19)) break;
    }
    Complex real{};
    bool haveReal = false;
    for (const Complex y : roots) {
        // s^2 = 1 / (y - 1), and of the two roots the one on the left.
        Complex s = root(Complex{1, 0} / (y - Complex{1, 0}));
        s = {-s.re, -s.im};
        if (odd && std::fabs(y.im) < Real(1e-12)) {
            real = s;
            haveReal = true;
        } else if (s.im > 0) {
            result.poles.push_back(s);
        }
    }
    std::sort(result.poles.begin(), result.poles.end(), [](Complex a, Complex b) { return magnitude(a) < magnitude(b); });
    if (haveReal) result.poles.push_back({real.re, 0});
    if (!odd) result.gain = std::pow(Real(10), -Real(rippleDb) / 20);
    return result;
}

struct Stage {
    Real b0, b1, b2, a1, a2;
};

inline std::vector<Stage> bandStop(int order, double center, double bandwidth, double rippleDb, double rate, double width) {
    const Prototype analog = prototype(order, rippleDb, width);
    const Real band = 2 * kPi * (Real(bandwidth) / Real(rate));
    Real low = 2 * kPi * (Real(center) / Real(rate)) - band / 2;
    Real high = low + band;
    low = std::max(low, Real(1e-8));
    high = std::min(high, Real(3.141592643589793));
    const Real a = std::cos((high + low) / 2) / std::cos((high - low) / 2);
    const Real b = std::tan((high - low) / 2);
    // s = b (z^2 - 1) / (z^2 - 2 a z + 1), solved for z; an infinite s lies at the roots of the denominator.
    const auto place = [&](Complex s, bool infinite, bool second) {
        if (infinite) {
            const Complex r = root({a * a - 1, 0});
            return second ? Complex{a, 0} - r : Complex{a, 0} + r;
        }
        const Complex middle = Complex{a, 0} * s;
        const Complex spread = root(middle * middle - (s * s - Complex{b * b, 0}));
        return (second ? middle - spread : middle + spread) / (s - Complex{b, 0});
    };
    std::vector<Stage> stages;
    const auto pairOf = [](Complex z) { return std::pair<Real, Real>(-2 * z.re, z.re * z.re + z.im * z.im); };
    for (int i = 0; i < order / 2; ++i) {
        for (const bool second : {false, true}) {
            const auto [a1, a2] = pairOf(place(analog.poles[static_cast<size_t>(i)], false, second));
            const auto [b1, b2] = pairOf(place({0, analog.zeros[static_cast<size_t>(i)]}, false, second));
            stages.push_back({1, b1, b2, a1, a2});
        }
    }
    if (order % 2 != 0) {
        const Complex p = place(analog.poles.back(), false, false);
        const Complex q = place(analog.poles.back(), false, true);
        const auto [b1, b2] = pairOf(place({}, true, false));
        const Real a1 = -(p.re + q.re);
        const Real a2 = (p * q).re;
        stages.push_back({1, b1, b2, a1, a2});
    }
    const Real normal = Real(center) / Real(rate) < Real(0.25) ? -1 : 1;  // z at half the rate, or at 0
    Real response = 1;
    for (const Stage &s : stages) response *= (s.b0 + s.b1 * normal + s.b2) / (1 + s.a1 * normal + s.a2);
    const Real scale = analog.gain / std::fabs(response);
    stages[0].b0 *= scale;
    stages[0].b1 *= scale;
    stages[0].b2 *= scale;
    return stages;
}

}  // namespace reference
