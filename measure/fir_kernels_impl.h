// SPDX-License-Identifier: MIT
//
// The FIR filter's block in vectors of kLanes doubles. Included once by each of the instruction sets' files, which define
// VXCOMN_FIR_LANES, VXCOMN_FIR_GROUP and VXCOMN_FIR_LEVELS (the most stages that one pass fuses) and instantiate it there.
//
// Every butterfly does the operations of the plain form on the same numbers with the same factors; only the order among independent
// butterflies differs. The gains:
//  - Split planes, a lane for each butterfly, several stages in one pass over memory.
//  - The input is real and at least its upper half is zero. Stages that only add a zero are left out: such a stage copies a value
//  to
//    both its outputs, except that adding +0 turns -0 into +0. The sum of a pair meets +0 or the difference of it, and only the
//    difference keeps -0, so only the last block, which took the difference each time, sees the input's own -0. Infinities and NaN
//    come through unchanged either way.
//  - The last forward stages, the product and the first inverse stages work on one load of the data: `kLanes` groups transposed
//  into
//    registers, a lane for each group.
//  - The last inverse stage makes real parts only.
// The passes between go row by row, so that a row stays in the first cache from the first stage to the last but `final`.
#pragma once

#include "measure/fir_kernel_tables.h"

namespace vxcomn {
namespace {

constexpr int kLanes = VXCOMN_FIR_LANES;
constexpr int kGroup = VXCOMN_FIR_GROUP;
constexpr int kLevels = VXCOMN_FIR_LEVELS;
constexpr int kChunk = kLanes * kGroup;

constexpr int log2Of(int value) {
    return value <= 1 ? 0 : 1 + log2Of(value / 2);
}
constexpr int kGroupLevels = log2Of(kGroup);

// The widest registers take a factor to all lanes as fast as they load a vector; the others find it there.
constexpr int kFilledFactors = kLanes == 8 ? 1 : kGroup;

typedef double Vector __attribute__((vector_size(kLanes * 8)));
typedef float Floats __attribute__((vector_size(kLanes * 4)));
typedef double AnyVector __attribute__((vector_size(kLanes * 8), aligned(8), may_alias));
typedef float AnyFloats __attribute__((vector_size(kLanes * 4), aligned(4), may_alias));
typedef double OwnVector __attribute__((vector_size(kLanes * 8), may_alias));

#define VXCOMN_FIR_UNROLL _Pragma("GCC unroll 8")

struct Complex {
    Vector real;
    Vector imaginary;
};

VXCOMN_RT_INLINE Vector loadVector(const double *from) noexcept {
    return *reinterpret_cast<const OwnVector *>(from);
}
VXCOMN_RT_INLINE void storeVector(double *to, Vector value) noexcept {
    *reinterpret_cast<OwnVector *>(to) = value;
}
VXCOMN_RT_INLINE Vector everyLane(double value) noexcept {
    return value - Vector{};
}  // x - 0 is x, also for -0

// A factor of the forward table, in every lane. Where a register can't be filled from one value in memory, the table holds it
// twice.
VXCOMN_RT_INLINE Complex forwardFactor(const double *factors, int index) noexcept {
#if VXCOMN_FIR_LANES == 2
    return {loadVector(factors + 4 * index), loadVector(factors + 4 * index + 2)};
#else
    return {everyLane(factors[2 * index]), everyLane(factors[2 * index + 1])};
#endif
}

VXCOMN_RT_INLINE Vector loadWidened(const float *from) noexcept {
    const Floats narrow = *reinterpret_cast<const AnyFloats *>(from);
    return __builtin_convertvector(narrow, Vector);
}
VXCOMN_RT_INLINE void storeRounded(float *to, Vector value) noexcept {
    *reinterpret_cast<AnyFloats *>(to) = __builtin_convertvector(value, Floats);
}

VXCOMN_RT_INLINE void butterfly(Complex &low, Complex &high, const Complex &u) noexcept {
    const Vector t1 = u.real * high.real - u.imaginary * high.imaginary;
    const Vector t2 = u.real * high.imaginary + u.imaginary * high.real;
    high.real = low.real - t1;
    high.imaginary = low.imaginary - t2;
    low.real = low.real + t1;
    low.imaginary = low.imaginary + t2;
}

// The first stage that has something to do: the imaginary parts are still +0. A sum of +0 and any zero is +0, so the zero that the
// second line would add to makes no difference; the one in the first does, where `low` is -0.
VXCOMN_RT_INLINE void realButterfly(Complex &low, Complex &high, const Complex &u) noexcept {
    const Vector zero = {};
    const Vector t1 = u.real * high.real - u.imaginary * zero;
    const Vector t2 = u.imaginary * high.real;
    high.real = low.real - t1;
    high.imaginary = zero - t2;
    low.real = low.real + t1;
    low.imaginary = zero + t2;
}

// Exchanges the lanes and the registers of kLanes vectors.
VXCOMN_RT_INLINE void transpose(Vector *rows) noexcept {
    VXCOMN_FIR_UNROLL
    for (int i = 0; i < kLanes; i += 2) {
        const Vector a = rows[i];
        const Vector b = rows[i + 1];
#if VXCOMN_FIR_LANES == 2
        rows[i] = __builtin_shufflevector(a, b, 0, 2);
        rows[i + 1] = __builtin_shufflevector(a, b, 1, 3);
#elif VXCOMN_FIR_LANES == 4
        rows[i] = __builtin_shufflevector(a, b, 0, 4, 2, 6);
        rows[i + 1] = __builtin_shufflevector(a, b, 1, 5, 3, 7);
#else
        rows[i] = __builtin_shufflevector(a, b, 0, 8, 2, 10, 4, 12, 6, 14);
        rows[i + 1] = __builtin_shufflevector(a, b, 1, 9, 3, 11, 5, 13, 7, 15);
#endif
    }
#if VXCOMN_FIR_LANES >= 4
    VXCOMN_FIR_UNROLL
    for (int i = 0; i < kLanes; ++i) {
        if ((i & 2) != 0) continue;
        const Vector a = rows[i];
        const Vector b = rows[i + 2];
#if VXCOMN_FIR_LANES == 4
        rows[i] = __builtin_shufflevector(a, b, 0, 1, 4, 5);
        rows[i + 2] = __builtin_shufflevector(a, b, 2, 3, 6, 7);
#else
        rows[i] = __builtin_shufflevector(a, b, 0, 1, 8, 9, 4, 5, 12, 13);
        rows[i + 2] = __builtin_shufflevector(a, b, 2, 3, 10, 11, 6, 7, 14, 15);
#endif
    }
#endif
#if VXCOMN_FIR_LANES == 8
    VXCOMN_FIR_UNROLL
    for (int i = 0; i < 4; ++i) {
        const Vector a = rows[i];
        const Vector b = rows[i + 4];
        rows[i] = __builtin_shufflevector(a, b, 0, 1, 2, 3, 8, 9, 10, 11);
        rows[i + 4] = __builtin_shufflevector(a, b, 4, 5, 6, 7, 12, 13, 14, 15);
    }
#endif
}

// One piece of the block, at most half the transform.
struct Piece {
    const FirBlock *block;
    int size;
    int rowLength;                         // a power of two
    int rowShift;                          // its logarithm
    int rowStride;                         // doubles from row to row
    int imaginary;                         // doubles from a real part to its imaginary part
    double *positive;                      // the input widened, with +0 for -0, and zeros behind it
    double *original;                      // the input widened, and zeros behind it
    double *real;                          // the output before it is rounded
    Complex groupFactors[kFilledFactors];  // of the inverse stages within a group, in every lane

