// SPDX-License-Identifier: MIT
//
// VXDSPAPI_ReadWriteData: the door through which a tuning or measuring application works the tools of a host instance, and reaches
// the engine's own data. Here stand the dispatch, the forwarding, and how each command meets the block functions (handshake.h);
// what a command does to the tools is in measure/diagnostic_commands.h. Control threads.
#include <algorithm>
#include <iterator>

#include "VXDSPAPI.h"
#include "host/component_routing.h"
#include "host/handshake.h"
#include "host/host_context.h"
#include "host/isst_module.h"
#include "measure/capture_switch.h"
#include "measure/diagnostic_commands.h"

namespace vxcomn {

namespace {

struct Call {
    uint32_t componentId;
    int32_t paramId;
    const uint8_t *input;
    int32_t inputSize;
    uint8_t *output;
};

// Kept: all three meters wait for the render side, also the one that the capture side writes.
void readMeter(LibraryContext &context, VXAtomicByte &lock, const int32_t &channels, float *peaks, ByteWriter &out) {
    const FieldHold hold(context, lock, context.processBusy);
    takePeaks(channels, peaks, out);
}

// Kept: the capture side's load goes by the output rate too.
void readLoad(LibraryContext &context, VXAtomicByte &lock, const VXAtomicByte &busy, LoadFigures figures, ByteWriter &out) {
    const FieldHold hold(context, lock, busy);
    out.write(takeLoad(figures, context.sampleRate));
}

void enableAnalyser(LibraryContext &context, ByteReader &in) {
    AnalyserSwitch request;
    if (!readRequest(in, request)) return;
    constexpr int kOnCaptureSide = 2;
    const FieldHold hold(context, context.analyserLock[request.analyser],
                         request.analyser == kOnCaptureSide ? context.recordBusy : context.processBusy);
    switchAnalyser(context.analyser[request.analyser], request.on);
}

void chooseAnalyserChannel(LibraryContext &context, ByteReader &in) {
    uint8_t choice = 0;
    if (in.read(choice)) storeShared(context.analyserFeedMode, int32_t{choice});
}

void readAnalyser(LibraryContext &context, ByteReader &in, ByteWriter &out) {
    SpectrumRequest request;
    if (!readRequest(in, request)) return;
    // Only against other control calls: the feed goes on.
    const std::lock_guard lock(controlLock(&context));
    RealTimeAnalyser &analyser = context.analyser[request.analyser];
    if (!canRead(analyser, request.fftSize) || !readSpectrum(analyser, request)) return;
    out.write(static_cast<uint64_t>(reinterpret_cast<uintptr_t>(analyser.bands)));
    out.write(uint8_t{0});
}

void ignorePair(LibraryContext &context, ByteReader &in) {
    int32_t first = 0;
    int32_t second = 0;
    const ProcessHold hold(context);
    static_cast<void>(in.read(first, second));
}

void switchMode(VXAtomicByte &mode, ByteReader &in) {
    uint8_t on = 0;
    if (in.read(on)) mode = on != 0 ? 1 : 0;
}

void switchSine(LibraryContext &context, ByteReader &in) {
    SineRequest request;
    if (!readRequest(in, request)) return;
    const std::lock_guard lock(controlLock(&context));
    setSineFrequency(context, request.frequency);
    context.sineMode = request.on != 0 ? 1 : 0;
}

void startSweep(LibraryContext &context, ByteReader &in) {
    SweepRequest request;
    if (!readRequest(in, request)) return;
    const MeasuringHold hold(context);
    armSweep(context, request);
}

void startPolarity(LibraryContext &context, ByteReader &in) {
    PolarityRequest request;
    if (!readRequest(in, request)) return;
    const MeasuringHold hold(context);
    armPolarity(context, request);
}

// `captureArmed` falls while the rings change, or a second arming would leave both bytes up and capture would run half-made rings.
// Kept: at the end it is `captureRequested` that is down, so the rings stay idle.
void armCaptures(LibraryContext &context, ByteReader &in) {
    CaptureRequest request;
    if (!readRequest(in, request)) return;
    const std::lock_guard lock(controlLock(&context));
    setCaptureSwitch(context, true, false);
    waitUntilIdle(context.recordBusy);
    std::copy(std::begin(request.rings), std::end(request.rings), context.capture);
    setCaptureSwitch(context, false, true);
}

// The bytes fall first, so that capture is off the rings when they go.
void stopCaptures(LibraryContext &context) {
    const std::lock_guard lock(controlLock(&context));
    setCaptureSwitch(context, false, false);
    waitUntilIdle(context.recordBusy);
    for (CaptureRing &ring : context.capture) ring = {};
}

void readSweepResult(const LibraryContext &context, ByteReader &in, ByteWriter &out) {
    uint8_t channel = 0;
    if (readChannel(in, channel)) writeSweepResult(context, channel, out);
}

void readPolarityResult(const LibraryContext &context, ByteReader &in, ByteWriter &out) {
    uint8_t channel = 0;
    if (readChannel(in, channel)) out.write(loadShared(context.polarityResult[channel]));
}

// 0: no module; 1: some enabled component runs in the main engine; 2: all run on the module.
uint8_t isstState(const LibraryContext &context) {
    const std::lock_guard lock(controlLock(&context));
    if (!isstInUse(context)) return 0;
    return mainEngineHasWork(context) ? 1 : 2;
}

bool isForwarded(int32_t id) {
    switch (id) {
        case -25:
        case -24:
        case -23:
        case -16:
        case -6:
        case -5:
        case -4:
            return true;
        default:
            return id < VXDSP_DATA_ISST_STATE || id >= 0;
    }
}

bool writesOutput(int32_t id) {
    switch (id) {
        case VXDSP_DATA_RTA_ENABLE:
        case VXDSP_DATA_RTA_CHANNEL:
        case VXDSP_DATA_IGNORED_PAIR:
        case VXDSP_DATA_WHITE_NOISE:
        case VXDSP_DATA_PINK_NOISE:
        case VXDSP_DATA_SINE:
        case VXDSP_DATA_SWEEP_START:
        case VXDSP_DATA_CAPTURE_ARM:
        case VXDSP_DATA_CAPTURE_STOP:
        case VXDSP_DATA_POLARITY_START:
            return false;
        default:
            return true;
    }
}

void runCommand(LibraryContext &context, int32_t id, ByteReader &in, ByteWriter &out) {
    switch (id) {
        case VXDSP_DATA_METER_RECORD:
            return readMeter(context, context.recordMeterLock, context.recordMeterChannels, context.recordPeak, out);
        case VXDSP_DATA_METER_INPUT:
            return readMeter(context, context.inputMeterLock, context.inputMeterChannels, context.inputPeak, out);
        case VXDSP_DATA_METER_OUTPUT:
            return readMeter(context, context.outputMeterLock, context.outputMeterChannels, context.outputPeak, out);
        case VXDSP_DATA_RTA_ENABLE:
            return enableAnalyser(context, in);
        case VXDSP_DATA_RTA_CHANNEL:
            return chooseAnalyserChannel(context, in);
        case VXDSP_DATA_RTA_READ:
            return readAnalyser(context, in, out);
        case VXDSP_DATA_LOAD_PROCESS:
            return readLoad(context, context.processStatsLock, context.processBusy,
                            {context.processSeconds, context.processStatFrames, context.processLoadPercent}, out);
        case VXDSP_DATA_LOAD_RECORD:
            return readLoad(context, context.recordStatsLock, context.recordBusy,
                            {context.recordSeconds, context.recordStatFrames, context.recordLoadPercent}, out);
        case VXDSP_DATA_IGNORED_PAIR:
            return ignorePair(context, in);
        case VXDSP_DATA_WHITE_NOISE:
            return switchMode(context.whiteNoiseMode, in);
        case VXDSP_DATA_PINK_NOISE:
            return switchMode(context.pinkNoiseMode, in);
        case VXDSP_DATA_SINE:
            return switchSine(context, in);
        case VXDSP_DATA_SWEEP_START:
            return startSweep(context, in);
        case VXDSP_DATA_CAPTURE_ARM:
            return armCaptures(context, in);
        case VXDSP_DATA_CAPTURE_STOP:
            return stopCaptures(context);
        case VXDSP_DATA_SWEEP_RESULT:
            return readSweepResult(context, in, out);
        case VXDSP_DATA_POLARITY_START:
            return startPolarity(context, in);
        case VXDSP_DATA_POLARITY_RESULT:
            return readPolarityResult(context, in, out);
        case VXDSP_DATA_ISST_LOADED:
            return out.write(static_cast<uint8_t>(loadShared(context.isstLoaded)));
        case VXDSP_DATA_MODULE_VERSION:
            return out.write(context.thisModuleVersion);
        case VXDSP_DATA_APO_VERSION:
            return out.write(context.apoModuleVersion);
        case VXDSP_DATA_ISST_STATE:
            return out.write(isstState(context));
        default:
            return;
    }
}

uint32_t forward(VXHandle handle, const Call &call) {
    const LibraryContext &context = contextOf(handle);
    uint32_t result = 0;
    if (context.engineReadWriteData != nullptr) {
        result = context.engineReadWriteData(handle, call.componentId, call.paramId, call.input, call.inputSize, call.output);
    }
    const std::lock_guard lock(controlLock(&context));
    if (!isstInUse(context)) return result;
    // Kept: only ids from 0 on ask for the instance.
    if (call.paramId >= 0 && context.isstHandle == nullptr) return result;
    const VXEngineReadWriteData readWrite = context.isstModule->engineReadWriteData;
    if (readWrite == nullptr) return result;
    return readWrite(context.isstHandle, call.componentId, call.paramId, call.input, call.inputSize, call.output);
}

uint32_t readWriteData(VXHandle handle, const Call &call) {
    LibraryContext &context = contextOf(handle);
    if (context.initialised == 0) return 0;
    if (isForwarded(call.paramId)) return forward(handle, call);
    if (call.output == nullptr && writesOutput(call.paramId)) return 0;
    ByteReader in(call.input, call.inputSize < 0 ? 0 : static_cast<size_t>(call.inputSize));
    ByteWriter out(call.output);
    runCommand(context, call.paramId, in, out);
    return static_cast<uint32_t>(out.position());
}

}  // namespace

}  // namespace vxcomn

uint32_t VXDSPAPI_ReadWriteData(VXHandle handle, uint32_t componentId, int32_t paramId, const uint8_t *input, int32_t inputSize,
                                uint8_t *output) {
    try {
        return vxcomn::readWriteData(handle, {componentId, paramId, input, inputSize, output});
    } catch (...) {
        return 0;
    }
}
