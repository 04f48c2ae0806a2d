// SPDX-License-Identifier: MIT
//
// VXDSPAPI_InitializeLibrary and VXDSPAPI_FreeLibrary: the real entry and exit of a host instance, and the exports that only show
// that host and engine have the same surface. Control threads.
#include <algorithm>
#include <cstring>
#include <iterator>

#include "VXDSPAPI.h"
#include "host/engine_events.h"
#include "host/handshake.h"
#include "host/host_context.h"
#include "host/isst_module.h"
#include "host/library_loader.h"
#include "host/module_name.h"
#include "host/preset_maintenance.h"
#include "platform/module.h"
#include "preset/engine_table.h"

namespace vxcomn {

namespace {

constexpr int kHostTypeWithEngineText = 3;
constexpr uint32_t kInitialFirLength = 128;
constexpr float kInitialPeak = 1e-6F;
constexpr int32_t kMeanOfAllChannels = 2;

VXHandle startEngine(LibraryContext &context, const char *PlatformName, uint32_t Hardware, const char *CommandLine, int HostType) {
    const EngineEventCallback callback = HostType == kHostTypeWithEngineText ? engineTextCallback : nullEngineCallback;
    VXHandle handle = context.engineInitialize(Hardware, PlatformName, CommandLine, callback, &context, HostType);
    if (handle != nullptr) *static_cast<LibraryContext **>(handle) = &context;
    return handle;
}

void nameEngine(LibraryContext &context, const char *EngineName) {
    context.engineShortName = nullptr;
    context.engineDescription = {};
    if (EngineName == nullptr) return;
    const std::string shortName(engineShortNameOf(EngineName));
    context.engineShortName = copyText(shortName.c_str());
    context.engineDescription = engineDescription(shortName);
}

void readCommandLine(LibraryContext &context, const char *CommandLine) {
    if (CommandLine == nullptr) return;
    context.presetBinWriteOff = std::strstr(CommandLine, "/wrpresetbinoff") != nullptr ? 1 : 0;
    context.boardParamsWriteOff = std::strstr(CommandLine, "/wrboardparamsoff") != nullptr ? 1 : 0;
}

void setDefaults(LibraryContext &context, int32_t RecordSampleRate) {
    context.recordSampleRate = RecordSampleRate;
    context.blockFrames = VX_MAX_FRAMES;
    context.recordFirResetPending = 1;
    context.processFirResetPending = 1;
    context.processFirLength = kInitialFirLength;
    std::fill(std::begin(context.recordFirLength), std::end(context.recordFirLength), kInitialFirLength);
    context.analyserFeedMode = kMeanOfAllChannels;
    for (float *peaks : {context.recordPeak, context.inputPeak, context.outputPeak})
        std::fill_n(peaks, VX_SLOT_COUNT, kInitialPeak);
    context.totalFrames = 0;
}

VXHandle initializeLibrary(const char *EngineName, const char *PlatformName, uint32_t Hardware, const char *CommandLine,
                           const char *APOPresetPath, int32_t RecordSampleRate, int32_t HostType) {
    const std::string fileName = composeModuleName(EngineName, PlatformName, HostType);
    LibraryContext *loaded = LoadDSPLibrary(nullptr, fileName.c_str(), PlatformName, HostType);
    // Kept: a module without VXDSPAPI_Initialize, like an engine that declines, leaves its context allocated.
    if (loaded == nullptr || loaded->engineInitialize == nullptr) return nullptr;
    LibraryContext &context = *loaded;
    VXHandle handle = startEngine(context, PlatformName, Hardware, CommandLine, HostType);
    const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_InitializeLibrary"));
    context.hardwareFlag0 = Hardware & 1U;
    context.hardwareFlag1 = Hardware >> 1 & 1U;
    hostLog(
        context,
        VX_TEXT("EngineName = %s, PlatformName = %s, Hardware = %i, CommandLine = %s, APOPresetPath = %s, RecordSampleRate = %i, "
                "HostType = %i.\n"),
        EngineName, PlatformName, context.hardwareFlag0, CommandLine, APOPresetPath, RecordSampleRate, HostType);
    nameEngine(context, EngineName);
    context.commandLine = copyText(CommandLine);
    context.hostType = HostType;
    readCommandLine(context, CommandLine);
    nameEndpoints(context, CommandLine);
    context.apoPresetPath = copyText(APOPresetPath);
    maintainPreset(context);
    setDefaults(context, RecordSampleRate);
    hostLog(context, handle != nullptr ? VX_TEXT("Done.\n") : VX_TEXT("Failed.\n"));
    return handle;
}

// What came to a context that never had a format: filters loaded early, a module that waits for one.
void disposeLeftovers(LibraryContext &context) {
    context.processFir.dispose();
    for (FftFirFilter &filter : context.recordFir) filter.dispose();
    if (context.isstModule != nullptr) UnloadISSTModule(context);
}

int32_t freeLibrary(VXHandle handle) {
    LibraryContext &context = contextOf(handle);
    void *module = context.engineModule;
    {
        const std::lock_guard lock(controlLock(&context));
        const TraceScope scope(traceOf(context), VX_TEXT("VXDSPAPI_FreeLibrary"));
        stopBlocks(context.recordStop, context.recordBusy);
        stopBlocks(context.processStop, context.processBusy);
        IOFormat none[2] = {};
        VXDSPAPI_SetIOFormat(handle, &none[0], &none[1]);
        disposeLeftovers(context);
        if (context.engineFree != nullptr) context.engineFree(handle);
        freeText(context.commandLine);
        endPresetMaintenance(context);
        freeText(context.apoPresetPath);
        freeText(context.inputEndpointId);
        freeText(context.inputEndpointName);
        freeText(context.outputEndpointId);
        freeText(context.outputEndpointName);
        freeText(context.engineShortName);
        hostLog(context, VX_TEXT("Disposing library context.\n"));
    }
    destroyContext(&context);
    return module == nullptr ? 0 : freeModule(module);
}

}  // namespace

}  // namespace vxcomn

VXHandle VXDSPAPI_InitializeLibrary(const char *EngineName, const char *PlatformName, uint32_t Hardware, const char *CommandLine,
                                    const char *APOPresetPath, int32_t RecordSampleRate, int32_t HostType) {
    try {
        return vxcomn::initializeLibrary(EngineName, PlatformName, Hardware, CommandLine, APOPresetPath, RecordSampleRate,
                                         HostType);
    } catch (...) {
        return nullptr;
    }
}

int32_t VXDSPAPI_FreeLibrary(VXHandle handle) {
    try {
        return vxcomn::freeLibrary(handle);
    } catch (...) {
        return 0;
    }
}

void VXDSPAPI_Initialize(void) {}

void VXDSPAPI_Free(void) {}

VXEngineProcess VXDSPAPI_GetProcessFuncAddress(void) {
    return VXDSPAPI_Process;
}

VXEngineRecord VXDSPAPI_GetRecordFuncAddress(void) {
    return VXDSPAPI_Record;
}
