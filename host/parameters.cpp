// SPDX-License-Identifier: MIT
//
// Parameter routing: the one road by which a value reaches the engines. The host takes a reserved range of negative ids for itself,
// hands everything else on, and keeps component enables and gains of the two engine instances in step. Control threads; engines
// accept parameters during a block.
#include "VXDSPAPI.h"
#include "host/component_routing.h"
#include "host/handshake.h"
#include "host/host_context.h"
#include "host/isst_module.h"
#include "host/preset_maintenance.h"
#include "measure/byte_cursors.h"

namespace vxcomn {

namespace {

// Parameter ids of the host's own.
enum HostParameter : int32_t {
    kComponentOnISST = -26,
    kHardwareMode = -25,
    kSingleChannelPinkNoise = -17,
    kProcessFirLoad = -16,
    kProcessFirEnable = -15,
    kRecordFirLoad = -14,
    kRecordFirEnable = -13,
    kComponentEnable = -6,
};

struct Parameter {
    int32_t componentId;
    int32_t paramId;
    uint32_t channel;
    uint8_t *data;
    uint32_t dataSize;
    int32_t transient;  // only the preset mirror asks
};

ByteReader readerOf(const Parameter &parameter) {
    return {parameter.data, parameter.dataSize};
}

uint32_t setComponentByte(VXHandle handle, const Parameter &parameter, uint8_t (LibraryContext::*table)[VX_MAX_COMPONENTS]) {
    LibraryContext &context = contextOf(handle);
    ByteReader in = readerOf(parameter);
    uint8_t on = 0;
    if (parameter.componentId < 0 || parameter.componentId >= VX_MAX_COMPONENTS || !in.read(on)) return 0;
    const std::lock_guard lock(controlLock(&context));
    (context.*table)[parameter.componentId] = on != 0 ? 1 : 0;
    UpdateComponentEnable(handle, parameter.componentId);
    UpdateDisableInputOutputGains(handle);
    return static_cast<uint32_t>(in.position());
}

uint32_t setComponentOnISST(VXHandle handle, const Parameter &parameter) {
    const uint32_t read = setComponentByte(handle, parameter, &LibraryContext::componentOnISST);
    const LibraryContext &context = contextOf(handle);
    return context.hostType == 3 && !isstInUse(context) ? 0 : read;
}

uint32_t setHardwareMode(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint32_t mode = 0;
    if (!in.read(mode)) return 0;
    const std::lock_guard lock(controlLock(&context));
    if (mode == context.hardwareMode) return static_cast<uint32_t>(in.position());
    storeShared(context.hardwareMode, mode);
    if (context.hostType >= 2 && context.hostType <= 4) {
        constexpr uint32_t kModuleWanted = 1;
        const ProcessHold hold(context);
        if (isstInUse(context)) UnloadISSTModule(context);
        if ((mode & kModuleWanted) != 0) LoadISSTModule(context);
    }
    return static_cast<uint32_t>(in.position());
}

uint32_t setSingleChannelPinkNoise(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint8_t on = 0;
    if (!in.read(on)) return 0;
    const std::lock_guard lock(controlLock(&context));
    waitUntilIdle(context.processBusy);
    context.singleChannelPinkNoise = on != 0 ? 1 : 0;
    context.processFirResetPending = 1;
    context.processStop = 0;
    return static_cast<uint32_t>(in.position());
}

// One of the five filters with everything that belongs to it.
struct FirPlace {
    FftFirFilter &filter;
    uint32_t &length;
    float *coefficients;
    VXAtomicByte &filterBusy;
    VXAtomicByte &blockBusy;
    VXAtomicByte &resetPending;
};

// A change of length keeps the block function off the filter; one of equal length is taken up between two blocks.
void loadFir(LibraryContext &context, const FirPlace &place, ByteReader &in, uint32_t count) {
    const std::lock_guard lock(controlLock(&context));
    const bool lengthChanges = count != place.length;
    if (lengthChanges) stopBlocks(place.filterBusy, place.blockBusy);
    place.length = count;
    in.readAll(place.coefficients, count);
    place.filter.load(place.coefficients, static_cast<int>(count), context.sampleRate);
    if (lengthChanges) {
        place.resetPending.store(1, std::memory_order_release);
        place.filterBusy.store(0, std::memory_order_release);
    }
}

uint32_t loadProcessFir(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint16_t count = 0;
    if (!in.read(count) || count > VX_MAX_FIR_TAPS || !in.holds(count * sizeof(float))) return 0;
    loadFir(context,
            {context.processFir, context.processFirLength, context.processFirCoefficients, context.processFirBusy,
             context.processBusy, context.processFirResetPending},
            in, count);
    return static_cast<uint32_t>(in.position());
}

uint32_t loadRecordFir(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint16_t count = 0;
    uint16_t channel = 0;
    if (!in.read(count)) return 0;
    const bool channelGiven = in.size() > count * sizeof(float) + sizeof count;
    if (channelGiven && !in.read(channel)) return 0;
    if (count > VX_MAX_FIR_TAPS || channel >= VX_RECORD_CHANNELS || !in.holds(count * sizeof(float))) return 0;
    loadFir(context,
            {context.recordFir[channel], context.recordFirLength[channel], context.recordFirCoefficients[channel],
             context.recordFirBusy[channel], context.recordBusy, context.recordFirResetPending},
            in, count);
    return static_cast<uint32_t>(in.position());
}

uint32_t setProcessFirEnable(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint8_t on = 0;
    if (!in.read(on)) return 0;
    context.processFirEnable = on != 0 ? 1 : 0;
    return static_cast<uint32_t>(in.position());
}

uint32_t setRecordFirEnable(LibraryContext &context, const Parameter &parameter) {
    ByteReader in = readerOf(parameter);
    uint8_t on = 0;
    uint16_t channel = 0;
    if (!in.read(on)) return 0;
    if (in.size() >= 2 && !in.read(channel)) return 0;
    if (channel >= VX_RECORD_CHANNELS) return 0;
    context.recordFirEnable[channel] = on != 0 ? 1 : 0;
    return static_cast<uint32_t>(in.position());
}

uint32_t sendToEngines(VXHandle handle, const Parameter &p) {
    const LibraryContext &context = contextOf(handle);
    uint32_t result = 0;
    if (context.engineSetParameter != nullptr) {
        result = context.engineSetParameter(handle, p.componentId, p.paramId, p.channel, p.data, p.dataSize);
    }
    const std::lock_guard lock(controlLock(&context));
    if (isstInUse(context) && context.isstModule->engineSetParameter != nullptr) {
        result =
            context.isstModule->engineSetParameter(context.isstHandle, p.componentId, p.paramId, p.channel, p.data, p.dataSize);
    }
    return result;
}

uint32_t routeParameter(VXHandle handle, const Parameter &parameter) {
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_SetParameter"));
    if (context.trace != nullptr && context.trace->Enabled != 0) {
        hostLog(context, VX_TEXT("ComponentId = %i, ParamId = %i, Channel = %i, Data[0] = 0x%02X, DataSize = %i\n"),
                parameter.componentId, parameter.paramId, static_cast<int32_t>(parameter.channel),
                parameter.data == nullptr ? uint8_t{0} : parameter.data[0], static_cast<int32_t>(parameter.dataSize));
    }
    // Ahead of every other test: the store also gets what comes while no engine is ready.
    mirrorParameter(context, parameter.componentId, parameter.paramId, parameter.channel, parameter.data, parameter.dataSize,
                    parameter.transient);
    if (context.initialised == 0) return 0;
    switch (parameter.paramId) {
        case kComponentOnISST:
            return setComponentOnISST(handle, parameter);
        case kHardwareMode:
            return setHardwareMode(context, parameter);
        case kSingleChannelPinkNoise:
            return setSingleChannelPinkNoise(context, parameter);
        case kProcessFirLoad:
            return loadProcessFir(context, parameter);
        case kProcessFirEnable:
            return setProcessFirEnable(context, parameter);
        case kRecordFirLoad:
            return loadRecordFir(context, parameter);
        case kRecordFirEnable:
            return setRecordFirEnable(context, parameter);
        case kComponentEnable:
            return setComponentByte(handle, parameter, &LibraryContext::componentEnable);
        default:
            return sendToEngines(handle, parameter);
    }
}

}  // namespace

}  // namespace vxcomn

uint32_t VXDSPAPI_SetParameter(VXHandle handle, int32_t componentId, int32_t paramId, uint32_t channel, uint8_t *data,
                               uint32_t dataSize) {
    return VXDSPAPI_SetParameterEx(handle, componentId, paramId, channel, data, dataSize, 0);
}

uint32_t VXDSPAPI_SetParameterEx(VXHandle handle, int32_t componentId, int32_t paramId, uint32_t channel, uint8_t *data,
                                 uint32_t dataSize, int32_t transient) {
    try {
        return vxcomn::routeParameter(handle, {componentId, paramId, channel, data, dataSize, transient});
    } catch (...) {
        return 0;
    }
}
