// SPDX-License-Identifier: MIT
//
// Small real polynomials and their factors, for the elliptic prototype. Control calls only.
#pragma once

#include <array>

namespace Dsp::Elliptic {

inline constexpr int kMaxDegree = 6;

// Coefficient i belongs to the i-th power.
struct Polynomial {
    int degree = 0;
    std::array<double, kMaxDegree + 1> coefficients{1.0};
};

Polynomial multiply(const Polynomial &a, const Polynomial &b) noexcept;  // the degrees sum up to at most kMaxDegree

// y^2 + a y + b.
struct Quadratic {
    double a;
    double b;
};

struct Factors {
    int count = 0;  // quadratics
    std::array<Quadratic, kMaxDegree / 2> quadratics{};
    double realRoot = 0.0;  // of an odd degree
};

// By Bairstow's iteration. `starts` has a guess for each quadratic.
Factors factorise(const Polynomial &polynomial, const std::array<Quadratic, kMaxDegree / 2> &starts) noexcept;

}  // namespace Dsp::Elliptic
