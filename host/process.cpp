// SPDX-License-Identifier: MIT
//
// VXDSPAPI_Process: the block function of the render side. It reads like its table of contents: guards, test signals, silence test,
// input meter and analyser, engine or fold-down, output analyser and meter, counters. handshake.h tells how control calls meet it.
#include "VXDSPAPI.h"
#include "host/adapters.h"
#include "host/channel_mixer.h"
#include "host/host_context.h"
#include "host/kernels.h"
#include "host/test_signals.h"
#include "measure/peak_meter.h"
#include "platform/clock.h"
#include "platform/float_mode.h"

#ifdef VXCOMN_RT_FAULT
#include "tests/realtime/injected_fault.h"  // negative controls of the real-time proofs
#endif

namespace vxcomn {

namespace {

// -120 dB: below the last bit of a 16-bit sample, so dither counts as sound and idle noise of a float path does not.
constexpr float kSilenceThreshold = 1e-6F;

// What the block reads once and then keeps to.
struct Block {
    LibraryContext &context;
    ProcessBuffers *buffers;
    IOFormat *input;
    IOFormat *output;
    float *const *chan;
    int inChannels;   // 0 to 8
    int outChannels;  // 0 to 8
    int frames;
};

VXCOMN_RT_INLINE int heldToSlots(int channels) noexcept {
    return channels < 0 ? 0 : channels > VX_SLOT_COUNT ? VX_SLOT_COUNT : channels;
}

VXCOMN_RT_INLINE bool isLocked(const VXAtomicByte &lock) noexcept {
    return lock.load(std::memory_order_seq_cst) != 0;
}

VXCOMN_RT_INLINE void clearFirOverlapOnRequest(LibraryContext &context) noexcept {
    if (context.processFirResetPending.load(std::memory_order_seq_cst) == 0) return;
    // The request falls first: one that a load raises from here on stands until the next block.
    context.processFirResetPending.store(0, std::memory_order_seq_cst);
    if (!isLocked(context.processFirBusy)) context.processFir.clearOverlap();
}

VXCOMN_RT_INLINE void countSilence(const Block &block) noexcept {
    int32_t &silentFrames = block.context.silentFrames;
    for (int i = 0; i < block.inChannels; ++i) {
        const uint8_t slot = block.input->channelSlot[i];
        if (slot < VX_SLOT_COUNT && anyAbove(block.chan[slot], block.frames, kSilenceThreshold)) {
            storeShared(silentFrames, 0);
            return;
        }
    }
    // Held at the greatest value: an endpoint may be silent for days.
    int32_t sum = 0;
    if (__builtin_add_overflow(loadShared(silentFrames), block.frames, &sum)) sum = INT32_MAX;
    storeShared(silentFrames, sum);
}

VXCOMN_RT_INLINE void meter(const Block &block, const VXAtomicByte &lock, float *peaks, int32_t &channels) noexcept {
    if (isLocked(lock)) return;
    channels = updatePeaks(block.chan, peaks, block.outChannels, block.frames);
}

VXCOMN_RT_INLINE void analyse(const Block &block, int index, int channelChoice) noexcept {
    LibraryContext &context = block.context;
    if (isLocked(context.analyserLock[index]) || context.analyser[index].enabled == 0) return;
    context.analyser[index].feed(channelChoice, block.chan, block.outChannels, block.frames);
}

// The engine with the module behind it; without an engine path, or for an instance that maintains a preset, the fold-down alone.
VXCOMN_RT_INLINE void runEngine(VXHandle handle, const Block &block) noexcept {
    LibraryContext &context = block.context;
    if (context.apoPresetPath != nullptr || context.processAdapter == nullptr) {
        mixChannels(block.buffers, &context.inputFormat, block.output);
        return;
    }
    mixChannels(block.buffers, &context.inputFormat, &context.inputFormat);
    context.processAdapter(handle, block.buffers, &context.inputFormat, &context.outputFormat);
    constexpr uint32_t kModuleInBlock = 2;
    if (loadShared(context.isstLoaded) != 0 && (loadShared(context.hardwareMode) & kModuleInBlock) != 0) {
        fixedPointProcess(context.isstHandle, block.buffers, &context.inputFormat, &context.outputFormat);
    }
}

VXCOMN_RT_INLINE void processBlock(VXHandle handle, const Block &block) noexcept {
    LibraryContext &context = block.context;
    if (context.initialised == 0 || block.frames > VX_MAX_FRAMES) {
        for (int i = 0; i < block.outChannels; ++i) hostKernels().zero(block.chan[i], block.frames);
        return;
    }
    if (isLocked(context.processStop)) return;
    clearFirOverlapOnRequest(context);
    if (generateTestSignals(context, block.chan, block.outChannels, block.frames) == SignalPath::measuredOnly) return;
    countSilence(block);
    meter(block, context.inputMeterLock, context.inputPeak, context.inputMeterChannels);
    analyse(block, 0, 2);
    runEngine(handle, block);
    analyse(block, 1, loadShared(context.analyserFeedMode));
    meter(block, context.outputMeterLock, context.outputPeak, context.outputMeterChannels);
}

VXCOMN_RT_INLINE void countTime(LibraryContext &context, int64_t start, int frames) noexcept {
    if (isLocked(context.processStatsLock)) return;
    context.processSeconds += static_cast<double>(performanceNanoseconds() - start) * 1e-9;
    context.processStatFrames += static_cast<uint64_t>(static_cast<int64_t>(frames));
}

}  // namespace

}  // namespace vxcomn

VXCOMN_RT void VXDSPAPI_Process(VXHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output) {
    using namespace vxcomn;
    LibraryContext &context = contextOf(handle);
    storeShared(context.inputFormat.frames, input->frames);
    storeShared(context.outputFormat.frames, output->frames);
    const BlockFloatMode floatMode;
    context.processBusy.store(1, std::memory_order_seq_cst);
    const int64_t start = performanceNanoseconds();
    const int frames = output->frames;
#ifdef VXCOMN_RT_FAULT
    injected_fault::VXCOMN_RT_FAULT();
#endif
    processBlock(handle, {context, buffers, input, output, buffers->channels, heldToSlots(input->channels),
                          heldToSlots(output->channels), frames});
    storeShared(context.totalFrames, context.totalFrames + static_cast<uint64_t>(static_cast<int64_t>(frames)));
    countTime(context, start, frames);
    buffers->silent = loadShared(context.silentFrames) > loadShared(context.sampleRate) ? 1 : 0;
    context.processBusy.store(0, std::memory_order_release);
}
