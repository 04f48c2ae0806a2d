// SPDX-License-Identifier: MIT
//
// The eight buffers of a block as the library takes them, filled from interleaved frames and emptied into them by a format's slots.
#pragma once

#include <vxcomn/block.h>

#include <array>
#include <cstddef>

namespace vx {

class SlotBuffers {
  public:
    SlotBuffers() {
        for (size_t slot = 0; slot < pointers_.size(); ++slot) pointers_[slot] = samples_[slot].data();
        buffers_.channels = pointers_.data();
    }
    SlotBuffers(const SlotBuffers &) = delete;
    SlotBuffers &operator=(const SlotBuffers &) = delete;

    ProcessBuffers &record() { return buffers_; }
    float *slot(int number) { return pointers_[static_cast<size_t>(number)]; }
    const float *slot(int number) const { return pointers_[static_cast<size_t>(number)]; }

    void scatter(const float *interleaved, const IOFormat &format, size_t frames) {
        const auto channels = static_cast<size_t>(format.channels);
        for (auto &slot : samples_) slot.fill(0.0F);
        for (size_t channel = 0; channel < channels; ++channel)
            for (size_t frame = 0; frame < frames; ++frame)
                samples_[format.channelSlot[channel]][frame] = interleaved[frame * channels + channel];
    }

    void gather(float *interleaved, const IOFormat &format, size_t frames) const {
        const auto channels = static_cast<size_t>(format.channels);
        for (size_t channel = 0; channel < channels; ++channel)
            for (size_t frame = 0; frame < frames; ++frame)
                interleaved[frame * channels + channel] = samples_[format.channelSlot[channel]][frame];
    }

  private:
    alignas(64) std::array<std::array<float, VX_MAX_FRAMES>, VX_SLOT_COUNT> samples_ = {};
    std::array<float *, VX_SLOT_COUNT> pointers_ = {};
    ProcessBuffers buffers_ = {};
};

}  // namespace vx
