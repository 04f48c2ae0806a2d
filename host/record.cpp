// SPDX-License-Identifier: MIT
//
// VXDSPAPI_Record: the block function of the capture side, the other half of the test signals. It filters the capture, hands
// samples to the application, finds where a test signal arrives, follows a sweep, finds polarity, feeds meter and analyser and
// passes the block to the engine. The host's own work is limited to the first four channels. Nothing allocates.
#include "VXDSPAPI.h"
#include "host/host_context.h"
#include "measure/capture_ring.h"
#include "measure/capture_switch.h"
#include "measure/onset_detector.h"
#include "measure/peak_meter.h"
#include "measure/saturate.h"
#include "measure/tracking_notch.h"
#include "platform/clock.h"
#include "platform/float_mode.h"

namespace vxcomn {

namespace {

bool isUp(const VXAtomicByte &byte) noexcept {
    return byte.load(std::memory_order_seq_cst) != 0;
}

int heldToRecordChannels(int channels) noexcept {
    return channels < 0 ? 0 : channels > VX_RECORD_CHANNELS ? VX_RECORD_CHANNELS : channels;
}

void clearFirOverlapsOnRequest(LibraryContext &context) noexcept {
    if (!isUp(context.recordFirResetPending)) return;
    // The request falls first: one that a load raises from here on stands until the next block.
    context.recordFirResetPending.store(0, std::memory_order_seq_cst);
    for (int k = 0; k < VX_RECORD_CHANNELS; ++k) {
        if (!isUp(context.recordFirBusy[k])) context.recordFir[k].clearOverlap();
    }
}

void filter(LibraryContext &context, int i, float *samples, int frames) noexcept {
    if (isUp(context.recordFirBusy[i]) || !isUp(context.recordFirEnable[i]) || isUp(context.singleChannelPinkNoise)) return;
    context.recordFir[i].process(samples, samples, frames);
}

// Kept: the rings run while both bytes are up, although the command that arms them leaves one down.
void capture(LibraryContext &context, float *const *chan, int channels, int frames) noexcept {
    if (!capturesRun(context)) return;
    for (int i = 0; i < channels; ++i) {
        if (context.capture[i].active != 0) feedCaptureRing(context.capture[i], reinterpret_cast<uint32_t *>(chan[i]), frames);
    }
}

// Starts the capture-side twin of a sweep so that it follows the acoustic delay. The delay is measured from the start of the block,
// because tracking begins there.
void startTracker(LibraryContext &context, int i, int onset, int blockStart) noexcept {
    const SweepGenerator &sweep = context.sweep[i];
    const int rate = loadShared(context.recordSampleRate);
    const double delay = static_cast<double>(int64_t{onset} - blockStart) * 1000.0 / rate;
    const int preDelay = truncateToInt32(delay + 0.5 * static_cast<double>(sweep.PreDelay));
    context.sweepTracker[i].arm(rate, sweep.StartFrequency, sweep.StopFrequency, sweep.SweepTime, static_cast<float>(preDelay),
                                static_cast<float>(truncateToInt32(static_cast<double>(sweep.PostDelay))), sweep.BandsPerOctave);
}

void measureSweep(LibraryContext &context, int i, float *samples, int frames) noexcept {
    if (isUp(context.sweepOnsetPending[i])) {
        const int blockStart = context.sweepDetector[i].sampleIndex;
        const Onset onset = findOnset(context.sweepDetector[i], samples, frames);
        if (onset.found) {
            context.sweepOnsetPending[i].store(0, std::memory_order_relaxed);
            context.sweepTracking[i].store(1, std::memory_order_relaxed);
            startTracker(context, i, onset.index, blockStart);
        }
    }
    if (!isUp(context.sweepActive[i]) || !isUp(context.sweepTracking[i])) return;
    int32_t next = context.distortionIndex[i];
    trackSweep(context.sweepTracker[i], context.trackingNotch[i],
               {context.notchInputSum[i], context.notchOutputSum[i], context.distortion[i], next, context.distortionPoints[i]},
               samples, frames, loadShared(context.recordSampleRate));
    publish(context.distortionIndex[i], next);  // whoever reads it finds the figures below it complete
}

void measurePolarity(LibraryContext &context, int i, const float *samples, int frames) noexcept {
    if (!isUp(context.polarityOnsetPending[i])) return;
    const Onset onset = findOnset(context.polarityDetector[i], samples, frames);
    if (!onset.found) return;
    context.polarityOnsetPending[i].store(0, std::memory_order_relaxed);
    if (onset.peak > 0.0F) storeShared(context.polarityResult[i], 1);
    if (onset.peak < 0.0F) storeShared(context.polarityResult[i], -1);
}

// The meter's reader waits for the render side and not for this one, so it may empty a peak in the middle of a block. The block's
// own peaks are taken first, and then raise what stands there.
void meter(LibraryContext &context, float *const *chan, int channels, int frames) noexcept {
    if (isUp(context.recordMeterLock)) return;
    float peaks[VX_RECORD_CHANNELS] = {};
    storeShared(context.recordMeterChannels, updatePeaks(chan, peaks, channels, frames));
    for (int i = 0; i < channels; ++i) {
        if (peaks[i] > loadShared(context.recordPeak[i])) storeShared(context.recordPeak[i], peaks[i]);
    }
}

void recordBlock(VXHandle handle, LibraryContext &context, ProcessBuffers *buffers, IOFormat *format, int frames) noexcept {
    if (isUp(context.recordStop)) return;
    float *const *chan = buffers->channels;
    const int channels = heldToRecordChannels(format->channels);
    clearFirOverlapsOnRequest(context);
    for (int i = 0; i < channels; ++i) filter(context, i, chan[i], frames);
    capture(context, chan, channels, frames);
    for (int i = 0; i < channels; ++i) measureSweep(context, i, chan[i], frames);
    for (int i = 0; i < channels; ++i) measurePolarity(context, i, chan[i], frames);
    meter(context, chan, channels, frames);
    if (!isUp(context.analyserLock[2]) && context.analyser[2].enabled != 0) {
        context.analyser[2].feed(loadShared(context.analyserFeedMode), chan, channels, frames);
    }
    if (context.recordAdapter != nullptr) context.recordAdapter(handle, buffers, format);
}

void countTime(LibraryContext &context, int64_t start, int frames) noexcept {
    if (isUp(context.recordStatsLock)) return;
    context.recordSeconds += static_cast<double>(performanceNanoseconds() - start) * 1e-9;
    context.recordStatFrames += static_cast<uint64_t>(static_cast<int64_t>(frames));
}

}  // namespace

}  // namespace vxcomn

void VXDSPAPI_Record(VXHandle handle, ProcessBuffers *buffers, IOFormat *format) {
    using namespace vxcomn;
    LibraryContext &context = contextOf(handle);
    const BlockFloatMode floatMode;
    const int frames = format->frames;
    if (context.initialised == 0 || frames > VX_MAX_FRAMES) return;
    context.recordBusy.store(1, std::memory_order_seq_cst);
    const int64_t start = performanceNanoseconds();
    recordBlock(handle, context, buffers, format, frames);
    countTime(context, start, frames);
    context.recordBusy.store(0, std::memory_order_release);
}
