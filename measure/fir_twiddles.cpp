// SPDX-License-Identifier: MIT
#include "measure/fir_twiddles.h"

#include <array>
#include <mutex>

#include "measure/elliptic_math.h"

namespace vxcomn {
namespace {

FirTwiddles draw(int size, bool forward) {
    FirTwiddles table{std::make_unique<double[]>(size), std::make_unique<double[]>(size)};
    double c = -1.0;
    double s = 0.0;
    for (int l = 1; l < size; l *= 2) {
        double u1 = 1.0;
        double u2 = 0.0;
        for (int j = 0; j < l; ++j) {
            table.real[l + j] = u1;
            table.imaginary[l + j] = u2;
            const double z = u1 * c - u2 * s;
            u2 = u1 * s + u2 * c;
            u1 = z;
        }
        s = squareRoot((1.0 - c) / 2.0);
        if (forward) s = -s;
        c = squareRoot((1.0 + c) / 2.0);
    }
    return table;
}

}  // namespace

const FirTwiddlePair &firTwiddles(int log2Size) {
    static std::mutex lock;
    static std::array<std::unique_ptr<FirTwiddlePair>, kFirMaxLog2Size + 1> tables;
    const std::lock_guard guard(lock);
    std::unique_ptr<FirTwiddlePair> &table = tables[static_cast<size_t>(log2Size)];
    if (table == nullptr)
        table = std::make_unique<FirTwiddlePair>(FirTwiddlePair{draw(1 << log2Size, true), draw(1 << log2Size, false)});
    return *table;
}

VXCOMN_RT void firTransform(double *values, int log2Size, const FirTwiddles &twiddles) noexcept {
    const int size = 1 << log2Size;
    for (int i = 0, j = 0; i < size - 1; ++i) {
        if (i < j) {
            const double real = values[2 * i];
            const double imaginary = values[2 * i + 1];
            values[2 * i] = values[2 * j];
            values[2 * i + 1] = values[2 * j + 1];
            values[2 * j] = real;
            values[2 * j + 1] = imaginary;
        }
        int k = size / 2;
        for (; k <= j; k /= 2) j -= k;
        j += k;
    }
    const double *real = twiddles.real.get();
    const double *imaginary = twiddles.imaginary.get();
    for (int l = 1; l < size; l *= 2) {
        for (int j = 0; j < l; ++j) {
            const double u1 = real[l + j];
            const double u2 = imaginary[l + j];
            for (int i = j; i < size; i += 2 * l) {
                double *const low = values + 2 * i;
                double *const high = low + 2 * l;
                const double t1 = u1 * high[0] - u2 * high[1];
                const double t2 = u1 * high[1] + u2 * high[0];
                high[0] = low[0] - t1;
                high[1] = low[1] - t2;
                low[0] += t1;
                low[1] += t2;
            }
        }
    }
}

}  // namespace vxcomn
