// SPDX-License-Identifier: MIT
//
// Which formats the engine takes and which channel buffers a format means. Control threads ask and plan; the render thread follows
// the plan.
#pragma once

#include <vxcomn/block.h>

namespace sample_engine {

// 1 to 8 of the eight slot speakers, each once, at 8 to 192 kHz.
bool isSupported(const IOFormat &format);

// Makes an unsupported format one that is supported: stereo, at the nearest supported rate.
void offerStereo(IOFormat &format);

// What a block does with the eight buffers. All numbers are slots.
struct SpeakerPlan {
    int pairs = 0;                                                   // pairs of slots to process; 0 leaves every block as it is
    int pairSlot[VX_SLOT_COUNT / 2] = {};                            // the even slot of each
    bool processed[VX_SLOT_COUNT] = {};                              // the output has this speaker
    bool silenced[VX_SLOT_COUNT] = {};                               // the output has it and the input has nothing for it
    int copyFrom[VX_SLOT_COUNT] = {-1, -1, -1, -1, -1, -1, -1, -1};  // mono input goes to both fronts; -1 for none
};

// The plan for a pair of formats; an empty one if the output is unsupported or all zero. `fixedPoint` keeps to the first slots, as
// many as the output has channels: the host hands no others to a fixed-point engine.
SpeakerPlan planSpeakers(const IOFormat &input, const IOFormat &output, bool fixedPoint);

}  // namespace sample_engine
