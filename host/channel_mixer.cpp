// SPDX-License-Identifier: MIT
#include "host/channel_mixer.h"

#include "host/fold_plan.h"
#include "host/kernels.h"

namespace vxcomn {

namespace {

// For mask bits 0 to 17; any other bit maps to slot 0.
constexpr uint8_t kSlotOfMaskBit[32] = {0, 1, 2, 3, 4, 5, 0, 1, 2, 6, 7, 2, 0, 2, 1, 4, 2, 5};

// Whether a destination shares samples with any other buffer. The kernel walks frames with all destinations side by side, which is
// the same as fold after fold only while it writes nothing that it still has to read.
VXCOMN_RT_INLINE bool destinationsOverlap(float *const *channels, const FoldPlan &plan, int frames) noexcept {
    const uintptr_t bytes = static_cast<uintptr_t>(frames) * sizeof(float);
    bool overlap = false;
    for (int d = 0; d < plan.destinations; ++d) {
        const int slot = plan.destination[d].slot;
        const auto begin = reinterpret_cast<uintptr_t>(channels[slot]);
        for (int other = 0; other < VX_SLOT_COUNT; ++other) {
            const uintptr_t distance = reinterpret_cast<uintptr_t>(channels[other]) - begin;
            overlap |= other != slot && distance + bytes - 1 < 2 * bytes - 1;
        }
    }
    return overlap;
}

// Fold after fold in the order of the rules, each over all frames.
VXCOMN_RT void foldOneByOne(float *const *channels, const FoldPlan &plan, int frames) noexcept {
    // A destination's own terms are in rule order; across destinations the order is that of the source's group.
    constexpr uint8_t kGroupOrder[VX_SLOT_COUNT] = {VX_SLOT_FRONT_LEFT,   VX_SLOT_FRONT_RIGHT,  VX_SLOT_SIDE_LEFT,
                                                    VX_SLOT_SIDE_RIGHT,   VX_SLOT_BACK_LEFT,    VX_SLOT_BACK_RIGHT,
                                                    VX_SLOT_FRONT_CENTER, VX_SLOT_LOW_FREQUENCY};
    for (const uint8_t source : kGroupOrder) {
        for (int d = 0; d < plan.destinations; ++d) {
            const FoldDestination &destination = plan.destination[d];
            for (int i = 0; i < destination.terms; ++i) {
                if (destination.term[i].source != source) continue;
                volatile float product = 0;  // no vectorisation, no assumption about what overlaps
                for (int t = 0; t < frames; ++t) {
                    product = channels[source][t] * destination.term[i].coefficient;
                    channels[destination.slot][t] += product;
                }
            }
        }
    }
}

}  // namespace

void mixChannels(ProcessBuffers *buffers, IOFormat *source, IOFormat *target) noexcept {
    static_cast<void>(source);
    const int frames = target->frames;
    if (frames <= 0) return;
    const uint32_t mask = target->channelMask;
    const FoldPlan &plan = mask == 0 ? kNoMaskFoldPlan : kFoldPlans[foldPlanIndex(mask)];
    if (plan.destinations == 0) return;
    if (destinationsOverlap(buffers->channels, plan, frames)) {
        foldOneByOne(buffers->channels, plan, frames);
    } else {
        hostKernels().fold(buffers->channels, plan, frames);
    }
}

void setChannelMask(IOFormat *format, uint32_t mask) noexcept {
    format->channelMask = mask;
    for (uint8_t &speaker : format->slotSpeaker) speaker = 0;
    uint32_t rest = mask;
    for (uint8_t &slot : format->channelSlot) {
        if (rest == 0) {
            slot = 0;
            continue;
        }
        const int bit = __builtin_ctz(rest);
        rest &= rest - 1;
        slot = kSlotOfMaskBit[bit];
        format->slotSpeaker[slot] = static_cast<uint8_t>(bit + 1);
    }
}

}  // namespace vxcomn
