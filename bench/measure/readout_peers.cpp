// SPDX-License-Identifier: MIT
//
// The loops are compiled once for each instruction set, so that the peers lose nothing around their transform.
#include "bench/measure/readout_peers.h"

#include <algorithm>

namespace vxcomn::bench {

namespace {

#define VXCOMN_EACH_SET [[gnu::target_clones("avx512f", "avx2", "default")]]

VXCOMN_EACH_SET void windowReal(const float *__restrict samples, const float *__restrict window, float *__restrict out, int half) {
    for (int i = 0; i < half; ++i) out[i] = std::min(std::max(samples[i], -1e6F), 1e6F) * window[i];
    for (int i = half; i < 2 * half; ++i) out[i] = 0.0F;
}

VXCOMN_EACH_SET void windowComplex(const float *__restrict samples, const float *__restrict window, float *__restrict out,
                                   int half) {
    for (int i = 0; i < half; ++i) {
        out[2 * i] = std::min(std::max(samples[i], -1e6F), 1e6F) * window[i];
        out[2 * i + 1] = 0.0F;
    }
    for (int i = 2 * half; i < 4 * half; ++i) out[i] = 0.0F;
}

VXCOMN_EACH_SET void powerOf(const float *__restrict bins, float *__restrict power, int half, float g) {
    for (int k = 0; k <= half; ++k) power[k] = 2.0F * (bins[2 * k] * bins[2 * k] + bins[2 * k + 1] * bins[2 * k + 1]) * g;
    power[0] *= 0.5F;
    power[half] *= 0.5F;
}

}  // namespace

ReadoutPeer::ReadoutPeer(int size, bool real)
    : size_(size),
      real_(real),
      in_(fftwf_alloc_real(2 * static_cast<size_t>(size))),
      out_(fftwf_alloc_complex(static_cast<size_t>(size))),
      power_(static_cast<size_t>(size / 2 + 1)) {
    auto *const complexIn = reinterpret_cast<fftwf_complex *>(in_);
    plan_ = real ? fftwf_plan_dft_r2c_1d(size, in_, out_, FFTW_MEASURE)
                 : fftwf_plan_dft_1d(size, complexIn, out_, FFTW_FORWARD, FFTW_MEASURE);
}

ReadoutPeer::~ReadoutPeer() {
    fftwf_destroy_plan(plan_);
    fftwf_free(in_);
    fftwf_free(out_);
}

const std::vector<float> &ReadoutPeer::run(const float *samples, const float *window) {
    const int half = size_ / 2;
    if (real_) {
        windowReal(samples, window, in_, half);
    } else {
        windowComplex(samples, window, in_, half);
    }
    fftwf_execute(plan_);
    const float scale = 1.0F / static_cast<float>(size_);
    powerOf(reinterpret_cast<const float *>(out_), power_.data(), half, scale * scale);
    return power_;
}

}  // namespace vxcomn::bench
