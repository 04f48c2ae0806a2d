// SPDX-License-Identifier: MIT
//
// The analyser's transform in lanes. It does the operations of the plain form (measure/analyser_transform.h) and no others, in an
// order that suits the machine:
//
//   - Real and imaginary parts lie in planes of their own.
//   - Bit reversal and the first stages are one pass. W lanes wide, it takes W groups of W points whose inputs are neighbours, so
//   that a group
//     is a lane and its stages need no shuffles; a transposed W x W tile is then stored row by row to where the reversal sends each
//     group. Half of the inputs are padding, so the first stage is a copy and the second one works on real numbers.
//   - The other stages go two at a time, sub-blocks that fit the first cache before the whole.
//   - The last two compute only the bins that are wanted, and go straight to power.
//
// Left out are additions of the padding's zeros and products with them or with the first twiddle, 1 + 0i. That can turn the sign of
// a zero, which the squares of the end don't see.
#pragma once

#include "measure/kernels.h"
#include "measure/realtime.h"

namespace vxcomn {
namespace {

template <class L>
struct Complex {
    typename L::Floats re, im;
};

// a and b become a + w b and a - w b.
template <class L>
VXCOMN_RT_INLINE void butterfly(Complex<L> &a, Complex<L> &b, typename L::Floats wr, typename L::Floats wi) {
    const auto re = wr * b.re - wi * b.im, im = wr * b.im + wi * b.re;
    b.re = a.re - re;
    b.im = a.im - im;
    a.re += re;
    a.im += im;
}

template <class L>
VXCOMN_RT_INLINE Complex<L> loadComplex(const float *re, const float *im, int at) {
    return {L::load(re + at), L::load(im + at)};
}

template <class L>
VXCOMN_RT_INLINE void storeComplex(float *re, float *im, int at, const Complex<L> &value) {
    L::store(re + at, value.re);
    L::store(im + at, value.im);
}

constexpr int reversed(int value, int bits) {
    int result = 0;
    for (int i = 0; i < bits; ++i) result |= ((value >> i) & 1) << (bits - 1 - i);
    return result;
}

// Rows become columns: W / 2 pairs of rows are interleaved, log2 W times over.
template <class L>
VXCOMN_RT_INLINE void transpose(typename L::Floats *rows) {
    constexpr int kWidth = L::kWidth;
    for (int step = 1; step < kWidth; step *= 2) {
        typename L::Floats next[kWidth];
        for (int i = 0; i < kWidth / 2; ++i) {
            next[2 * i] = L::interleaveLow(rows[i], rows[i + kWidth / 2]);
            next[2 * i + 1] = L::interleaveHigh(rows[i], rows[i + kWidth / 2]);
        }
        for (int i = 0; i < kWidth; ++i) rows[i] = next[i];
    }
}

// The first log2 W stages, from samples in natural order to planes in reversed order.
template <class L>
VXCOMN_RT_INLINE void firstStages(const float *samples, int size, const StageTwiddles *stages, float *re, float *im) {
    using Floats = typename L::Floats;
    constexpr int kWidth = L::kWidth, kBits = kWidth == 16 ? 4 : kWidth == 8 ? 3 : 2;
    const int groups = size / kWidth, apart = groups / kWidth;  // groups, and how far the groups of neighbouring lanes land apart
    const Floats w2r = L::broadcast(stages[1].real[1]), w2i = L::broadcast(stages[1].imaginary[1]);
    int target = 0;  // `from`, reversed
    for (int from = 0; from < groups; from += kWidth) {
        Floats x[kWidth], y[kWidth];
        for (int group = 0; group < kWidth; group += 4) {
            const Floats p = L::load(samples + reversed(group, kBits) * groups + from);
            const Floats q = L::load(samples + reversed(group + 2, kBits) * groups + from);
            const Floats tempRe = w2r * q, tempIm = w2i * q;
            x[group] = p + q;
            x[group + 2] = p - q;
            x[group + 1] = p + tempRe;
            x[group + 3] = p - tempRe;
            y[group] = y[group + 2] = L::broadcast(0.0F);
            y[group + 1] = tempIm;
            y[group + 3] = -tempIm;
        }
        for (int bit = 2; bit < kBits; ++bit) {
            const int half = 1 << bit;
            for (int m = 0; m < half; ++m) {
                const Floats wr = L::broadcast(stages[bit].real[m]), wi = L::broadcast(stages[bit].imaginary[m]);
                for (int i = m; i < kWidth; i += 2 * half) {
                    const int j = i + half;
                    const bool real = bit == 2 && m % 2 == 0;  // these points have no imaginary part yet
                    const Floats tempRe = m == 0 ? x[j] : real ? wr * x[j] : wr * x[j] - wi * y[j];
                    const Floats tempIm = m == 0 ? y[j] : real ? wi * x[j] : wr * y[j] + wi * x[j];
                    x[j] = x[i] - tempRe;
                    y[j] = y[i] - tempIm;
                    x[i] += tempRe;
                    y[i] += tempIm;
                }
            }
        }
        transpose<L>(x);
        for (int lane = 0; lane < kWidth; ++lane) L::store(re + kWidth * (target + reversed(lane, kBits) * apart), x[lane]);
        transpose<L>(y);
        for (int lane = 0; lane < kWidth; ++lane) L::store(im + kWidth * (target + reversed(lane, kBits) * apart), y[lane]);

        int bit = apart / 2;
        for (; bit >= 1 && (target & bit) != 0; bit /= 2) target ^= bit;
        target |= bit;
    }
}

// One stage over `size` points.
template <class L>
VXCOMN_RT_INLINE void oneStage(float *re, float *im, int size, int half, const StageTwiddles &w) {
    for (int block = 0; block < size; block += 2 * half) {
        for (int m = 0; m < half; m += L::kWidth) {
            Complex<L> a = loadComplex<L>(re, im, block + m), b = loadComplex<L>(re, im, block + m + half);
            butterfly(a, b, L::load(w.real + m), L::load(w.imaginary + m));
            storeComplex(re, im, block + m, a);
            storeComplex(re, im, block + m + half, b);
        }
    }
}

// Two stages over `size` points, the first one with butterflies `half` apart.
template <class L>
VXCOMN_RT_INLINE void twoStages(float *re, float *im, int size, int half, const StageTwiddles *w) {
    for (int block = 0; block < size; block += 4 * half) {
        for (int m = 0; m < half; m += L::kWidth) {
            const int at = block + m;
            Complex<L> a = loadComplex<L>(re, im, at), b = loadComplex<L>(re, im, at + half);
            Complex<L> c = loadComplex<L>(re, im, at + 2 * half), d = loadComplex<L>(re, im, at + 3 * half);
            const auto wr = L::load(w[0].real + m), wi = L::load(w[0].imaginary + m);
            butterfly(a, b, wr, wi);
            butterfly(c, d, wr, wi);
            butterfly(a, c, L::load(w[1].real + m), L::load(w[1].imaginary + m));
            butterfly(b, d, L::load(w[1].real + m + half), L::load(w[1].imaginary + m + half));
            storeComplex(re, im, at, a);
            storeComplex(re, im, at + half, b);
            storeComplex(re, im, at + 2 * half, c);
            storeComplex(re, im, at + 3 * half, d);
        }
    }
}

// The last two stages and the power of bins 0 to size / 2, which lands in the real plane: each step has read what it writes over.
template <class L>
VXCOMN_RT_INLINE void lastStages(float *re, const float *im, int size, const StageTwiddles *w) {
    const int half = size / 4;
    const float reciprocal = 1.0F / static_cast<float>(size);
    const float g = reciprocal * reciprocal;
    const auto scale = L::broadcast(g), two = L::broadcast(2.0F);
    float first = 0.0F, middle = 0.0F;
    for (int m = 0; m < half; m += L::kWidth) {
        Complex<L> a = loadComplex<L>(re, im, m), b = loadComplex<L>(re, im, m + half);
        Complex<L> c = loadComplex<L>(re, im, m + 2 * half), d = loadComplex<L>(re, im, m + 3 * half);
        const auto wr = L::load(w[0].real + m), wi = L::load(w[0].imaginary + m);
        butterfly(a, b, wr, wi);
        butterfly(c, d, wr, wi);
        butterfly(a, c, L::load(w[1].real + m), L::load(w[1].imaginary + m));
        butterfly(b, d, L::load(w[1].real + m + half), L::load(w[1].imaginary + m + half));
        const auto lower = a.re * a.re + a.im * a.im;
        if (m == 0) {  // bins 0 and size / 2 stand alone, all others count for their mirror image too
            first = lower[0] * g;
            middle = (c.re[0] * c.re[0] + c.im[0] * c.im[0]) * g;
        }
        L::store(re + m, two * lower * scale);
        L::store(re + m + half, two * (b.re * b.re + b.im * b.im) * scale);
    }
    re[0] = first;
    re[2 * half] = middle;
}

// Clamps and windows.
template <class L>
VXCOMN_RT_INLINE void windowed(const float *from, const float *window, int count, float *to) {
    constexpr float kClamp = 1e6F;
    const auto high = L::broadcast(kClamp), low = L::broadcast(-kClamp);
    int i = 0;
    for (; i + L::kWidth <= count; i += L::kWidth) {
        L::store(to + i, L::larger(low, L::smaller(high, L::load(from + i))) * L::load(window + i));
    }
    for (; i < count; ++i) {
        float value = from[i];
        if (value > kClamp) value = kClamp;
        if (value < -kClamp) value = -kClamp;
        to[i] = value * window[i];
    }
}

template <class L>
VXCOMN_RT_INLINE void spectrumInLanes(const SpectrumJob &job) {
    constexpr int kSubBlock = 2048;  // points; 16 KiB of samples and as much of twiddles
    const int size = job.size, half = size / 2;
    float *const re = job.work, *const im = job.work + size, *const samples = job.work + 2 * size;
    windowed<L>(job.older, job.window, job.olderCount, samples);
    windowed<L>(job.newer, job.window + job.olderCount, half - job.olderCount, samples + job.olderCount);
    firstStages<L>(samples, size, job.stages, re, im);

    int apart = L::kWidth, bit = __builtin_ctz(static_cast<unsigned>(L::kWidth));
    const int sub = size < kSubBlock ? size : kSubBlock;
    const bool odd = (__builtin_ctz(static_cast<unsigned>(size)) - bit) % 2 != 0;
    for (int block = 0; block < size; block += sub) {
        apart = L::kWidth;
        bit = __builtin_ctz(static_cast<unsigned>(L::kWidth));
        if (odd) {
            oneStage<L>(re + block, im + block, sub, apart, job.stages[bit]);
            apart *= 2;
            bit += 1;
        }
        for (; 4 * apart <= sub && 4 * apart < size; apart *= 4, bit += 2)
            twoStages<L>(re + block, im + block, sub, apart, job.stages + bit);
    }
    for (; 4 * apart < size; apart *= 4, bit += 2) twoStages<L>(re, im, size, apart, job.stages + bit);
    lastStages<L>(re, im, size, job.stages + bit);
}

}  // namespace
}  // namespace vxcomn
