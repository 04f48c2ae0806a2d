// SPDX-License-Identifier: MIT
//
// FftFirFilter: the block side, called from the block functions. Nothing here allocates, locks or waits.
#include <atomic>

#include "measure/fir_block_guard.h"
#include "measure/fir_plan.h"
#include "vxcomn/measurement_records.h"

namespace vxcomn {
namespace {

// One piece of at most half the transform, in the plain form, on interleaved complex values.
VXCOMN_RT void processPiece(const FftFirFilter &filter, const FirPlan &plan, const double *response, const float *in, float *out,
                            int length) noexcept {
    const int size = plan.fftSize;
    const int half = size / 2;
    double *const work = filter.work;
    float *const overlap = filter.overlap;
    for (int i = 0; i < size; ++i) {
        work[2 * i] = i < length ? static_cast<double>(in[i]) : 0.0;
        work[2 * i + 1] = 0.0;
    }
    if (filter.beforeTransform != nullptr) filter.beforeTransform(work, filter.beforeTransformArgument);
    firTransform(work, plan.log2Size, plan.twiddles->forward);
    if (filter.afterTransform != nullptr) filter.afterTransform(work, filter.afterTransformArgument);
    for (int i = 0; i < 2 * size; i += 2) {
        const double real = work[i] * response[i] - work[i + 1] * response[i + 1];
        work[i + 1] = work[i] * response[i + 1] + work[i + 1] * response[i];
        work[i] = real;
    }
    firTransform(work, plan.log2Size, plan.twiddles->inverse);
    const double scale = 1.0 / size;  // a power of two: the same as the division
    for (int i = 0; i < length; ++i) out[i] = static_cast<float>(static_cast<double>(overlap[i]) + work[2 * i] * scale);
    for (int i = length; i < half; ++i) {
        overlap[i - length] = static_cast<float>(static_cast<double>(overlap[i]) + work[2 * i] * scale);
    }
    for (int i = half; i < half + length; ++i) overlap[i - length] = static_cast<float>(work[2 * i] * scale);
}

VXCOMN_RT void processPlain(const FftFirFilter &filter, const FirPlan &plan, const double *response, const float *in, float *out,
                            int count) noexcept {
    const int half = plan.fftSize / 2;
    for (int done = 0; done < count;) {
        const int length = count - done < half ? count - done : half;
        processPiece(filter, plan, response, in + done, out + done, length);
        done += length;
    }
}

VXCOMN_RT void clearValues(float *values, int count) noexcept {
    for (int i = 0; i < count; ++i) {
        values[i] = 0.0f;
        asm volatile("");  // keeps the loop from becoming a call to memset, which stands outside the block path
    }
}

}  // namespace
}  // namespace vxcomn

using namespace vxcomn;

VXCOMN_RT void FftFirFilter::process(const float *in, float *out, int count) {
    if (count < 1) return;
    std::atomic<uint32_t> &inside = enterFirBlock(firBlockCount(this, sizeof(FftFirFilter)));
    const int32_t *const gate = std::atomic_ref(plan).load(std::memory_order_seq_cst);
    if (gate != nullptr && std::atomic_ref(tapCount).load(std::memory_order_relaxed) != 0 &&
        std::atomic_ref(taps).load(std::memory_order_relaxed) != nullptr) {
        const FirPlan &memory = *reinterpret_cast<const FirPlan *>(gate);
        const double *const used = std::atomic_ref(response).load(std::memory_order_seq_cst);
        // A hook wants to see interleaved values, so it gets the plain form.
        if (memory.kernels != nullptr && beforeTransform == nullptr && afterTransform == nullptr) {
            memory.kernels->process({in, out, count, overlap, work, used + 2 * memory.fftSize, memory.tables, memory.log2Size});
        } else {
            processPlain(*this, memory, used, in, out, count);
        }
    }
    leaveFirBlock(inside);
}

VXCOMN_RT void FftFirFilter::clearOverlap() {
    std::atomic<uint32_t> &inside = enterFirBlock(firBlockCount(this, sizeof(FftFirFilter)));
    const int32_t *const gate = std::atomic_ref(plan).load(std::memory_order_seq_cst);
    if (gate != nullptr) clearValues(overlap, *gate / 2);
    leaveFirBlock(inside);
}
