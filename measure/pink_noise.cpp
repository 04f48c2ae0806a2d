// SPDX-License-Identifier: MIT
//
// Pink noise: white noise through a bank of six one-pole filters and a delayed share, whose sum falls by 3 dB an octave. One record
// serves all channels of an instance, so they carry consecutive stretches of one stream. Render thread.
#include "measure/kernels.h"
#include "measure/realtime.h"
#include "measure/thread_random.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

// Whether the kernels may take the states as they are; whatever this generator has written itself is so.
VXCOMN_RT_INLINE bool ordinary(const float *b) {
    bool result = true;
    for (int i = 0; i < 7; ++i) {
        const float magnitude = __builtin_fabsf(b[i]);
        result = result && (magnitude == 0.0F || (magnitude > 0x1p-100F && magnitude < 0x1p100F));
    }
    return result;
}

// The formulas as they read, for states that somebody else has written.
VXCOMN_RT void generatePlain(float *b, uint32_t &word, float *samples, int count) {
    uint32_t x = word;
    float b0 = b[0], b1 = b[1], b2 = b[2], b3 = b[3], b4 = b[4], b5 = b[5], b6 = b[6];
    for (int i = 0; i < count; ++i) {
        x = x * 214013u + 2531011u;
        const auto r = static_cast<int>((x >> 16) & 0x7FFFu);
        const auto w = static_cast<float>(r * 32000.0 / 32767.0 - 16000.0);
        b0 = static_cast<float>(0.99886 * b0 + w * 0.0555179);
        b1 = static_cast<float>(0.99332 * b1 + w * 0.0750759);
        b2 = static_cast<float>(0.969 * b2 + w * 0.153852);
        b3 = static_cast<float>(0.8665 * b3 + w * 0.3104856);
        b4 = static_cast<float>(0.55 * b4 + w * 0.5329522);
        b5 = static_cast<float>(-0.7616 * b5 - w * 0.016898);
        const float t = b1 + b0 + b2 + b3 + b4 + b5 + b6;
        const auto u = static_cast<float>(t + w * 0.5362);
        b6 = static_cast<float>(w * 0.115926);
        samples[i] = static_cast<float>(u * 0.2 * 3.0517578125e-5);
    }
    word = x;
    b[0] = b0;
    b[1] = b1;
    b[2] = b2;
    b[3] = b3;
    b[4] = b4;
    b[5] = b5;
    b[6] = b6;
}

}  // namespace

void PinkNoiseGenerator::create() {
    for (float &state : b) state = 0.0F;
}

VXCOMN_RT void PinkNoiseGenerator::generate(float *buffer, int, int count) {
    if (count < 1) return;
    uint32_t &word = *threadRandom();
    if (ordinary(b)) {
        measureKernels->pink(b, word, buffer, count);
    } else {
        generatePlain(b, word, buffer, count);
    }
}
