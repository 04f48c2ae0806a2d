// SPDX-License-Identifier: MIT
//
// One readout of the analyser as its steps read: scalar, single precision, the twiddles drawn by their recurrence as the
// butterflies go. The judge of the fused and vectorised one, and the form that speed is compared with.
#pragma once

#include <cmath>
#include <cstddef>
#include <utility>
#include <vector>

#include "measure/exact_sine.h"

namespace plain {

inline void transform(std::vector<float> &x, int points) {
    const int floats = 2 * points;
    for (int i = 0, j = 0; i < floats; i += 2) {
        if (j > i) {
            std::swap(x[static_cast<size_t>(j)], x[static_cast<size_t>(i)]);
            std::swap(x[static_cast<size_t>(j) + 1], x[static_cast<size_t>(i) + 1]);
        }
        int m = points;
        while (m >= 2 && j >= m) {
            j -= m;
            m /= 2;
        }
        j += m;
    }
    for (int s = 2; s < floats; s *= 2) {
        const float theta = 6.283185307179586F / static_cast<float>(s);
        const float a = vxcomn::exactSine(theta / 2.0F);
        const float wpr = -2.0F * a * a, wpi = vxcomn::exactSine(theta);
        float wr = 1.0F, wi = 0.0F;
        for (int m = 0; m < s; m += 2) {
            for (int i = m; i < floats; i += 2 * s) {
                const auto p = static_cast<size_t>(i), q = static_cast<size_t>(i + s);
                const float re = wr * x[q] - wi * x[q + 1], im = wr * x[q + 1] + wi * x[q];
                x[q] = x[p] - re;
                x[q + 1] = x[p + 1] - im;
                x[p] = x[p] + re;
                x[p + 1] = x[p + 1] + im;
            }
            const float old = wr;
            wr += wr * wpr - wi * wpi;
            wi += wi * wpr + old * wpi;
        }
    }
}

inline void power(std::vector<float> &x, int points) {
    const float reciprocal = 1.0F / static_cast<float>(points);
    const float g = reciprocal * reciprocal;
    const auto half = static_cast<size_t>(points) / 2;
    x[0] = (x[0] * x[0] + x[1] * x[1]) * g;
    for (size_t k = 1; k < half; ++k) x[k] = 2.0F * (x[2 * k] * x[2 * k] + x[2 * k + 1] * x[2 * k + 1]) * g;
    x[half] = (x[2 * half] * x[2 * half] + x[2 * half + 1] * x[2 * half + 1]) * g;
}

inline std::vector<float> window(int half) {
    std::vector<float> result(static_cast<size_t>(half));
    for (size_t i = 0; i < result.size(); ++i) {
        result[i] = static_cast<float>(0.54 - 0.46 * vxcomn::exactCosine(6.283185307179586 * static_cast<double>(i) / half));
    }
    return result;
}

// Clamps, windows, pads, transforms; leaves the power in front.
inline void spectrum(std::vector<float> &work, int points) {
    const int half = points / 2;
    const std::vector<float> w = window(half);
    for (size_t k = 0; k < w.size(); ++k) {
        float value = work[2 * k];
        if (value > 1e6F) value = 1e6F;
        if (value < -1e6F) value = -1e6F;
        work[2 * k] = value * w[k];
        work[2 * k + 1] = 0.0F;
    }
    for (size_t i = static_cast<size_t>(points); i < 2 * static_cast<size_t>(points); ++i) work[i] = 0.0F;
    transform(work, points);
    power(work, points);
}

// Bands of a table, as the formulas read. One behind the spectrum's last value counts as that value.
inline std::vector<float> bands(const std::vector<float> &power, int half, const float *edges, const float *centres, int size,
                                int rate, bool integrate) {
    std::vector<float> result;
    const float s = static_cast<float>(2 * half) / static_cast<float>(rate);
    const auto limited = [&](float hz) {
        const float bin = hz * s;
        return static_cast<double>(half) < static_cast<double>(bin) ? static_cast<float>(half) : bin;
    };
    const auto at = [&](float bin) {
        return power[static_cast<size_t>(bin > static_cast<float>(half) ? static_cast<float>(half) : bin)];
    };
    for (int i = 0; i + 1 < size; ++i) {
        if (!integrate) {
            const float x = limited(centres[i]), fl = std::floor(x), ce = std::ceil(x);
            result.push_back((ce - x) * at(fl) + (x - fl) * at(ce));
            continue;
        }
        const float lo = limited(edges[i]), hi = limited(edges[i + 1]), a = std::floor(lo), b = std::floor(hi);
        if (a == b) {
            const float m = (lo + hi) / 2.0F;
            result.push_back(((m - a) * at(a + 1.0F) + ((a + 1.0F) - m) * at(a)) * (hi - lo));
            continue;
        }
        const float c = std::ceil(lo), d = std::ceil(hi), m1 = (c + lo) / 2.0F, m2 = (b + hi) / 2.0F;
        float sum = 0.0F;
        if (c != a) sum += ((c - m1) * at(a) + (m1 - a) * at(c)) * (c - lo) / (c - a);
        if (d != b) sum += (hi - b) * ((d - m2) * at(b) + (m2 - b) * at(d)) / (d - b);
        for (float k = c; k < b; k += 1.0F) sum += (at(k) + at(k + 1.0F)) / 2.0F;
        result.push_back(sum);
    }
    return result;
}

}  // namespace plain
