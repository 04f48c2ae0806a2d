// SPDX-License-Identifier: MIT
#include "signal.h"

#include <limits>

namespace golden {
namespace {

// Between -1 and 1, from the upper 24 bits of a word: exact in f32.
float unitSample(uint32_t word) {
    return static_cast<float>(static_cast<int32_t>(word) >> 8) * 0x1p-23F;
}

// A triangle wave of `period` samples.
float triangle(uint32_t position, uint32_t period) {
    const uint32_t phase = static_cast<uint32_t>((static_cast<uint64_t>(position % period) << 32) / period);
    const uint32_t folded = (phase & 0x80000000U) != 0 ? ~phase : phase;
    return unitSample((folded << 1) ^ 0x80000000U);
}

}  // namespace

SignalSource::SignalSource(Signal signal, int slot)
    : signal_(signal), slot_(slot), state_(0x9E3779B9U * static_cast<uint32_t>(slot + 1)) {}

uint32_t SignalSource::random() {
    state_ ^= state_ << 13;
    state_ ^= state_ >> 17;
    state_ ^= state_ << 5;
    return state_;
}

float SignalSource::whiteSample() {
    return unitSample(random());
}

float SignalSource::programmeSample() {
    static constexpr uint32_t kPeriods[8] = {109, 97, 48, 601, 211, 173, 31, 17};
    const float tone = triangle(position_, kPeriods[slot_]) * 0.25F;
    const float bass = triangle(position_, 733 + 10 * static_cast<uint32_t>(slot_)) * 0.125F;
    const float hiss = whiteSample() * 0.03125F;
    return tone + bass + hiss;
}

float SignalSource::next() {
    const float programme = signal_ == Signal::noise ? 0.0F : programmeSample();
    const uint32_t at = position_++ + static_cast<uint32_t>(slot_);
    switch (signal_) {
        case Signal::programme:
            return programme;
        case Signal::noise:
            return whiteSample();
        case Signal::silence:
            return 0.0F;
        case Signal::threshold:
            return 1e-6F;
        case Signal::quiet:
            return whiteSample() * 0x1p-24F;
        case Signal::impulses:
            return at % 1000 == 0 ? 1.0F : 0.0F;
        case Signal::fullScale:
            return at / 50 % 2 == 0 ? 1.0F : -1.0F;
        case Signal::overload:
            return programme * 16.0F;
        case Signal::direct:
            return 0.25F;
        case Signal::denormals:
            return whiteSample() * 0x1p-127F;
        case Signal::notANumber:
            return at % 700 == 350 ? std::numeric_limits<float>::quiet_NaN() : programme;
        case Signal::infinities:
            if (at % 900 == 450) return std::numeric_limits<float>::infinity();
            return at % 1100 == 550 ? -std::numeric_limits<float>::infinity() : programme;
    }
    return 0.0F;
}

}  // namespace golden
