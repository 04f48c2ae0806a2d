// SPDX-License-Identifier: MIT
//
// The inner loops of this room that come in one version for each instruction set: kernels_sse2.cpp, kernels_avx2.cpp and
// kernels_avx512.cpp hold the same functions, and one of the three tables is chosen while the library loads. All give the same
// bits.
//
// A kernel file includes intrinsics and headers whose functions are all inlined or local to the file: a function that the linker
// may share between files would carry the wider instruction set into code that runs everywhere.
#pragma once

#include <cstdint>

#include "measure/instruction_set.h"

namespace vxcomn {

// Where a sweep stands, behind its lead-in.
struct SweepRun {
    const float *table;
    double position;  // fractional table index
    double step;      // table indexes a sample
    double highest;   // last position
    double phase;     // radians
    double radiansPerHz;
    double hz;  // frequency of the last sample
};

// What the tracking notch works with, at most kNotchPiece samples at a time. The coefficients of a sample belong to the frequency
// in front of it, so there is one more than samples: the last ones are for the sample behind the piece.
inline constexpr int kNotchPiece = 32;
struct NotchPiece {
    alignas(64) float gain[kNotchPiece + 16];      // b0 and b2
    alignas(64) float feedback[kNotchPiece + 16];  // b1 and a1
    alignas(64) float a2[kNotchPiece + 16];
    alignas(64) double turn[kNotchPiece];  // radians that the sweep's phase moves on
};

// The twiddles of one stage of the analyser's transform, real and imaginary parts apart.
struct StageTwiddles {
    const float *real;
    const float *imaginary;
};

// The smallest transform that has a kernel: each pass takes whole vectors.
inline constexpr int kSmallestFastTransform = 1024;

// One spectrum: size / 2 samples, which the ring's end may cut in two.
struct SpectrumJob {
    int size;                     // a power of two, at least kSmallestFastTransform
    const float *older, *newer;   // samples
    int olderCount;               // of the size / 2
    const float *window;          // size / 2 values
    const StageTwiddles *stages;  // by the power of two of the distance between a butterfly's points
    float *work;                  // 5 / 2 size floats; power of the bins 0 to size / 2 at its head afterwards
};

struct MeasureKernels {
    // Raises each channel's peak to the largest magnitude of its samples; NaN never raises.
    void (*peaks)(float *const *channels, float *peaks, int channelCount, int frameCount);
    // Whether a magnitude lies above the threshold. NaN never does.
    bool (*anyAbove)(const float *samples, int count, float threshold);
    // mean[i] = (channels[0][from + i] + channels[1][from + i] + ...) / channelCount. At least two channels.
    void (*mean)(float *const *channels, int channelCount, int from, int count, float *mean);
    // to[i] = from[i]; the two don't overlap.
    void (*copy)(const float *from, int count, float *to);
    // Sines of a phase that grows by `step` a sample, each rounded to f32 once. Returns the phase behind the block.
    double (*sine)(double phase, double step, float *samples, int count);
    // At least one sample of a sweep.
    void (*sweep)(SweepRun &run, float *samples, int count);
    // Pink noise from the filter states b[0] to b[6] on, whose magnitudes are 0 or from 2^-100 to 2^100, and the generator's word.
    void (*pink)(float *b, uint32_t &word, float *samples, int count);
    // Moves a sweep on by `count` samples and fills the notch's coefficients from place 1 on, and the turns. rate: Hz. The phase is
    // left to the caller, who adds the turns up.
    void (*notch)(SweepRun &run, double rate, int count, NotchPiece &piece);
    // Clamp, window, transform and power. [control]
    void (*spectrum)(const SpectrumJob &job);
};

// The table in use. Written while the library loads and by tests, when no block runs; read by everybody.
extern const MeasureKernels *measureKernels;

extern const MeasureKernels kMeasureKernelsSse2, kMeasureKernelsAvx2, kMeasureKernelsAvx512;

// Takes another instruction set's table. For tests: the machine must have that set.
void selectMeasureKernels(InstructionSet set) noexcept;

}  // namespace vxcomn