    VXCOMN_RT_INLINE double *at(int position) const noexcept {
        return block->work + (position >> rowShift) * rowStride + (position & (rowLength - 1));
    }
};

// The first forward pass: Levels stages from stage l on, on the l copies of the input.
template <int Levels>
VXCOMN_RT_INLINE void firstPass(const Piece &piece, int l, int firstBlock, int endBlock) noexcept {
    constexpr int kLegs = 1 << Levels;
    const int length = piece.size / l;
    const int step = length / kLegs;
    const double *const factors = piece.block->tables->forward.get();
    for (int b = firstBlock; b < endBlock; ++b) {
        const double *const from = b == l - 1 ? piece.original : piece.positive;
        double *legs[kLegs];
        VXCOMN_FIR_UNROLL
        for (int m = 0; m < kLegs; ++m) legs[m] = piece.at(b * length + m * step);
        for (int r = 0; r < step; r += kLanes) {
            Complex x[kLegs];
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) x[m].real = loadVector(from + m * step + r);
            const Complex u = forwardFactor(factors, l + b);
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs / 2; ++m) realButterfly(x[m], x[m + kLegs / 2], u);
            VXCOMN_FIR_UNROLL
            for (int s = 1; s < Levels; ++s) {
                const int span = kLegs >> (s + 1);
                const int blocks = 1 << s;
                VXCOMN_FIR_UNROLL
                for (int k = 0; k < blocks; ++k) {
                    const Complex v = forwardFactor(factors, ((l + b) << s) + k);
                    VXCOMN_FIR_UNROLL
                    for (int m = 0; m < span; ++m) butterfly(x[2 * span * k + m], x[2 * span * k + span + m], v);
                }
            }
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) {
                storeVector(legs[m] + r, x[m].real);
                storeVector(legs[m] + piece.imaginary + r, x[m].imaginary);
            }
        }
    }
}

