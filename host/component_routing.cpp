// SPDX-License-Identifier: MIT
#include "host/component_routing.h"

#include <algorithm>

#include "host/host_context.h"
#include "host/isst_module.h"

namespace vxcomn {

namespace {

// Parameter ids that the host sends to engines.
constexpr int32_t kComponentEnable = -6;
constexpr int32_t kDisableInputGain = -29;
constexpr int32_t kDisableOutputGain = -30;
constexpr int32_t kGlobalComponent = -1;

void send(VXEngineSetParameter setParameter, VXEngineHandle handle, int32_t componentId, int32_t paramId, bool on) {
    uint8_t data = on ? 1 : 0;
    if (setParameter != nullptr) setParameter(handle, componentId, paramId, 0, &data, 1);
}

}  // namespace

bool mainEngineHasWork(const LibraryContext &context) noexcept {
    const int last = std::min<int>(context.maxComponentId, VX_MAX_COMPONENTS - 1);
    for (int id = 0; id <= last; ++id) {
        if (context.componentEnable[id] != 0 && context.componentOnISST[id] == 0) return true;
    }
    return false;
}

void UpdateComponentEnable(VXEngineHandle handle, int32_t componentId) {
    const LibraryContext &context = contextOf(handle);
    const bool enable = context.componentEnable[componentId] != 0;
    const bool onISST = context.componentOnISST[componentId] != 0;
    const int32_t isstLoaded = loadShared(context.isstLoaded);
    hostLog(context, VX_TEXT("ISSTModuleLoaded = %i, enable = %i.\n"), isstLoaded, enable);
    if (isstLoaded == 0) {
        send(context.engineSetParameter, handle, componentId, kComponentEnable, enable);
        return;
    }
    send(context.engineSetParameter, handle, componentId, kComponentEnable, enable && !onISST);
    send(context.isstModule->engineSetParameter, context.isstHandle, componentId, kComponentEnable, enable && onISST);
}

void UpdateDisableInputOutputGains(VXEngineHandle handle) {
    const LibraryContext &context = contextOf(handle);
    const int32_t isstLoaded = loadShared(context.isstLoaded);
    hostLog(context, VX_TEXT("ISSTModuleLoaded = %i.\n"), isstLoaded);
    if (isstLoaded == 0) {
        send(context.engineSetParameter, handle, kGlobalComponent, kDisableInputGain, false);
        send(context.engineSetParameter, handle, kGlobalComponent, kDisableOutputGain, false);
        return;
    }
    const bool hybridProcMode = mainEngineHasWork(context);
    hostLog(context, VX_TEXT("hybridProcMode = %i.\n"), hybridProcMode);
    // Kept: the module is never told about its output gain.
    send(context.engineSetParameter, handle, kGlobalComponent, kDisableInputGain, !hybridProcMode);
    send(context.engineSetParameter, handle, kGlobalComponent, kDisableOutputGain, true);
    send(context.isstModule->engineSetParameter, context.isstHandle, kGlobalComponent, kDisableInputGain, hybridProcMode);
}

}  // namespace vxcomn
