// SPDX-License-Identifier: MIT
#include "measure/fir_kernel_tables.h"

#include <array>
#include <map>
#include <mutex>
#include <utility>

#include "measure/fir_twiddles.h"

namespace vxcomn {
namespace {

int reverseBits(int value, int limit) noexcept {
    int result = 0;
    for (int bit = 1; bit < limit; bit *= 2) {
        result = 2 * result + (value & 1);
        value >>= 1;
    }
    return result;
}

FirKernelTables make(const FirKernels &kernels, int log2Size) {
    const FirTwiddlePair &twiddles = firTwiddles(log2Size);
    const int size = 1 << log2Size;
    const size_t values = static_cast<size_t>(size);
    FirKernelTables tables{makeAlignedArray<double>(2 * values * static_cast<size_t>(kernels.copies)),
                           makeAlignedArray<double>(2 * values), makeAlignedArray<double>(values),
                           makeAlignedArray<double>(values)};
    for (int l = 1; l < size; l *= 2) {
        for (int j = 0; j < l; ++j) {
            const int from = l + reverseBits(j, l);
            for (int copy = 0; copy < kernels.copies; ++copy) {
                double *const factor = tables.forward.get() + 2 * kernels.copies * (l + j);
                factor[copy] = twiddles.forward.real[from];
                factor[kernels.copies + copy] = twiddles.forward.imaginary[from];
            }
            tables.inverseReal[l + j] = twiddles.inverse.real[l + j];
            tables.inverseImaginary[l + j] = twiddles.inverse.imaginary[l + j];
        }
    }
    // A chunk is `lanes` groups, a lane each; within a group stage s has 2^s blocks.
    double *next = tables.middle.get();
    for (int chunk = 0; chunk < size; chunk += kernels.lanes * kernels.group) {
        for (int blocks = 1; blocks < kernels.group; blocks *= 2) {
            for (int block = 0; block < blocks; ++block) {
                for (int part = 0; part < 2; ++part) {
                    for (int lane = 0; lane < kernels.lanes; ++lane) {
                        const int heap = (size / kernels.group + chunk / kernels.group + lane) * blocks + block;
                        *next++ = tables.forward[kernels.copies * (2 * heap + part)];
                    }
                }
            }
        }
    }
    return tables;
}

}  // namespace

int firScratchValues(const FirKernels &kernels, int log2Size) noexcept {
    const int size = 1 << log2Size;
    const int rows = 1 << firFinalLevels(kernels, log2Size);
    return rows * firRowStride(size / rows) + 2 * size;
}

const FirKernelTables &firKernelTables(const FirKernels &kernels, int log2Size) {
    static std::mutex lock;
    static std::map<std::pair<const FirKernels *, int>, FirKernelTables> tables;
    const std::lock_guard guard(lock);
    const auto key = std::pair(&kernels, log2Size);
    auto found = tables.find(key);
    if (found == tables.end()) found = tables.emplace(key, make(kernels, log2Size)).first;
    return found->second;
}

void firArrangeResponse(const FirKernels &kernels, int log2Size, const double *response, double *arranged) noexcept {
    const int size = 1 << log2Size;
    for (int chunk = 0; chunk < size; chunk += kernels.lanes * kernels.group) {
        for (int place = 0; place < kernels.group; ++place) {
            for (int part = 0; part < 2; ++part) {
                for (int lane = 0; lane < kernels.lanes; ++lane) {
                    const int from = reverseBits(chunk + lane * kernels.group + place, size);
                    *arranged++ = response[2 * from + part];
                }
            }
        }
    }
}

}  // namespace vxcomn