// Levels forward stages from stage l on, in place. A block of the first of them does not reach beyond a row.
template <int Levels>
VXCOMN_RT_INLINE void forwardPass(const Piece &piece, int l, int firstBlock, int endBlock) noexcept {
    constexpr int kLegs = 1 << Levels;
    const int length = piece.size / l;
    const int step = length / kLegs;
    const double *const factors = piece.block->tables->forward.get();
    for (int b = firstBlock; b < endBlock; ++b) {
        double *const base = piece.at(b * length);
        for (int r = 0; r < step; r += kLanes) {
            Complex x[kLegs];
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) {
                x[m] = {loadVector(base + m * step + r), loadVector(base + piece.imaginary + m * step + r)};
            }
            VXCOMN_FIR_UNROLL
            for (int s = 0; s < Levels; ++s) {
                const int span = kLegs >> (s + 1);
                const int blocks = 1 << s;
                VXCOMN_FIR_UNROLL
                for (int k = 0; k < blocks; ++k) {
                    const Complex u = forwardFactor(factors, ((l + b) << s) + k);
                    VXCOMN_FIR_UNROLL
                    for (int m = 0; m < span; ++m) butterfly(x[2 * span * k + m], x[2 * span * k + span + m], u);
                }
            }
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) {
                storeVector(base + m * step + r, x[m].real);
                storeVector(base + piece.imaginary + m * step + r, x[m].imaginary);
            }
        }
    }
}

