// SPDX-License-Identifier: MIT
//
// The judge of FftFirFilter: the same arithmetic written down as plainly as can be, with no table and no memory between stages. It
// shares no code with the library.
#pragma once

#include <cmath>
#include <complex>
#include <cstdlib>
#include <utility>
#include <vector>

namespace plain {

struct Value {
    double re = 0.0;
    double im = 0.0;
};

inline void transform(std::vector<Value> &v, bool forward) {
    const int n = static_cast<int>(v.size());
    for (int i = 0, j = 0; i < n - 1; ++i) {
        if (i < j) std::swap(v[i], v[j]);
        int k = n / 2;
        while (k <= j) {
            j -= k;
            k /= 2;
        }
        j += k;
    }
    double c = -1.0;
    double s = 0.0;
    for (int l = 1; l < n; l *= 2) {
        double u1 = 1.0;
        double u2 = 0.0;
        for (int j = 0; j < l; ++j) {
            for (int i = j; i < n; i += 2 * l) {
                const int i1 = i + l;
                const double t1 = u1 * v[i1].re - u2 * v[i1].im;
                const double t2 = u1 * v[i1].im + u2 * v[i1].re;
                v[i1] = {v[i].re - t1, v[i].im - t2};
                v[i] = {v[i].re + t1, v[i].im + t2};
            }
            const double z = u1 * c - u2 * s;
            u2 = u1 * s + u2 * c;
            u1 = z;
        }
        s = std::sqrt((1.0 - c) / 2.0);
        if (forward) s = -s;
        c = std::sqrt((1.0 + c) / 2.0);
    }
    if (!forward) {
        for (Value &value : v) value = {value.re / n, value.im / n};
    }
}

struct Fir {
    int taps = 0;
    int size = 0;
    std::vector<Value> response;
    std::vector<float> overlap;

    void load(const std::vector<float> &newTaps) {
        const int count = static_cast<int>(newTaps.size());
        if (count != taps) {
            taps = count;
            size = 1 << (static_cast<int>(std::ceil(std::log2(static_cast<double>(std::abs(taps))))) + 1);
            overlap.assign(static_cast<size_t>(size / 2), 0.0f);
        }
        response.assign(static_cast<size_t>(size), Value{});
        for (int i = 0; i < count; ++i) response[i].re = newTaps[i];
        transform(response, true);
    }

    void process(const float *in, float *out, int count) {
        const int h = size / 2;
        while (count > 0) {
            const int length = count < h ? count : h;
            std::vector<Value> work(static_cast<size_t>(size));
            for (int i = 0; i < length; ++i) work[i].re = in[i];
            transform(work, true);
            for (int i = 0; i < size; ++i) {
                const Value w = work[i];
                const Value r = response[i];
                work[i] = {w.re * r.re - w.im * r.im, w.re * r.im + w.im * r.re};
            }
            transform(work, false);
            for (int i = 0; i < length; ++i) out[i] = static_cast<float>(static_cast<double>(overlap[i]) + work[i].re);
            for (int i = length; i < h; ++i) overlap[i - length] = static_cast<float>(static_cast<double>(overlap[i]) + work[i].re);
            for (int i = h; i < h + length; ++i) overlap[i - length] = static_cast<float>(work[i].re);
            in += length;
            out += length;
            count -= length;
        }
    }
};

}  // namespace plain
