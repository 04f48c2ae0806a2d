// SPDX-License-Identifier: MIT
//
// The control calls that are thin layers over the engine's own: components, input gain, clearing, idle work. Control threads.
#include <algorithm>

#include "VXDSPAPI.h"
#include "host/handshake.h"
#include "host/host_context.h"
#include "host/isst_module.h"

namespace vxcomn {

namespace {

// The component id that stands for the host itself.
constexpr int32_t kHostComponent = -1;

void changeRates(LibraryContext &context, int32_t sampleRate, int32_t recordSampleRate) {
    context.recordSampleRate = recordSampleRate;
    storeShared(context.sampleRate, sampleRate);
    storeShared(context.silentFrames, 0);
    hostLog(context, VX_TEXT("Setting sinewave generator's samplerate %i.\n"), sampleRate);
    for (SineGenerator &sine : context.sine) sine.setSampleRate(sampleRate);
}

}  // namespace

}  // namespace vxcomn

void VXDSPAPI_CreateComponent(VXHandle handle, uint32_t componentType, int32_t componentId, uint32_t sampleRate,
                              uint32_t recordSampleRate) {
    using namespace vxcomn;
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_CreateComponent"));
    if (context.initialised == 0) return;
    const BlockHold hold(context);
    if (componentId == kHostComponent) {
        changeRates(context, static_cast<int32_t>(sampleRate), static_cast<int32_t>(recordSampleRate));
    } else if (context.engineCreateComponent != nullptr) {
        context.engineCreateComponent(handle, componentType, componentId, sampleRate, recordSampleRate);
        context.maxComponentId = std::max(context.maxComponentId, componentId);
    }
}

void VXDSPAPI_DisposeComponent(VXHandle handle, uint32_t componentType, uint32_t componentId) {
    using namespace vxcomn;
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_DisposeComponent"));
    if (context.initialised == 0) {
        hostLog(context, VX_TEXT("Not initialized!\n"));
        return;
    }
    hostLog(context, VX_TEXT("Waiting for processing and recording routines to exit...\n"));
    const BlockHold hold(context);
    hostLog(context, VX_TEXT("Done.\n"));
    if (context.engineDisposeComponent != nullptr) context.engineDisposeComponent(handle, componentType, componentId);
}

void VXDSPAPI_SetInputGain(VXHandle handle, float gain) {
    using namespace vxcomn;
    LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_SetInputGain"));
    hostLog(context, VX_TEXT("Gain = %f.\n"), static_cast<double>(gain));
    if (context.engineSetInputGain != nullptr) context.engineSetInputGain(handle, gain);
    const std::lock_guard lock(controlLock(&context));
    if (isstInUse(context) && context.isstModule->engineSetInputGain != nullptr) {
        context.isstModule->engineSetInputGain(context.isstHandle, gain);
    }
}

void VXDSPAPI_Clear(VXHandle handle, uint32_t what) {
    using namespace vxcomn;
    const LibraryContext &context = contextOf(handle);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_Clear"));
    if (context.initialised != 0 && context.engineClear != nullptr) context.engineClear(handle, what);
}

// No trace scope: it is called often.
void VXDSPAPI_OnIdle(VXHandle handle) {
    const LibraryContext &context = vxcomn::contextOf(handle);
    if (context.initialised != 0 && context.engineOnIdle != nullptr) context.engineOnIdle(handle);
}
