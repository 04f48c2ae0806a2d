// SPDX-License-Identifier: MIT
//
// A curve of decibels over frequency, read from CSV: what `vx measure spectrum --csv` writes, or any table with a frequency and a
// level.
#pragma once

#include <string>
#include <vector>

namespace vx {

struct CurvePoint {
    double hz = 0.0;
    double decibels = 0.0;
};

// Frequencies rise.
using Curve = std::vector<CurvePoint>;

// Columns are parted by commas, semicolons or tabs. With a head, the frequency is its column centre_hz, hz, freq or frequency, and
// the level response_db, level_db, db or spl, whichever comes first in this order; without one, they are the first two. Lines that
// begin with # or *, and lines without a level, are passed over. Fails with file and line.
Curve readCurve(const std::string &path);

// By a straight line over the logarithm of the frequency; the last level beyond the ends. The curve has a point at least.
double levelAt(const Curve &curve, double hz);

}  // namespace vx
