// SPDX-License-Identifier: MIT
//
// The loops behind HostKernels, written once over a vector type `V` that each instruction set's file brings: V::lanes, V::F
// (floats), V::I (32-bit integers) and a handful of operations, `One` being the same for a single sample. Everything is forced
// inline into that file's functions, so that no code compiled for one instruction set can end up serving another.
#pragma once

#include "host/kernels.h"
#include "measure/realtime.h"

namespace vxcomn::kernel_loops {

// Terms of a destination unrolled at compile time, so that its samples stay in registers from the first addition to the last.
template <class V, int kTerms>
VXCOMN_RT_INLINE void foldVector(float *to, const float *const *from, const float *coefficient, int t) noexcept {
    auto sum = V::load(to + t);
    for (int i = 0; i < kTerms; ++i) sum = V::add(sum, V::multiply(V::load(from[i] + t), V::broadcast(coefficient[i])));
    V::store(to + t, sum);
}

template <class V, class One, int kTerms>
VXCOMN_RT_INLINE void foldTerms(float *to, float *const *channels, const FoldDestination &destination, int frames) noexcept {
    const float *from[kTerms];
    float coefficient[kTerms];
    for (int i = 0; i < kTerms; ++i) {
        from[i] = channels[destination.term[i].source];
        coefficient[i] = destination.term[i].coefficient;
    }
    int t = 0;
    for (; t + V::lanes <= frames; t += V::lanes) foldVector<V, kTerms>(to, from, coefficient, t);
    for (; t < frames; ++t) foldVector<One, kTerms>(to, from, coefficient, t);
}

template <class V, class One>
VXCOMN_RT_INLINE void fold(float *const *channels, const FoldPlan &plan, int frames) noexcept {
    for (int d = 0; d < plan.destinations; ++d) {
        const FoldDestination &destination = plan.destination[d];
        float *to = channels[destination.slot];
        switch (destination.terms) {
            case 1:
                foldTerms<V, One, 1>(to, channels, destination, frames);
                break;
            case 2:
                foldTerms<V, One, 2>(to, channels, destination, frames);
                break;
            case 3:
                foldTerms<V, One, 3>(to, channels, destination, frames);
                break;
            case 4:
                foldTerms<V, One, 4>(to, channels, destination, frames);
                break;
            case 5:
                foldTerms<V, One, 5>(to, channels, destination, frames);
                break;
            case 6:
                foldTerms<V, One, 6>(to, channels, destination, frames);
                break;
            default:
                foldTerms<V, One, 7>(to, channels, destination, frames);
                break;
        }
    }
}

template <class V, int kShift>
VXCOMN_RT_INLINE void toWord(const float *samples, int32_t *words) noexcept {
    const auto scaled = V::multiply(V::load(samples), V::broadcast(8388608.0F));
    V::storeWords(words, V::template shiftLeft<kShift>(V::to24Bits(scaled)));
}

template <class V, class One, int kShift>
VXCOMN_RT_INLINE void toWords(const float *samples, int32_t *words, int count) noexcept {
    int t = 0;
#pragma GCC unroll 4
    for (; t + V::lanes <= count; t += V::lanes) toWord<V, kShift>(samples + t, words + t);
    for (; t < count; ++t) toWord<One, kShift>(samples + t, words + t);
}

template <class V>
VXCOMN_RT_INLINE void fromWord(const int32_t *words, float *samples) noexcept {
    const auto sample = V::toFloat(V::template shiftRight<8>(V::loadWords(words)));
    V::store(samples, V::multiply(sample, V::broadcast(1.1920929e-7F)));  // 2 to the power -23
}

template <class V, class One>
VXCOMN_RT_INLINE void fromWords(const int32_t *words, float *samples, int count) noexcept {
    int t = 0;
#pragma GCC unroll 4
    for (; t + V::lanes <= count; t += V::lanes) fromWord<V>(words + t, samples + t);
    for (; t < count; ++t) fromWord<One>(words + t, samples + t);
}

template <class V, class One>
VXCOMN_RT_INLINE void zero(float *samples, int count) noexcept {
    int t = 0;
    for (; t + V::lanes <= count; t += V::lanes) V::store(samples + t, V::broadcast(0.0F));
    for (; t < count; ++t) One::store(samples + t, One::broadcast(0.0F));
}

}  // namespace vxcomn::kernel_loops

// Defines the table `name` out of the loops above. V and One are the including file's.
#define VXCOMN_DEFINE_HOST_KERNELS(name, V, One)                                                      \
    namespace vxcomn {                                                                                \
    namespace {                                                                                       \
    VXCOMN_RT void fold(float *const *channels, const FoldPlan &plan, int frames) {                   \
        kernel_loops::fold<V, One>(channels, plan, frames);                                           \
    }                                                                                                 \
    VXCOMN_RT void toProcessWords(const float *samples, int32_t *words, int count) {                  \
        kernel_loops::toWords<V, One, 8>(samples, words, count);                                      \
    }                                                                                                 \
    VXCOMN_RT void toRecordWords(const float *samples, int32_t *words, int count) {                   \
        kernel_loops::toWords<V, One, 6>(samples, words, count);                                      \
    }                                                                                                 \
    VXCOMN_RT void fromProcessWords(const int32_t *words, float *samples, int count) {                \
        kernel_loops::fromWords<V, One>(words, samples, count);                                       \
    }                                                                                                 \
    VXCOMN_RT void zero(float *samples, int count) {                                                  \
        kernel_loops::zero<V, One>(samples, count);                                                   \
    }                                                                                                 \
    }                                                                                                 \
    constinit const HostKernels name = {fold, toProcessWords, toRecordWords, fromProcessWords, zero}; \
    }
