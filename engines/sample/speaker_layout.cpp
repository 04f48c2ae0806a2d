// SPDX-License-Identifier: MIT
//
// Slots come from the speaker mask, which both sides of the interface agree on, and not from the slot tables.
#include "speaker_layout.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <iterator>

namespace sample_engine {
namespace {

constexpr uint32_t kSlotSpeaker[VX_SLOT_COUNT] = {VX_SPEAKER_FRONT_LEFT,    VX_SPEAKER_FRONT_RIGHT, VX_SPEAKER_FRONT_CENTER,
                                                  VX_SPEAKER_LOW_FREQUENCY, VX_SPEAKER_BACK_LEFT,   VX_SPEAKER_BACK_RIGHT,
                                                  VX_SPEAKER_SIDE_LEFT,     VX_SPEAKER_SIDE_RIGHT};
constexpr uint32_t kAllSpeakers = 0x63F;
constexpr int kLowestRate = 8000;
constexpr int kHighestRate = 192000;

}  // namespace

bool isSupported(const IOFormat &format) {
    return format.channels >= 1 && format.channels <= VX_SLOT_COUNT && (format.channelMask & ~kAllSpeakers) == 0 &&
           std::popcount(format.channelMask) == format.channels && format.sampleRate >= kLowestRate &&
           format.sampleRate <= kHighestRate;
}

void offerStereo(IOFormat &format) {
    format.channels = 2;
    format.channelMask = VX_SPEAKER_FRONT_LEFT | VX_SPEAKER_FRONT_RIGHT;
    format.sampleRate = std::clamp(format.sampleRate, kLowestRate, kHighestRate);
    std::fill(std::begin(format.channelSlot), std::end(format.channelSlot), uint8_t{0});
    std::fill(std::begin(format.slotSpeaker), std::end(format.slotSpeaker), uint8_t{0});
    format.channelSlot[1] = VX_SLOT_FRONT_RIGHT;
    format.slotSpeaker[VX_SLOT_FRONT_LEFT] = 1;
    format.slotSpeaker[VX_SLOT_FRONT_RIGHT] = 2;
}

SpeakerPlan planSpeakers(const IOFormat &input, const IOFormat &output, bool fixedPoint) {
    SpeakerPlan plan;
    if (!isSupported(output)) return plan;
    // An input that is none of ours says nothing about the buffers, which are then taken as the output's.
    const uint32_t inputMask = isSupported(input) ? input.channelMask : output.channelMask;
    const int reachable = fixedPoint ? output.channels : VX_SLOT_COUNT;
    int monoSlot = -1;
    for (int slot = 0; slot < reachable; ++slot)
        if (inputMask == kSlotSpeaker[slot] && slot != VX_SLOT_LOW_FREQUENCY) monoSlot = slot;
    for (int slot = 0; slot < reachable; ++slot) {
        if ((output.channelMask & kSlotSpeaker[slot]) == 0) continue;
        plan.processed[slot] = true;
        if ((inputMask & kSlotSpeaker[slot]) != 0) continue;
        if (monoSlot >= 0 && slot <= VX_SLOT_FRONT_RIGHT)
            plan.copyFrom[slot] = monoSlot;
        else
            plan.silenced[slot] = true;
    }
    for (int slot = 0; slot < VX_SLOT_COUNT; slot += 2)
        if (plan.processed[slot] || plan.processed[slot + 1]) plan.pairSlot[plan.pairs++] = slot;
    return plan;
}

}  // namespace sample_engine
