// SPDX-License-Identifier: MIT
#include "measure/elliptic_polynomial.h"

#include <cmath>
#include <cstddef>

namespace Dsp::Elliptic {
namespace {

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
// derivatives come from dividing once more.
Quadratic refine(const Polynomial &polynomial, Quadratic factor) noexcept {
    constexpr int kMaxSteps = 200;
    for (int step = 0; step < kMaxSteps; ++step) {
        const Row first = divide(polynomial.coefficients.data(), polynomial.degree, factor);
        const Row second = divide(first.data(), polynomial.degree, factor);
        const double determinant = second[2] * second[2] - second[3] * second[1];
        const double stepA = (first[1] * second[2] - first[0] * second[3]) / determinant;
        const double stepB = (first[0] * second[2] - first[1] * second[1]) / determinant;
        if (!std::isfinite(stepA) || !std::isfinite(stepB)) break;
        factor.a += stepA;
        factor.b += stepB;
        if (std::fabs(stepA) <= 1e-16 * std::fabs(factor.a) && std::fabs(stepB) <= 1e-16 * std::fabs(factor.b)) break;
    }
    return factor;
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
        factor = refine(rest, starts[static_cast<size_t>(factors.count)]);
        const Row row = divide(rest.coefficients.data(), rest.degree, factor);
        rest.degree -= 2;
        for (int i = 0; i <= rest.degree; ++i) rest.coefficients[static_cast<size_t>(i)] = row[static_cast<size_t>(i + 2)];
        ++factors.count;
    }
    // Each division left its error in the rest; the whole polynomial takes it out again.
    for (int i = 0; i < factors.count; ++i) {
        Quadratic &factor = factors.quadratics[static_cast<size_t>(i)];
        factor = refine(polynomial, factor);
    }
    if (rest.degree == 1) factors.realRoot = -rest.coefficients[0] / rest.coefficients[1];
    return factors;
}

}  // namespace Dsp::Elliptic
