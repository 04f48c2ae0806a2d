// SPDX-License-Identifier: MIT
#include "measure/elliptic_polynomial.h"

#include <cmath>
#include <cstddef>
#include <limits>

#include "measure/elliptic_math.h"

namespace Dsp::Elliptic {
namespace {

using vxcomn::squareRoot;

// Synthetic division by a quadratic: row[i + 2] is coefficient i of the quotient, and row[1] (y + a) + row[0] the remainder.
using Row = std::array<double, kMaxDegree + 3>;

Row divide(const double *coefficients, int degree, const Quadratic &by) noexcept {
    Row row{};
    for (int i = degree; i >= 0; --i) {
        const auto at = static_cast<size_t>(i);
        row[at] = coefficients[i] - by.a * row[at + 1] - by.b * row[at + 2];
    }
    return row;
}

// Moves the quadratic until it divides the polynomial, as well as the numbers allow: Newton's method on the remainder, whose
// derivatives come from dividing once more. Tells whether it came to rest.
bool refine(const Polynomial &polynomial, Quadratic &factor) noexcept {
    constexpr int kMaxSteps = 100;
    double before = std::numeric_limits<double>::infinity();
    for (int step = 0; step < kMaxSteps; ++step) {
        const Row first = divide(polynomial.coefficients.data(), polynomial.degree, factor);
        const Row second = divide(first.data(), polynomial.degree, factor);
        const double determinant = second[2] * second[2] - second[3] * second[1];
        const double stepA = (first[1] * second[2] - first[0] * second[3]) / determinant;
        const double stepB = (first[0] * second[2] - first[1] * second[1]) / determinant;
        if (!std::isfinite(stepA) || !std::isfinite(stepB)) return false;
        factor.a += stepA;
        factor.b += stepB;
        // Near a root the steps shrink to the rounding errors and stay there.
        const double scale = std::fabs(factor.b) + factor.a * factor.a;
        const bool near = stepA * stepA <= 1e-24 * scale && std::fabs(stepB) <= 1e-12 * scale;
        const bool smaller = std::fabs(stepA) + std::fabs(stepB) < before;
        if (near && !smaller) return true;
        before = std::fabs(stepA) + std::fabs(stepB);
    }
    return false;
}

// A factor of the polynomial, looked for from the guess first, and then from circles around 0.
Quadratic findFactor(const Polynomial &polynomial, const Quadratic &start) noexcept {
    Quadratic factor = start;
    if (refine(polynomial, factor)) return factor;
    constexpr int kTurns = 8;
    for (int octave = -6; octave <= 6; ++octave) {
        const double square = std::ldexp(start.b, octave);
        for (int turn = -kTurns; turn < kTurns; ++turn) {
            factor = {2.0 * turn / kTurns * squareRoot(square), square};
            if (refine(polynomial, factor)) return factor;
        }
    }
    return start;
}

}  // namespace

Polynomial multiply(const Polynomial &a, const Polynomial &b) noexcept {
    Polynomial product;
    product.degree = a.degree + b.degree;
    product.coefficients = {};
    for (int i = 0; i <= a.degree; ++i) {
        for (int j = 0; j <= b.degree; ++j) {
            product.coefficients[static_cast<size_t>(i + j)] +=
                a.coefficients[static_cast<size_t>(i)] * b.coefficients[static_cast<size_t>(j)];
        }
    }
    return product;
}

Factors factorise(const Polynomial &polynomial, const std::array<Quadratic, kMaxDegree / 2> &starts) noexcept {
    Factors factors;
    Polynomial rest = polynomial;
    while (rest.degree >= 2) {
        Quadratic &factor = factors.quadratics[static_cast<size_t>(factors.count)];
        factor = findFactor(rest, starts[static_cast<size_t>(factors.count)]);
        const Row row = divide(rest.coefficients.data(), rest.degree, factor);
        rest.degree -= 2;
        for (int i = 0; i <= rest.degree; ++i) rest.coefficients[static_cast<size_t>(i)] = row[static_cast<size_t>(i + 2)];
        ++factors.count;
    }
    // Each division left its error in the rest; the whole polynomial takes it out again.
    for (int i = 0; i < factors.count; ++i) {
        Quadratic &factor = factors.quadratics[static_cast<size_t>(i)];
        Quadratic refined = factor;
        if (refine(polynomial, refined)) factor = refined;
    }
    if (rest.degree == 1) factors.realRoot = -rest.coefficients[0] / rest.coefficients[1];
    return factors;
}

}  // namespace Dsp::Elliptic
