// SPDX-License-Identifier: MIT
#include "measure/analyser_transform.h"

#include <atomic>

#include "measure/exact_sine.h"
#include "measure/float_buffer.h"

namespace vxcomn {
namespace {

// One slot for each power of two. Filled at the first use, by whoever comes first; kept until the library goes.
struct TwiddleTables {
    std::atomic<float *> stage[31] = {};
    ~TwiddleTables() {
        for (auto &slot : stage) freeFloats(slot.load());
    }
};
TwiddleTables tables;

// w starts at 1 and is turned by the stage's angle again and again, in single precision with its own rounding errors.
void draw(int half, float *real, float *imaginary) {
    const float angle = 6.283185307179586F / static_cast<float>(2 * half);
    const float a = exactSine(angle / 2.0F);
    const float turnReal = -2.0F * a * a, turnImaginary = exactSine(angle);
    float wr = 1.0F, wi = 0.0F;
    for (int m = 0; m < half; ++m) {
        real[m] = wr;
        imaginary[m] = wi;
        const float before = wr;
        wr += wr * turnReal - wi * turnImaginary;
        wi += wi * turnReal + before * turnImaginary;
    }
}

void transformInPlace(float *points, int size, const StageTwiddles *stages) {
    for (int i = 0, j = 0; i < size; ++i) {
        if (j > i) {
            for (int part = 0; part < 2; ++part) {
                const float kept = points[2 * j + part];
                points[2 * j + part] = points[2 * i + part];
                points[2 * i + part] = kept;
            }
        }
        int bit = size / 2;
        while (bit >= 1 && (j & bit) != 0) {
            j &= ~bit;
            bit /= 2;
        }
        j |= bit;
    }
    for (int half = 1; half < size; half *= 2) {
        const StageTwiddles &w = *stages++;
        for (int m = 0; m < half; ++m) {
            for (int i = m; i < size; i += 2 * half) {
                float *const upper = points + 2 * i, *const lower = points + 2 * (i + half);
                const float tempReal = w.real[m] * lower[0] - w.imaginary[m] * lower[1];
                const float tempImaginary = w.real[m] * lower[1] + w.imaginary[m] * lower[0];
                lower[0] = upper[0] - tempReal;
                lower[1] = upper[1] - tempImaginary;
                upper[0] += tempReal;
                upper[1] += tempImaginary;
            }
        }
    }
}

void powerInPlace(float *points, int size) {
    const float scale = 1.0F / static_cast<float>(size);
    const float g = scale * scale;
    const int half = size / 2;
    points[0] = (points[0] * points[0] + points[1] * points[1]) * g;
    for (int k = 1; k < half; ++k) {
        const float re = points[2 * k], im = points[2 * k + 1];
        points[k] = 2.0F * (re * re + im * im) * g;
    }
    const float re = points[2 * half], im = points[2 * half + 1];
    points[half] = (re * re + im * im) * g;
}

}  // namespace

StageTwiddles stageTwiddles(int half) noexcept {
    std::atomic<float *> &slot = tables.stage[__builtin_ctz(static_cast<unsigned>(half))];
    float *table = slot.load(std::memory_order_acquire);
    if (table == nullptr) {
        table = allocateFloats(2 * static_cast<size_t>(half));
        if (table == nullptr) return {nullptr, nullptr};
        draw(half, table, table + half);
        float *other = nullptr;
        if (!slot.compare_exchange_strong(other, table, std::memory_order_acq_rel)) {
            freeFloats(table);
            table = other;
        }
    }
    return {table, table + half};
}

void plainSpectrum(float *points, const float *window, int size, const StageTwiddles *stages) noexcept {
    constexpr float kClamp = 1e6F;
    for (int k = 0; k < size / 2; ++k) {
        float value = points[2 * k];
        if (value > kClamp) value = kClamp;
        if (value < -kClamp) value = -kClamp;
        points[2 * k] = value * window[k];
        points[2 * k + 1] = 0.0F;
    }
    for (int i = size; i < 2 * size; ++i) points[i] = 0.0F;
    transformInPlace(points, size, stages);
    powerInPlace(points, size);
}

}  // namespace vxcomn
