// SPDX-License-Identifier: MIT
//
// What a run counts over samples: a peak and the clipped samples of each channel, and a digest of all samples.
#pragma once

#include <bit>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace vx {

struct ChannelLevel {
    float peak = 0.0F;        // largest magnitude, full scale 1.0
    uint64_t clipped = 0;     // samples of a magnitude above 1.0
    uint64_t notANumber = 0;  // samples that are NaN; they count nowhere else
};

class LevelMeter {
  public:
    explicit LevelMeter(int channels) : levels_(static_cast<size_t>(channels)), block_(static_cast<size_t>(channels)) {}

    void feed(const float *interleaved, size_t frames) {
        const size_t channels = levels_.size();
        for (size_t channel = 0; channel < channels; ++channel) {
            float peak = 0.0F;
            ChannelLevel &level = levels_[channel];
            for (size_t frame = 0; frame < frames; ++frame) {
                const float magnitude = std::fabs(interleaved[frame * channels + channel]);
                if (magnitude > peak) peak = magnitude;
                if (magnitude > 1.0F) ++level.clipped;
                if (magnitude != magnitude) ++level.notANumber;
            }
            block_[channel] = peak;
            if (peak > level.peak) level.peak = peak;
        }
    }

    const std::vector<ChannelLevel> &levels() const { return levels_; }
    // Peaks of the last feed.
    const std::vector<float> &blockPeaks() const { return block_; }

  private:
    std::vector<ChannelLevel> levels_;
    std::vector<float> block_;
};

// 64-bit FNV-1a over the little-endian bytes of every sample.
class SampleDigest {
  public:
    void feed(const float *samples, size_t count) {
        for (size_t i = 0; i < count; ++i) {
            const uint32_t word = std::bit_cast<uint32_t>(samples[i]);
            for (int byte = 0; byte < 4; ++byte) value_ = (value_ ^ (word >> 8 * byte & 0xFFU)) * kPrime;
        }
    }

    uint64_t value() const { return value_; }

  private:
    static constexpr uint64_t kPrime = 0x100000001B3;

    uint64_t value_ = 0xCBF29CE484222325;
};

}  // namespace vx
