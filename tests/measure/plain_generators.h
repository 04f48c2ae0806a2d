// SPDX-License-Identifier: MIT
//
// The generators as their formulas read, one sample after the other: the judges of the block versions. The sine comes in as a
// function, since it has judges of its own.
#pragma once

#include <cmath>
#include <cstdint>

#include "vxcomn/measurement_records.h"

namespace plain {

struct White {
    uint32_t seed = 1;
    float next() {
        seed = static_cast<uint32_t>(uint64_t{seed} * 16807u % 2147483647u);
        return 1.0F - static_cast<float>(static_cast<int32_t>(seed << 1) >> 8) * 1.1920929e-7F;
    }
};

struct Pink {
    uint32_t x = 1;
    float b[7] = {};
    float next() {
        x = x * 214013u + 2531011u;
        const int r = static_cast<int>(x >> 16 & 0x7FFFu);
        const float w = static_cast<float>(r * 32000.0 / 32767.0 - 16000.0);
        b[0] = static_cast<float>(0.99886 * b[0] + w * 0.0555179);
        b[1] = static_cast<float>(0.99332 * b[1] + w * 0.0750759);
        b[2] = static_cast<float>(0.969 * b[2] + w * 0.153852);
        b[3] = static_cast<float>(0.8665 * b[3] + w * 0.3104856);
        b[4] = static_cast<float>(0.55 * b[4] + w * 0.5329522);
        b[5] = static_cast<float>(-0.7616 * b[5] - w * 0.016898);
        float t = b[1] + b[0];
        t += b[2];
        t += b[3];
        t += b[4];
        t += b[5];
        t += b[6];
        const float u = static_cast<float>(t + w * 0.5362);
        b[6] = static_cast<float>(w * 0.115926);
        return static_cast<float>(u * 0.2 * 3.0517578125e-5);
    }
};

// One sample of a sweep; moves the record on.
template <class Sine>
float sweepSample(SweepGenerator &s, Sine sine) {
    const float out = s.Position < s.PreDelaySamples ? 0.0F : sine(s.Phase);
    if (s.Position >= s.PreDelaySamples) {
        const double p = s.TablePosition;
        const int i = static_cast<int>(p);
        const double f = static_cast<double>(s.Table[i + 1] - s.Table[i]) * (p - i) + s.Table[i];
        s.CurrentFrequency = f;
        double next = p + s.TableStep;
        if (next > s.TableSize - 2) next = s.TableSize - 2;
        if (next < 0.0) next = 0.0;
        s.TablePosition = next;
        s.Phase += f * s.RadiansPerHz;
    }
    s.Position += 1;
    return out;
}

}  // namespace plain
