// SPDX-License-Identifier: MIT
//
// The polarity tone: a slow negative swell from -1e-5 to about -1, a flip to +1.0 in one sample, and a slow decay. Its first
// extreme is negative, and the sign of the first extreme that the capture side finds tells whether a chain inverts. `create` and
// `arm` are control calls that hold the block functions up; `generate` runs on the render thread.
#include "measure/exact_power.h"
#include "measure/realtime.h"
#include "measure/saturate.h"
#include "vxcomn/measurement_records.h"

using namespace vxcomn;

namespace {

void rewind(PolarityToneGenerator &tone) {
    tone.PeakIndex = -1;
    tone.Value = -1e-5F;
    tone.Position = 0;
}

}  // namespace

void PolarityToneGenerator::create(int rate) {
    rewind(*this);
    HalfLength = truncateToInt32(rate * 0.1);
    DecayFactor = powerOfOneHundredThousandth(1000.0 / (rate * 100.0));
    GrowthFactor = 2.0F - DecayFactor;
}

void PolarityToneGenerator::arm(int rate, float milliseconds) {
    rewind(*this);
    HalfLength = truncateToInt32(static_cast<double>(milliseconds) / 1000.0 * rate);
    // The product is an f32 before it divides.
    const auto product = static_cast<float>(rate) * milliseconds;
    DecayFactor = milliseconds > 0.0F ? powerOfOneHundredThousandth(1000.0 / static_cast<double>(product)) : 1.0F;
    GrowthFactor = 2.0F - DecayFactor;
}

VXCOMN_RT int PolarityToneGenerator::generate(float *buffer, int offset, int count) {
    const int64_t half = HalfLength;
    for (int i = 0; i < count; ++i) {
        if (Position >= 2 * half) {
            Value = 0.0F;
            buffer[offset + i] = 0.0F;
            return 0;
        }
        if (Position < half) Value *= GrowthFactor;
        if (Position == half) {
            Value = 1.0F;
            PeakIndex = i;
        }
        if (Position > half) Value *= DecayFactor;
        buffer[offset + i] = Value;
        ++Position;
    }
    return 1;
}
