// SPDX-License-Identifier: MIT
#include "measure/diagnostic_commands.h"

#include <algorithm>
#include <atomic>

#include "measure/onset_detector.h"
#include "measure/shared_word.h"

namespace vxcomn {

namespace {

// How far a ring index lies behind another.
int distance(int from, int to, int capacity) {
    return to >= from ? to - from : to - from + capacity;
}

// Keeps the feed off the frame that a readout is about to copy. The feed stops at the read index, so what has not been read is
// safe. A frame that reaches back behind that index, as the frames of a fast reader do, is not: for it the index goes back to where
// the frame begins, until the readout moves it to the frame's end.
void keepFrame(RealTimeAnalyser &analyser, int half) {
    const int capacity = analyser.capacity;
    if (half >= capacity) return;  // nothing will be copied
    for (;;) {
        const int write = __atomic_load_n(analyser.writeIndex, __ATOMIC_ACQUIRE);
        const int read = __atomic_load_n(analyser.readIndex, __ATOMIC_ACQUIRE);
        if (distance(read, write, capacity) >= half) return;
        __atomic_exchange_n(analyser.readIndex, write >= half ? write - half : write - half + capacity, __ATOMIC_SEQ_CST);
        // A block that had fetched the old index may go on writing, one block's length at most.
        const int passed = distance(write, __atomic_load_n(analyser.writeIndex, __ATOMIC_SEQ_CST), capacity);
        if (passed + half + VX_MAX_FRAMES < capacity || half + VX_MAX_FRAMES >= capacity) return;
    }
}

void clearHistory(BiquadState &state) {
    state.x1 = state.x2 = 0.0F;
    state.y1 = state.y2 = 0.0;
}

}  // namespace

void takePeaks(const int32_t &channels, float *peaks, ByteWriter &out) {
    const int32_t count = std::clamp<int32_t>(loadShared(channels), 0, VX_SLOT_COUNT);
    out.write(count);
    for (int i = 0; i < count; ++i) out.write(std::atomic_ref<float>(peaks[i]).exchange(0.0F, std::memory_order_relaxed));
}

float takeLoad(LoadFigures figures, int32_t sampleRate) {
    const auto enough = static_cast<uint64_t>(std::max(sampleRate / 4, 1));
    if (figures.frames >= enough) {
        figures.percent = static_cast<float>(sampleRate * figures.seconds / static_cast<double>(figures.frames) * 100.0);
        figures.seconds = 0.0;
        figures.frames = 0;
    }
    return figures.percent;
}

void switchAnalyser(RealTimeAnalyser &analyser, uint8_t on) {
    analyser.enabled = on;
    if (on == 0) analyser.clear();
}

bool canRead(const RealTimeAnalyser &analyser, uint32_t fftSize) {
    const bool powerOfTwo = fftSize >= 2 && fftSize <= INT32_MAX && (fftSize & (fftSize - 1)) == 0;
    return powerOfTwo && analyser.ring != nullptr && static_cast<int32_t>(fftSize / 2) <= analyser.capacity;
}

bool readSpectrum(RealTimeAnalyser &analyser, const SpectrumRequest &request) {
    const auto size = static_cast<int32_t>(request.fftSize);
    keepFrame(analyser, size / 2);
    analyser.readBands(request.integrate ? 1 : 0, size, request.bandsPerOctave);
    return analyser.fftSize != nullptr;
}

void setSineFrequency(LibraryContext &context, uint16_t frequency) {
    if (frequency == 0) return;
    for (SineGenerator &sine : context.sine) sine.setFrequency(frequency, context.sampleRate);
}

void armSweep(LibraryContext &context, const SweepRequest &request) {
    const int channel = request.channel;
    SweepGenerator &sweep = context.sweep[channel];
    sweep.arm(context.sampleRate, request.start, request.stop, request.sweepTime, request.preDelay, request.postDelay,
              request.bandsPerOctave);
    // The tone fills the lead-in: half of it swells, half decays.
    context.polarityTone[channel].arm(context.sampleRate, static_cast<float>(request.preDelay) * 0.5F);
    clearHistory(context.trackingNotch[channel]);
    context.sweepStarted[channel] = 0;
    context.sweepTracking[channel] = 0;
    context.sweepOnsetPending[channel] = request.on != 0 ? 1 : 0;
    context.sweepActive[channel] = request.on != 0 ? 1 : 0;
    resetOnsetDetector(context.sweepDetector[channel], static_cast<float>(context.sampleRate));
    storeShared(context.distortionIndex[channel], std::min<int32_t>(sweep.FirstIndex, VX_MAX_DISTORTION));
    const int32_t points = std::min<int32_t>(sweep.TableSize - 1, VX_MAX_DISTORTION);
    storeShared(context.distortionPoints[channel], points);
    std::fill_n(context.distortion[channel], points, 1.0F);
    context.notchInputSum[channel] = 0.0;
    context.notchOutputSum[channel] = 0.0;
}

void armPolarity(LibraryContext &context, const PolarityRequest &request) {
    const int channel = request.channel;
    context.polarityTone[channel].arm(context.sampleRate, request.halfLength);
    context.polarityStarted[channel] = 0;
    context.polarityOnsetPending[channel] = request.on != 0 ? 1 : 0;
    context.polarityActive[channel] = request.on != 0 ? 1 : 0;
    resetOnsetDetector(context.polarityDetector[channel], static_cast<float>(context.sampleRate));
    storeShared(context.polarityResult[channel], 0);
}

void writeSweepResult(const LibraryContext &context, int channel, ByteWriter &out) {
    out.write(loadShared(context.distortionPoints[channel]));
    out.write(loadPublished(context.distortionIndex[channel]));
    out.write(static_cast<uint64_t>(reinterpret_cast<uintptr_t>(context.distortion[channel])));
}

}  // namespace vxcomn
