// SPDX-License-Identifier: MIT
#include "host/test_signals.h"

#include "host/kernels.h"
#include "measure/white_noise.h"

namespace vxcomn {

namespace {

VXCOMN_RT_INLINE bool isOn(const VXAtomicByte &byte) noexcept {
    return byte.load(std::memory_order_seq_cst) != 0;
}

VXCOMN_RT void pinkNoiseOnFirstChannel(LibraryContext &context, float *const *chan, int channels, int frames) noexcept {
    context.pinkNoise.generate(chan[0], 0, frames);
    for (int i = 1; i < channels; ++i) hostKernels().zero(chan[i], frames);
    if (!isOn(context.processFirBusy) && isOn(context.processFirEnable)) context.processFir.process(chan[0], chan[0], frames);
}

// The tone rides in the silent lead-in of the sweep and marks its start for the capture side.
VXCOMN_RT void sweepWithLeadIn(LibraryContext &context, float *const *chan, int channel, int frames) noexcept {
    SweepGenerator &sweep = context.sweep[channel];
    context.sweepStarted[channel].store(1, std::memory_order_relaxed);
    sweep.generate(chan[channel], 0, frames);
    if (sweep.Position < sweep.PreDelaySamples) context.polarityTone[channel].generate(chan[channel], 0, frames);
}

VXCOMN_RT void polarityTone(LibraryContext &context, float *const *chan, int channel, int frames) noexcept {
    context.polarityStarted[channel].store(1, std::memory_order_relaxed);
    if (context.polarityTone[channel].generate(chan[channel], 0, frames) == 0) {
        context.polarityActive[channel].store(0, std::memory_order_relaxed);
    }
}

}  // namespace

SignalPath generateTestSignals(LibraryContext &context, float *const *chan, int channels, int frames) noexcept {
    if (isOn(context.singleChannelPinkNoise)) {
        pinkNoiseOnFirstChannel(context, chan, channels, frames);
        return SignalPath::measuredOnly;
    }
    if (isOn(context.whiteNoiseMode)) {
        for (int i = 0; i < channels; ++i) fillWhite(chan[i], frames);
    } else if (isOn(context.pinkNoiseMode)) {
        for (int i = 0; i < channels; ++i) context.pinkNoise.generate(chan[i], 0, frames);
    } else if (isOn(context.sineMode)) {
        // There are four generators; channels beyond them keep the caller's samples.
        for (int i = 0; i < channels && i < VX_SINE_CHANNELS; ++i) context.sine[i].generate(chan[i], 0, frames);
    } else {
        for (int i = 0; i < channels; ++i) {
            if (isOn(context.sweepActive[i])) sweepWithLeadIn(context, chan, i, frames);
        }
        for (int i = 0; i < channels; ++i) {
            if (isOn(context.polarityActive[i])) polarityTone(context, chan, i, frames);
        }
    }
    return SignalPath::whole;
}

}  // namespace vxcomn