// The forward stages within groups, the product with the response, the inverse stages within groups: one chunk.
VXCOMN_RT_INLINE void middlePass(const Piece &piece, int position) noexcept {
    const int chunk = position / kChunk;
    const double *factor = piece.block->tables->middle.get() + chunk * (2 * kLanes * (kGroup - 1));
    const double *const response = piece.block->response + chunk * (2 * kChunk);
    double *groups[kLanes];
    VXCOMN_FIR_UNROLL
    for (int q = 0; q < kLanes; ++q) groups[q] = piece.at(position + q * kGroup);

    Complex x[kGroup];
    VXCOMN_FIR_UNROLL
    for (int tile = 0; tile < kGroup; tile += kLanes) {
        Vector real[kLanes];
        Vector imaginary[kLanes];
        VXCOMN_FIR_UNROLL
        for (int q = 0; q < kLanes; ++q) {
            real[q] = loadVector(groups[q] + tile);
            imaginary[q] = loadVector(groups[q] + piece.imaginary + tile);
        }
        transpose(real);
        transpose(imaginary);
        VXCOMN_FIR_UNROLL
        for (int q = 0; q < kLanes; ++q) x[tile + q] = {real[q], imaginary[q]};
    }
    VXCOMN_FIR_UNROLL
    for (int s = 0; s < kGroupLevels; ++s) {
        const int span = kGroup >> (s + 1);
        const int blocks = 1 << s;
        VXCOMN_FIR_UNROLL
        for (int k = 0; k < blocks; ++k) {
            const Complex u = {loadVector(factor), loadVector(factor + kLanes)};
            factor += 2 * kLanes;
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < span; ++m) butterfly(x[2 * span * k + m], x[2 * span * k + span + m], u);
        }
    }
    VXCOMN_FIR_UNROLL
    for (int m = 0; m < kGroup; ++m) {
        const Complex h = {loadVector(response + 2 * kLanes * m), loadVector(response + 2 * kLanes * m + kLanes)};
        x[m] = {x[m].real * h.real - x[m].imaginary * h.imaginary, x[m].real * h.imaginary + x[m].imaginary * h.real};
    }
    VXCOMN_FIR_UNROLL
    for (int s = 0; s < kGroupLevels; ++s) {
        const int span = 1 << s;
        VXCOMN_FIR_UNROLL
        for (int j = 0; j < span; ++j) {
#if VXCOMN_FIR_LANES == 8
            const Complex u = {everyLane(piece.block->tables->inverseReal[span + j]),
                               everyLane(piece.block->tables->inverseImaginary[span + j])};
#else
            const Complex &u = piece.groupFactors[span + j];
#endif
            VXCOMN_FIR_UNROLL
            for (int m = j; m < kGroup; m += 2 * span) butterfly(x[m], x[m + span], u);
        }
    }
    VXCOMN_FIR_UNROLL
    for (int tile = 0; tile < kGroup; tile += kLanes) {
        Vector real[kLanes];
        Vector imaginary[kLanes];
        VXCOMN_FIR_UNROLL
        for (int q = 0; q < kLanes; ++q) {
            real[q] = x[tile + q].real;
            imaginary[q] = x[tile + q].imaginary;
        }
        transpose(real);
        transpose(imaginary);
        VXCOMN_FIR_UNROLL
        for (int q = 0; q < kLanes; ++q) {
            storeVector(groups[q] + tile, real[q]);
            storeVector(groups[q] + piece.imaginary + tile, imaginary[q]);
        }
    }
}

// The butterflies of the inverse stages l, 2 l, ..., Levels of them, on Legs values that stand l apart, the first with index j in
// its block.
template <int Levels, int Legs>
VXCOMN_RT_INLINE void inverseStages(const Piece &piece, Complex *x, int l, int j) noexcept {
    const double *const inverseReal = piece.block->tables->inverseReal.get();
    const double *const inverseImaginary = piece.block->tables->inverseImaginary.get();
    VXCOMN_FIR_UNROLL
    for (int s = 0; s < Levels; ++s) {
        const int span = 1 << s;
        VXCOMN_FIR_UNROLL
        for (int k = 0; k < span; ++k) {
            const int index = (l << s) + k * l + j;
            const Complex u = {loadVector(inverseReal + index), loadVector(inverseImaginary + index)};
            VXCOMN_FIR_UNROLL
            for (int m = k; m < Legs; m += 2 * span) butterfly(x[m], x[m + span], u);
        }
    }
}

// Levels inverse stages from stage l on, in place, on the rows' part from `position` on. No block reaches beyond a row.
template <int Levels>
VXCOMN_RT_INLINE void inversePass(const Piece &piece, int l, int position, int end) noexcept {
    constexpr int kLegs = 1 << Levels;
    const int length = l * kLegs;
    for (; position < end; position += length) {
        double *const base = piece.at(position);
        for (int j = 0; j < l; j += kLanes) {
            Complex x[kLegs];
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) x[m] = {loadVector(base + m * l + j), loadVector(base + piece.imaginary + m * l + j)};
            inverseStages<Levels, kLegs>(piece, x, l, j);
            VXCOMN_FIR_UNROLL
            for (int m = 0; m < kLegs; ++m) {
                storeVector(base + m * l + j, x[m].real);
                storeVector(base + piece.imaginary + m * l + j, x[m].imaginary);
            }
        }
    }
}

