// SPDX-License-Identifier: MIT
#include "host/library_loader.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

#include "diag/debug_trace.h"
#include "host/adapters.h"
#include "platform/module.h"

namespace vxcomn {

namespace {

// Adds the folder of this library to the module search.
bool searchBesideThisLibrary() {
    WideString path = thisModulePath();
    if (path.empty()) return false;
    const size_t separator = path.find_last_of(VX_TEXT("\\/"));
    if (separator != WideString::npos) path.resize(separator + 1);
    setModuleDirectory(path);
    return true;
}

Module loadEngineModule(const char *fileName) {
    Module module = loadModule(fileName);
    if (!module && searchBesideThisLibrary()) module = loadModule(fileName);
    return module;
}

template <class Function>
void bind(Function &entry, void *module, const char *name) {
    entry = reinterpret_cast<Function>(findExport(module, name));
}

void bindExports(LibraryContext &context) {
    void *module = context.engineModule;
    bind(context.engineInitialize, module, "VXDSPAPI_Initialize");
    bind(context.engineFree, module, "VXDSPAPI_Free");
    bind(context.engineIsInputFormatSupported, module, "VXDSPAPI_IsInputFormatSupported");
    bind(context.engineIsOutputFormatSupported, module, "VXDSPAPI_IsOutputFormatSupported");
    bind(context.engineSetIOFormat, module, "VXDSPAPI_SetIOFormat");
    bind(context.engineSetInputGain, module, "VXDSPAPI_SetInputGain");
    bind(context.engineCreateComponent, module, "VXDSPAPI_CreateComponent");
    bind(context.engineDisposeComponent, module, "VXDSPAPI_DisposeComponent");
    bind(context.engineClear, module, "VXDSPAPI_Clear");
    bind(context.engineSetParameter, module, "VXDSPAPI_SetParameter");
    bind(context.engineReadWriteData, module, "VXDSPAPI_ReadWriteData");
    bind(context.engineProcess, module, "VXDSPAPI_Process");
    bind(context.engineRecord, module, "VXDSPAPI_Record");
    bind(context.engineOnIdle, module, "VXDSPAPI_OnIdle");
}

void chooseTrace(LibraryContext &context, CTraceFuncCallTarget *trace) {
    context.trace = trace;
    if (trace != nullptr) return;
    context.trace = context.ownTrace;
    context.ownTrace->Enabled = readLoggingSwitch(VX_TEXT("APO"), VX_TEXT("VXCOMN")) ? 1 : 0;
    setTraceTag(*context.ownTrace, VX_TEXT("VXCOMNU"));
}

struct ContextDeleter {
    void operator()(LibraryContext *context) const noexcept { destroyContext(context); }
};

}  // namespace

LibraryContext *LoadDSPLibrary(CTraceFuncCallTarget *trace, const char *fileName, const char *PlatformName, int HostType) {
    static_cast<void>(HostType);  // part of the routine's call, and so far none of its business
    Module module = loadEngineModule(fileName);
    if (!module) return nullptr;

    std::unique_ptr<LibraryContext, ContextDeleter> context(new LibraryContext());
    context->ownTrace = new CTraceFuncCallTarget();
    context->engineModule = module.get();
    for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) {
        context->recordFixedPointers[slot] = context->recordFixedBuffers[slot];
        context->processFixedPointers[slot] = context->processFixedBuffers[slot];
    }
    context->initialised = 1;
    chooseTrace(*context, trace);
    if (!chooseAdapters(*context, PlatformName)) return nullptr;
    std::strncpy(context->engineFileName, fileName, sizeof context->engineFileName - 1);
    bindExports(*context);
    static_cast<void>(module.release());  // the context holds it from here on
    return context.release();
}

void destroyContext(LibraryContext *context) noexcept {
    delete context->ownTrace;
    delete context;
}

char *copyText(const char *text) {
    if (text == nullptr) return nullptr;
    const size_t size = std::strlen(text) + 1;
    char *copy = new char[size];
    std::memcpy(copy, text, size);
    return copy;
}

}  // namespace vxcomn
