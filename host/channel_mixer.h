// SPDX-License-Identifier: MIT
//
// Makes a block fit a speaker mask: sound of speakers that the mask lacks is added, in place, to the nearest ones that it has. The
// same bits whatever the block length. Also draws the slot tables of a format from its mask.
#pragma once

#include "measure/realtime.h"
#include "vxcomn/block.h"

namespace vxcomn {

// Folds the block of `target->frames` frames onto `target->channelMask`. `source` is accepted and ignored. Folded slots keep their
// samples. Buffers may be the same or overlap: the folds then happen one after the other, as the rules stand. [render]
VXCOMN_RT void mixChannels(ProcessBuffers *buffers, IOFormat *source, IOFormat *target) noexcept;

// Fills channelMask, channelSlot and slotSpeaker. Speakers without a slot of their own share one; the later bit's number stays in
// slotSpeaker. [any]
void setChannelMask(IOFormat *format, uint32_t mask) noexcept;

}  // namespace vxcomn