// The last inverse pass, across the rows. Of its last stage only the real parts are made. A full piece goes straight to the output
// and the overlap.
template <int Levels, bool Full>
VXCOMN_RT_INLINE void finalPass(const Piece &piece, float *out) noexcept {
    constexpr int kLegs = 1 << Levels;
    constexpr int kHalf = kLegs / 2;
    const int l = piece.rowLength;
    const double *const inverseReal = piece.block->tables->inverseReal.get();
    const double *const inverseImaginary = piece.block->tables->inverseImaginary.get();
    float *const overlap = piece.block->overlap;
    const Vector scale = everyLane(1.0 / piece.size);  // a power of two: the same as the division
    for (int j = 0; j < l; j += kLanes) {
        const double *const base = piece.block->work + j;
        Complex x[kLegs];
        VXCOMN_FIR_UNROLL
        for (int m = 0; m < kLegs; ++m) {
            x[m] = {loadVector(base + m * piece.rowStride), loadVector(base + m * piece.rowStride + piece.imaginary)};
        }
        inverseStages<Levels - 1, kLegs>(piece, x, l, j);
        VXCOMN_FIR_UNROLL
        for (int m = 0; m < kHalf; ++m) {
            const int index = (kHalf + m) * l + j;
            const Vector t1 =
                loadVector(inverseReal + index) * x[m + kHalf].real - loadVector(inverseImaginary + index) * x[m + kHalf].imaginary;
            const Vector low = (x[m].real + t1) * scale;
            const Vector high = (x[m].real - t1) * scale;
            if constexpr (Full) {
                float *const carried = overlap + m * l + j;
                storeRounded(out + m * l + j, loadWidened(carried) + low);
                storeRounded(carried, high);
            } else {
                storeVector(piece.real + m * l + j, low);
                storeVector(piece.real + (m + kHalf) * l + j, high);
            }
        }
    }
}

// Widens the input twice and pads it with zeros up to `padded`, a multiple of the lanes.
VXCOMN_RT_INLINE void widen(const Piece &piece, const float *in, int length, int padded) noexcept {
    const Vector zero = {};
    int i = 0;
    for (; i + kLanes <= length; i += kLanes) {
        const Vector x = loadWidened(in + i);
        storeVector(piece.original + i, x);
        storeVector(piece.positive + i, x + zero);
    }
    if (i == padded) return;
    for (int j = i; j < padded; j += kLanes) {
        storeVector(piece.original + j, zero);
        storeVector(piece.positive + j, zero);
        asm volatile("");  // keeps the loop from becoming a call to memset, which stands outside the block path
    }
    for (; i < length; ++i) {
        piece.original[i] = static_cast<double>(in[i]);
        piece.positive[i] = static_cast<double>(in[i]) + 0.0;
    }
}

// to[i] = carried[i] + real[i], rounded, for i below count. `to` may lie before `carried` in the same memory.
VXCOMN_RT_INLINE void addCarried(float *to, const float *carried, const double *real, int count) noexcept {
    int i = 0;
    for (; i + kLanes <= count; i += kLanes) {
        const Vector value = *reinterpret_cast<const AnyVector *>(real + i);
        storeRounded(to + i, loadWidened(carried + i) + value);
    }
    for (; i < count; ++i) to[i] = static_cast<float>(static_cast<double>(carried[i]) + real[i]);
}

VXCOMN_RT_INLINE void roundOff(float *to, const double *real, int count) noexcept {
    int i = 0;
    for (; i + kLanes <= count; i += kLanes) storeRounded(to + i, *reinterpret_cast<const AnyVector *>(real + i));
    for (; i < count; ++i) to[i] = static_cast<float>(real[i]);
}

// How many stages the next pass takes of those that are left. The first forward pass must come down to rows.
VXCOMN_RT_INLINE int nextLevels(int left) noexcept {
    if (kLevels == 2) return left % 2 == 0 ? 2 : 1;
    if (left <= 3) return left;
    return left % 3 == 0 ? 3 : 2;
}

