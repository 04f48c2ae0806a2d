// SPDX-License-Identifier: MIT
//
// A sine of full amplitude, one record a channel. `generate` runs on the render thread; `setFrequency` may come from a control call
// at any time and meets it in single words: a block that began before finishes with the old step.
#include "measure/kernels.h"
#include "measure/realtime.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

constexpr double kTwoPi = 6.283185307179586;
constexpr double kWrap = 628.3185307179587;  // 100 whole turns

VXCOMN_RT_INLINE float load(const float &word) {
    float value;
    __atomic_load(&word, &value, __ATOMIC_RELAXED);
    return value;
}

void store(float &word, double value) {
    auto rounded = static_cast<float>(value);
    __atomic_store(&word, &rounded, __ATOMIC_RELAXED);
}

void storeLimits(SineGenerator &sine) {
    store(sine.MinStep, 125.66370614359172 / sine.SampleRate);     // 2 pi * 20 Hz
    store(sine.MaxStep, 125663.70614359173 / sine.SampleRate);     // 2 pi * 20000 Hz
    store(sine.NyquistStep, 3.141592653589793 / sine.SampleRate);  // Kept: nobody reads it
}

// The exact floating remainder of a phase at or above kWrap: each subtraction takes away at least half, so none of them rounds.
VXCOMN_RT_INLINE double wrapped(double phase) {
    if (!(phase < __builtin_inf())) return __builtin_nan("");
    double part = kWrap;
    while (part + part <= phase) part += part;
    for (; part >= kWrap; part *= 0.5) {
        if (phase >= part) phase -= part;
    }
    return phase;
}

}  // namespace

void SineGenerator::create(int rate) {
    Frequency = 1000;
    Phase = 0.0;
    CurrentStep = 0.0F;
    setSampleRate(rate);
}

void SineGenerator::setSampleRate(int rate) {
    SampleRate = rate;
    storeLimits(*this);
    store(PhaseStep, Frequency * kTwoPi / SampleRate);
}

void SineGenerator::setFrequency(int hz, int rate) {
    if (rate != SampleRate) {
        SampleRate = rate;
        storeLimits(*this);
    }
    Frequency = hz;
    store(PhaseStep, Frequency * kTwoPi / SampleRate);
}

VXCOMN_RT void SineGenerator::generate(float *buffer, int offset, int count) {
    // Kept: the clamp comes to nothing in a block with samples, since the first of them takes the step as it was set. Frequencies
    // outside 20 to 20000 Hz are generated.
    const float highest = load(MaxStep), lowest = load(MinStep);
    if (CurrentStep > highest) {
        CurrentStep = highest;
    } else if (CurrentStep < lowest) {
        CurrentStep = lowest;
    }
    if (count > 0) {
        const float step = load(PhaseStep);
        CurrentStep = step;
        Phase = measureKernels->sine(Phase, step, buffer + offset, count);
    }
    if (Phase >= kWrap) Phase = wrapped(Phase);
}
