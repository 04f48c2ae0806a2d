// SPDX-License-Identifier: MIT
//
// Levenberg and Marquardt's method with a numerical Jacobian over the unknowns: the level, the gains, and if they are free the
// logarithms of frequencies and widths. Ten to thirty unknowns over some dozens of points: milliseconds.
#include "tools/vx_measure/equaliser_fit.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include "tools/vx/failure.h"

namespace vx {

namespace {

constexpr double kSliderHz[kFitBands] = {31, 62, 125, 250, 500, 1000, 2000, 4000, 8000, 1600};
constexpr double kSliderQuality = 1.44;
constexpr double kGreedyQuality = 3.0;
constexpr double kClosest = 1.0 / 12.0;  // octaves between points
constexpr double kLowestQuality = 0.3;
constexpr double kHighestQuality = 8.0;
constexpr double kRidge = 0.003;  // of two ways to nearly the same curve, the one of smaller gains
constexpr double kBeyond = 1.1;
constexpr int kRounds = 200;

using Vector = std::vector<double>;

struct Problem {
    Curve points;  // the measured curve over the target
    FitSettings settings;
    PeakBands start;

    size_t unknowns() const { return settings.free ? 1 + 3 * kFitBands : 1 + kFitBands; }
};

PeakBands bandsOf(const Problem &problem, const Vector &unknowns) {
    PeakBands bands = problem.start;
    for (size_t i = 0; i < kFitBands; ++i) {
        bands[i].decibels = unknowns[1 + i];
        if (!problem.settings.free) continue;
        bands[i].hz = std::exp(unknowns[1 + kFitBands + i]);
        bands[i].quality = std::exp(unknowns[1 + 2 * kFitBands + i]);
    }
    return bands;
}

void hold(const Problem &problem, Vector &unknowns) {
    const FitSettings &settings = problem.settings;
    for (size_t i = 0; i < kFitBands; ++i) {
        unknowns[1 + i] = std::clamp(unknowns[1 + i], -kFitMostDb, kFitMostDb);
        if (!settings.free) {
            // A slider beyond the points would only bend their ends, and do what nobody measured beyond them.
            const double hz = problem.start[i].hz;
            if (hz < problem.points.front().hz / kBeyond || hz > problem.points.back().hz * kBeyond) unknowns[1 + i] = 0.0;
            continue;
        }
        double &hz = unknowns[1 + kFitBands + i];
        hz = std::clamp(hz, std::log(settings.lowestHz), std::log(std::min(settings.highestHz, 0.45 * settings.sampleRate)));
        double &quality = unknowns[1 + 2 * kFitBands + i];
        quality = std::clamp(quality, std::log(kLowestQuality), std::log(kHighestQuality));
    }
}

// What remains at every point, and behind it the ridge's share of every gain.
Vector residuals(const Problem &problem, const Vector &unknowns) {
    const PeakBands bands = bandsOf(problem, unknowns);
    Vector remains;
    for (const CurvePoint &point : problem.points)
        remains.push_back(point.decibels - unknowns[0] + equaliserResponse(bands, point.hz, problem.settings.sampleRate));
    for (size_t i = 0; i < kFitBands; ++i) remains.push_back(kRidge * unknowns[1 + i]);
    return remains;
}

double sumOfSquares(const Vector &values) {
    double sum = 0.0;
    for (const double value : values) sum += value * value;
    return sum;
}

// Solves a symmetric, positive definite system by Gauss; `matrix` is used up.
Vector solve(std::vector<Vector> matrix, Vector right) {
    const size_t count = right.size();
    for (size_t pivot = 0; pivot < count; ++pivot)
        for (size_t row = pivot + 1; row < count; ++row) {
            const double factor = matrix[row][pivot] / matrix[pivot][pivot];
            for (size_t column = pivot; column < count; ++column) matrix[row][column] -= factor * matrix[pivot][column];
            right[row] -= factor * right[pivot];
        }
    for (size_t row = count; row-- > 0;) {
        for (size_t column = row + 1; column < count; ++column) right[row] -= matrix[row][column] * right[column];
        right[row] /= matrix[row][row];
    }
    return right;
}

// One step of the method: better unknowns, or none.
bool improve(const Problem &problem, Vector &unknowns, double &damping) {
    constexpr double kNudge = 1e-5;
    constexpr double kMostDamping = 1e9;
    const Vector here = residuals(problem, unknowns);
    const size_t count = unknowns.size();
    std::vector<Vector> slopes(count);
    for (size_t i = 0; i < count; ++i) {
        Vector nudged = unknowns;
        nudged[i] += kNudge;
        slopes[i] = residuals(problem, nudged);
        for (size_t k = 0; k < here.size(); ++k) slopes[i][k] = (slopes[i][k] - here[k]) / kNudge;
    }
    std::vector<Vector> normal(count, Vector(count));
    Vector right(count);
    for (size_t i = 0; i < count; ++i) {
        for (size_t j = 0; j < count; ++j)
            for (size_t k = 0; k < here.size(); ++k) normal[i][j] += slopes[i][k] * slopes[j][k];
        for (size_t k = 0; k < here.size(); ++k) right[i] -= slopes[i][k] * here[k];
    }
    for (; damping < kMostDamping; damping *= 4.0) {
        std::vector<Vector> damped = normal;
        for (size_t i = 0; i < count; ++i) damped[i][i] += damping * (normal[i][i] + 1e-9);
        Vector next = solve(std::move(damped), right);
        for (size_t i = 0; i < count; ++i) next[i] += unknowns[i];
        hold(problem, next);
        const double better = sumOfSquares(residuals(problem, next));
        const double before = sumOfSquares(here);
        if (!(better < before)) continue;
        unknowns = next;
        damping /= 10.0;
        return before - better > 1e-10 * before;
    }
    return false;
}

Curve pointsWithin(const Curve &measured, const FitSettings &settings) {
    Curve points;
    for (const CurvePoint &point : measured) {
        if (point.hz < settings.lowestHz || point.hz > std::min(settings.highestHz, settings.sampleRate / 2.0)) continue;
        if (points.empty() || std::log2(point.hz / points.back().hz) > 0.999 * kClosest) points.push_back(point);
    }
    return points;
}

Deviation deviationOf(const Curve &curve, const Curve &target) {
    Deviation deviation;
    for (size_t i = 0; i < curve.size(); ++i) {
        const double remains = curve[i].decibels - target[i].decibels;
        deviation.rms += remains * remains / static_cast<double>(curve.size());
        if (std::fabs(remains) <= std::fabs(deviation.worst)) continue;
        deviation.worst = remains;
        deviation.worstHz = curve[i].hz;
    }
    deviation.rms = std::sqrt(deviation.rms);
    return deviation;
}

// Where free bands may begin: evenly over the range, or each where the most remains. Both are tried, as either may lead astray.
PeakBands spreadBands(const Problem &problem, double mean) {
    PeakBands bands;
    const FitSettings &settings = problem.settings;
    const double octaves = std::log2(settings.highestHz / settings.lowestHz);
    for (size_t i = 0; i < kFitBands; ++i) {
        const double hz = settings.lowestHz * std::exp2(octaves * (static_cast<double>(i) + 0.5) / kFitBands);
        bands[i] = {hz, kSliderQuality, std::clamp(mean - levelAt(problem.points, hz), -kFitMostDb, kFitMostDb) / 2.0};
    }
    return bands;
}

PeakBands greedyBands(const Problem &problem, double mean) {
    PeakBands bands;
    for (PeakBand &band : bands) band = {1000.0, kGreedyQuality, 0.0};
    for (PeakBand &band : bands) {
        CurvePoint worst = {problem.points.front().hz, 0.0};
        for (const CurvePoint &point : problem.points) {
            const double remains = point.decibels - mean + equaliserResponse(bands, point.hz, problem.settings.sampleRate);
            if (std::fabs(remains) > std::fabs(worst.decibels)) worst = {point.hz, remains};
        }
        band = {std::min(worst.hz, 0.45 * problem.settings.sampleRate), kGreedyQuality,
                std::clamp(-worst.decibels, -kFitMostDb, kFitMostDb)};
    }
    return bands;
}

// The best unknowns that are found from these bands on.
Vector optimise(const Problem &problem, const PeakBands &start, double mean) {
    Vector unknowns(problem.unknowns());
    unknowns[0] = mean;
    for (size_t i = 0; i < kFitBands; ++i) {
        unknowns[1 + i] = start[i].decibels;
        if (!problem.settings.free) continue;
        unknowns[1 + kFitBands + i] = std::log(start[i].hz);
        unknowns[1 + 2 * kFitBands + i] = std::log(start[i].quality);
    }
    double damping = 1e-3;
    for (int round = 0; round < kRounds && improve(problem, unknowns, damping); ++round) {
    }
    return unknowns;
}

}  // namespace

double peakResponse(const PeakBand &band, double hz, double sampleRate) {
    const double half = std::pow(10.0, band.decibels / 40.0);
    const double ratio =
        std::tan(std::numbers::pi * std::min(hz / sampleRate, 0.4999)) / std::tan(std::numbers::pi * band.hz / sampleRate);
    const double real = 1.0 - ratio * ratio;
    const double top = ratio * half / band.quality;
    const double bottom = ratio / half / band.quality;
    return 10.0 * std::log10((real * real + top * top) / (real * real + bottom * bottom));
}

double equaliserResponse(const PeakBands &bands, double hz, double sampleRate) {
    double sum = 0.0;
    for (const PeakBand &band : bands) sum += peakResponse(band, hz, sampleRate);
    return sum;
}

PeakBands sliderBands() {
    PeakBands bands;
    for (size_t i = 0; i < kFitBands; ++i) bands[i] = {kSliderHz[i], kSliderQuality, 0.0};
    return bands;
}

EqualiserFit fitEqualiser(const Curve &measured, const Curve &target, const FitSettings &settings) {
    EqualiserFit fit;
    fit.measured = pointsWithin(measured, settings);
    if (fit.measured.size() < 3)
        throw Failure(ExitStatus::input, "the measured curve has fewer than three points between --from and --to; widen them");
    Problem problem = {fit.measured, settings, sliderBands()};
    double mean = 0.0;
    for (CurvePoint &point : problem.points) {
        const double wanted = target.empty() ? 0.0 : levelAt(target, point.hz);
        fit.target.push_back({point.hz, wanted});
        point.decibels -= wanted;
        mean += point.decibels / static_cast<double>(problem.points.size());
    }
    Vector unknowns = optimise(problem, settings.free ? spreadBands(problem, mean) : sliderBands(), mean);
    if (settings.free) {
        const Vector other = optimise(problem, greedyBands(problem, mean), mean);
        if (sumOfSquares(residuals(problem, other)) < sumOfSquares(residuals(problem, unknowns))) unknowns = other;
    }
    fit.bands = bandsOf(problem, unknowns);
    fit.levelDb = unknowns[0];
    for (CurvePoint &point : fit.measured) {
        const double before = point.decibels;
        point.decibels = before - mean;
        fit.corrected.push_back({point.hz, before - fit.levelDb + equaliserResponse(fit.bands, point.hz, settings.sampleRate)});
    }
    fit.before = deviationOf(fit.measured, fit.target);
    fit.after = deviationOf(fit.corrected, fit.target);
    return fit;
}

}  // namespace vx