VXCOMN_RT_INLINE void firstPassOf(int levels, const Piece &piece, int l, int firstBlock, int endBlock) noexcept {
    if (levels == 3) {
        firstPass<3>(piece, l, firstBlock, endBlock);
    } else if (levels == 2) {
        firstPass<2>(piece, l, firstBlock, endBlock);
    } else {
        firstPass<1>(piece, l, firstBlock, endBlock);
    }
}

VXCOMN_RT_INLINE void processPiece(const Piece &piece, int log2Size, const float *in, float *out, int length) noexcept {
    // The input fills the first of 2^copied parts; at least one stage is left before the groups.
    int copied = log2Size - kGroupLevels - 1;
    while ((piece.size >> copied) < length) --copied;
    const int part = piece.size >> copied;
    widen(piece, in, length, part);

    int left = log2Size - kGroupLevels - copied;
    const int firstLevels = kLevels == 2 && left % 2 != 0 && left >= 3 ? 3 : nextLevels(left);
    left -= firstLevels;
    const int stretch = piece.rowLength < kChunk ? kChunk : piece.rowLength;
    const bool copiesFit = part <= stretch;
    if (!copiesFit) firstPassOf(firstLevels, piece, 1 << copied, 0, 1 << copied);

    for (int position = 0; position < piece.size; position += stretch) {
        const int end = position + stretch;
        if (copiesFit) firstPassOf(firstLevels, piece, 1 << copied, position / part, end / part);
        int stage = copied + firstLevels;
        for (int rest = left; rest != 0;) {
            const int levels = nextLevels(rest);
            const int block = piece.size >> stage;
            if (levels == 3) {
                forwardPass<3>(piece, 1 << stage, position / block, end / block);
            } else if (levels == 2) {
                forwardPass<2>(piece, 1 << stage, position / block, end / block);
            } else {
                forwardPass<1>(piece, 1 << stage, position / block, end / block);
            }
            stage += levels;
            rest -= levels;
        }
        for (int i = position; i < end; i += kChunk) middlePass(piece, i);
        for (int l = kGroup, rest = piece.rowShift - kGroupLevels; rest != 0;) {
            const int levels = nextLevels(rest);
            if (levels == 3) {
                inversePass<3>(piece, l, position, end);
            } else if (levels == 2) {
                inversePass<2>(piece, l, position, end);
            } else {
                inversePass<1>(piece, l, position, end);
            }
            l <<= levels;
            rest -= levels;
        }
    }

    const int half = piece.size / 2;
    const int finalLevels = log2Size - piece.rowShift;
    if (length == half) {
        if (finalLevels == 3) {
            finalPass<3, true>(piece, out);
        } else {
            finalPass<2, true>(piece, out);
        }
        return;
    }
    if (finalLevels == 3) {
        finalPass<3, false>(piece, out);
    } else {
        finalPass<2, false>(piece, out);
    }
    float *const overlap = piece.block->overlap;
    addCarried(out, overlap, piece.real, length);
    addCarried(overlap, overlap + length, piece.real + length, half - length);
    roundOff(overlap + (half - length), piece.real + half, length);
}

VXCOMN_RT_INLINE void processBlock(const FirKernels &kernels, const FirBlock &block) noexcept {
    const int size = 1 << block.log2Size;
    const int half = size / 2;
    Piece piece;
    piece.block = &block;
    piece.size = size;
    piece.rowShift = block.log2Size - firFinalLevels(kernels, block.log2Size);
    piece.rowLength = 1 << piece.rowShift;
    piece.rowStride = firRowStride(piece.rowLength);
    piece.imaginary = piece.rowLength + kFirRowGap;
    piece.positive = block.work + (size >> piece.rowShift) * piece.rowStride;
    piece.original = piece.positive + half;
    piece.real = piece.original + half;
    for (int i = 1; i < kFilledFactors; ++i) {
        piece.groupFactors[i] = {everyLane(block.tables->inverseReal[i]), everyLane(block.tables->inverseImaginary[i])};
    }
    for (int done = 0; done < block.count;) {
        const int length = block.count - done < half ? block.count - done : half;
        processPiece(piece, block.log2Size, block.in + done, block.out + done, length);
        done += length;
    }
}

#undef VXCOMN_FIR_UNROLL

}  // namespace
}  // namespace vxcomn
