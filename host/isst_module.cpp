// SPDX-License-Identifier: MIT
#include "host/isst_module.h"

#include <string>

#include "host/engine_events.h"
#include "host/host_context.h"
#include "host/library_loader.h"
#include "platform/debug_output.h"
#include "platform/thread_id.h"

namespace vxcomn {

namespace {

// Kept: fixed names, whatever the main engine is called.
constexpr const char *kFirstFile = "Tarnlight.Orlo.DSP.HiFi2.dll";
constexpr const char *kSecondFile = "VXORHF64U.dll";

constexpr uint32_t kModuleRate = 48000;

constexpr struct {
    uint32_t type;
    int32_t id;
} kComponents[] = {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}};

void isstEventCallback(LibraryContext *context, int32_t code, int32_t subCode, const char *text) noexcept {
    if (context == nullptr) return;
    if (code == -1) {
        // This is how the module declines to run while it starts.
        if (subCode == -1 && context->hostType != 4) storeShared(context->isstLoaded, 0);
        return;
    }
    if (code != 0 || text == nullptr) return;
    try {
        const DBG_TRACE *trace = traceOf(*context);
        const std::string tag = trace == nullptr ? "" : toUtf8(trace->Tag);
        debugOutput(std::to_string(currentThreadId()) + ": " + tag + text);
    } catch (const std::exception &) {
        return;  // a line that memory doesn't suffice for is lost
    }
}

LibraryContext *loadModuleContext(LibraryContext &context) {
    hostLog(context, VX_TEXT("Loading %s module.\n"), kFirstFile);
    LibraryContext *module = LoadDSPLibrary(context.trace, kFirstFile, "iSST", context.hostType);
    if (module != nullptr) {
        hostLog(context, VX_TEXT("%s module is loaded.\n"), kFirstFile);
        return module;
    }
    hostLog(context, VX_TEXT("Failed to load, loading %s module instead.\n"), kSecondFile);
    return LoadDSPLibrary(context.trace, kSecondFile, "iSST", context.hostType);
}

VXEngineHandle startInstance(LibraryContext &context) {
    const VXEngineInitialize initialize = context.isstModule->engineInitialize;
    if (initialize == nullptr) return nullptr;
    switch (context.hostType) {
        case 2:
            // Kept: another spelling of the platform, and no hardware.
            return initialize(0, "HiFI2", context.commandLine, nullEngineCallback, &context, context.hostType);
        case 3:
        case 4:
            return initialize(context.hardwareMode, "iSST", context.commandLine, isstEventCallback, &context, context.hostType);
        default:
            return nullptr;
    }
}

void createComponents(LibraryContext &context) {
    const LibraryContext &module = *context.isstModule;
    if (module.engineSetIOFormat != nullptr)
        module.engineSetIOFormat(context.isstHandle, &context.inputFormat, &context.outputFormat);
    if (module.engineCreateComponent == nullptr) return;
    for (const auto &component : kComponents) {
        module.engineCreateComponent(context.isstHandle, component.type, component.id, kModuleRate, kModuleRate);
    }
}

// Frees the instance and the module's context. Kept: the module's file stays loaded.
void releaseModule(LibraryContext &context) {
    LibraryContext *module = context.isstModule;
    if (context.isstHandle != nullptr) {
        if (module != nullptr && module->engineFree != nullptr) module->engineFree(context.isstHandle);
        context.isstHandle = nullptr;
    }
    if (module != nullptr) {
        destroyContext(module);
        context.isstModule = nullptr;
    }
}

}  // namespace

int LoadISSTModule(LibraryContext &context) {
    const TraceScope scope(traceOf(context), VX_TEXT("LoadISSTModule"));
    releaseModule(context);  // what a start that failed or a module that declined later has left
    context.isstModule = loadModuleContext(context);
    if (context.isstModule == nullptr) {
        hostLog(context, VX_TEXT("Failed to load iSST module!\n"));
        return 0;
    }
    // Kept: the test looks at the main engine's entry, whatever the message says.
    if (context.engineSetParameter == nullptr) {
        hostLog(context, VX_TEXT("iSST module doesn't expose VXDSPAPI_SetParameter()!\n"));
        return 0;
    }
    storeShared(context.isstLoaded, 1);  // ahead of the start, so that the module's event can take it back
    hostLog(context, VX_TEXT("Initializing library...\n"));
    context.isstHandle = startInstance(context);
    if (context.isstHandle == nullptr) {
        hostLog(context, VX_TEXT("Failed!\n"));
        storeShared(context.isstLoaded, 0);
        return 1;
    }
    if (!isstInUse(context)) {
        hostLog(context, VX_TEXT("ISSTModuleLoaded = 0! Unloading iSST module.\n"));
        UnloadISSTModule(context);
    } else {
        *static_cast<LibraryContext **>(context.isstHandle) = context.isstModule;
        createComponents(context);
    }
    hostLog(context, VX_TEXT("Done.\n"));
    return 1;
}

void UnloadISSTModule(LibraryContext &context) {
    const TraceScope scope(traceOf(context), VX_TEXT("UnloadISSTModule"));
    const LibraryContext *module = context.isstModule;
    if (isstInUse(context)) {
        storeShared(context.isstLoaded, 0);
        if (module != nullptr && module->engineDisposeComponent != nullptr) {
            for (const auto &component : kComponents) {
                module->engineDisposeComponent(context.isstHandle, component.type, static_cast<uint32_t>(component.id));
            }
        }
    }
    releaseModule(context);
}

}  // namespace vxcomn
