// SPDX-License-Identifier: MIT
//
// FftFirFilter: the control calls. The block side is in fir_filter_block.cpp.
//
// The record's fields are shared with a block that may run at any moment. `plan` is the gate: a control call that replaces memory
// first takes the gate away, waits for the blocks inside, changes the other fields and puts the new gate up last. A reload of equal
// length needs no gate: it makes the new response beside the old one and exchanges the pointer, and a block takes the pointer once.
#include <atomic>
#include <bit>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

#include "measure/elliptic_math.h"
#include "measure/fir_block_guard.h"
#include "measure/fir_plan.h"
#include "vxcomn/measurement_records.h"

namespace vxcomn {
namespace {

constexpr int kDefaultTaps = 32;
constexpr int kDefaultRate = 44100;

// Control calls on filters exclude each other; blocks never meet this lock.
std::mutex &controlLock() {
    static std::mutex lock;
    return lock;
}

template <typename T>
void publish(T &field, T value, std::memory_order order = std::memory_order_relaxed) noexcept {
    std::atomic_ref<T>(field).store(value, order);
}

FirPlan *planOf(FftFirFilter &filter) noexcept {
    return reinterpret_cast<FirPlan *>(filter.plan);
}

// The described length: the next power of two that holds the taps, twice.
int log2SizeFor(int tapCount) noexcept {
    return std::bit_width(static_cast<unsigned>(tapCount) - 1u) + 1;
}

std::unique_ptr<FirPlan> makePlan(int tapCount) {
    auto plan = std::make_unique<FirPlan>();
    plan->log2Size = log2SizeFor(tapCount);
    plan->fftSize = 1 << plan->log2Size;
    plan->twiddles = &firTwiddles(plan->log2Size);
    plan->kernels = firKernels(plan->log2Size);
    const size_t size = static_cast<size_t>(plan->fftSize);
    size_t workValues = 2 * size;
    size_t responseValues = 2 * size;
    if (plan->kernels != nullptr) {
        plan->tables = &firKernelTables(*plan->kernels, plan->log2Size);
        workValues = static_cast<size_t>(firScratchValues(*plan->kernels, plan->log2Size));
        responseValues = 4 * size;
    }
    plan->taps = makeAlignedArray<float>(static_cast<size_t>(tapCount));
    plan->overlap = makeAlignedArray<float>(size / 2);
    plan->work = makeAlignedArray<double>(workValues);
    for (auto &response : plan->responses) response = makeAlignedArray<double>(responseValues);
    return plan;
}

void fillResponse(const FirPlan &plan, double *response, const float *taps, int tapCount) noexcept {
    for (int i = 0; i < tapCount; ++i) {
        response[2 * i] = static_cast<double>(taps[i]);
        response[2 * i + 1] = 0.0;
    }
    for (int i = 2 * tapCount; i < 2 * plan.fftSize; ++i) response[i] = 0.0;
    firTransform(response, plan.log2Size, plan.twiddles->forward);
    if (plan.kernels != nullptr) firArrangeResponse(*plan.kernels, plan.log2Size, response, response + 2 * plan.fftSize);
}

// Takes the filter's memory away and gives the record new memory, or none.
void replacePlan(FftFirFilter &filter, std::unique_ptr<FirPlan> plan, int tapCount) noexcept {
    const std::unique_ptr<FirPlan> old(planOf(filter));
    publish<int32_t *>(filter.plan, nullptr, std::memory_order_seq_cst);
    waitForFirBlocks(firBlockCount(&filter, sizeof(FftFirFilter)));
    publish(filter.tapCount, tapCount);
    publish(filter.taps, plan ? plan->taps.get() : nullptr);
    publish(filter.response, plan ? plan->responses[plan->current].get() : nullptr);
    publish(filter.work, plan ? plan->work.get() : nullptr);
    publish(filter.overlap, plan ? plan->overlap.get() : nullptr);
    filter.log2Size = plan ? plan->log2Size : 0;
    filter.fftSize = plan ? plan->fftSize : 0;
    publish(filter.plan, plan ? &plan.release()->fftSize : nullptr, std::memory_order_seq_cst);
}

void loadLocked(FftFirFilter &filter, const float *newTaps, int count, int rate) {
    if (count != filter.tapCount || (count != 0 && filter.plan == nullptr)) {
        std::unique_ptr<FirPlan> plan;
        if (count != 0) {
            plan = makePlan(count);
            for (int i = 0; i < count; ++i) plan->taps[i] = newTaps[i];
            fillResponse(*plan, plan->responses[0].get(), newTaps, count);
        }
        replacePlan(filter, std::move(plan), count);
    } else if (count != 0) {
        FirPlan &plan = *planOf(filter);
        for (int i = 0; i < count; ++i) plan.taps[i] = newTaps[i];
        plan.current = 1 - plan.current;
        double *const response = plan.responses[plan.current].get();
        fillResponse(plan, response, newTaps, count);
        publish(filter.response, response, std::memory_order_seq_cst);
        waitForFirBlocks(firBlockCount(&filter, sizeof(FftFirFilter)));
    }
    filter.sampleRate = rate;
}

// One tap at the new rate: a windowed sinc over 510 places of the old taps.
float resampledTap(const float *taps, int tapCount, double x) noexcept {
    double sum = 0.0;
    for (int k = -255; k <= 254; ++k) {
        // Kept: the place is cut towards zero, so places between -1 and 0 count as place 0 once more.
        const int m = static_cast<int>(k + x);
        if (m < 0 || m >= tapCount) continue;
        const double d = m - x;
        const double window = 0.5 - 0.5 * cosine((d / 511.0 + 0.5) * (2.0 * kPi));
        const double sinc = d == 0.0 ? 1.0 : sine(kPi * d) / (kPi * d);
        sum += static_cast<double>(taps[m]) * window * sinc;
    }
    return static_cast<float>(sum);
}

}  // namespace
}  // namespace vxcomn

using namespace vxcomn;

void FftFirFilter::create() {
    *this = FftFirFilter{};
    const float impulse[kDefaultTaps] = {1.0f};
    load(impulse, kDefaultTaps, kDefaultRate);
}

void FftFirFilter::dispose() {
    const std::lock_guard guard(controlLock());
    replacePlan(*this, nullptr, 0);
}

void FftFirFilter::load(const float *newTaps, int count, int rate) {
    if (count < 0 || count > VX_MAX_FIR_TAPS || (newTaps == nullptr && count != 0)) return;
    const std::lock_guard guard(controlLock());
    loadLocked(*this, newTaps, count, rate);
}

void FftFirFilter::resample(int newRate) {
    const std::lock_guard guard(controlLock());
    if (sampleRate == 0) return;
    const int64_t ratio = int64_t{newRate} / sampleRate;
    // Kept: a whole ratio. 44100 to 48000 changes nothing, and neither does a step down.
    if (ratio == 1 || ratio <= 0) return;
    const int64_t count = tapCount * ratio;
    if (count > VX_MAX_FIR_TAPS) return;
    std::vector<float> resampled(static_cast<size_t>(count));
    for (int64_t i = 0; i < count; ++i) {
        resampled[static_cast<size_t>(i)] = resampledTap(taps, tapCount, static_cast<double>(i) / static_cast<double>(ratio));
    }
    loadLocked(*this, resampled.data(), static_cast<int>(count), newRate);
}
