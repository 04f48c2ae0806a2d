// SPDX-License-Identifier: MIT
//
// The module behind mock_engine.h. MOCK_WITHOUT_INITIALIZE leaves that export out, MOCK_BARE leaves out all others.
#include "tests/support/mock_engine.h"

#include <cstdio>

namespace {

// The first word is the host's.
struct Instance {
    LibraryContext *context;
};

MockEngine &state() {
    static MockEngine engine;
    return engine;
}

template <class... Arguments>
void note(const char *format, Arguments... arguments) {
    char text[512];
    std::snprintf(text, sizeof text, format, arguments...);
    state().calls.emplace_back(text);
    if (state().onControl) state().onControl();
}

[[maybe_unused]] std::string textOf(const char *text) {
    return text == nullptr ? "(null)" : text;
}

}  // namespace

extern "C" {

VXCOMN_ENGINE_API MockEngine *MockEngine_State() {
    return &state();
}

#ifndef MOCK_WITHOUT_INITIALIZE
VXCOMN_ENGINE_API VXEngineHandle VXDSPAPI_Initialize(uint32_t hardware, const char *platformName, const char *commandLine,
                                                     EngineEventCallback callback, LibraryContext *context, int32_t hostType) {
    MockEngine &engine = state();
    engine.calls.emplace_back("Initialize");
    engine.hardware = hardware;
    engine.platformName = textOf(platformName);
    engine.commandLine = textOf(commandLine);
    engine.callback = callback;
    engine.context = context;
    engine.hostType = hostType;
    if (engine.onInitialize) engine.onInitialize(context, callback);
    if (engine.decline) return nullptr;
#ifdef MOCK_BARE
    static Instance only;  // nobody could free it
    return &only;
#else
    return new Instance();
#endif
}
#endif

#ifndef MOCK_BARE
VXCOMN_ENGINE_API void VXDSPAPI_Free(VXEngineHandle handle) {
    note("Free");
    delete static_cast<Instance *>(handle);
}

VXCOMN_ENGINE_API uint32_t VXDSPAPI_IsInputFormatSupported(VXEngineHandle, IOFormat *tested, IOFormat *other) {
    note("IsInputFormatSupported(%i, %i)", tested->frames, other->frames);
    return state().formatResult;
}

VXCOMN_ENGINE_API uint32_t VXDSPAPI_IsOutputFormatSupported(VXEngineHandle, IOFormat *tested, IOFormat *other) {
    note("IsOutputFormatSupported(%i, %i)", tested->frames, other->frames);
    return state().formatResult;
}

VXCOMN_ENGINE_API uint32_t VXDSPAPI_SetIOFormat(VXEngineHandle, IOFormat *input, IOFormat *output) {
    note("SetIOFormat(%i, %i)", input->channels, output->channels);
    return state().setFormatResult;
}

VXCOMN_ENGINE_API void VXDSPAPI_SetInputGain(VXEngineHandle, float gain) {
    note("SetInputGain(%g)", static_cast<double>(gain));
}

VXCOMN_ENGINE_API void VXDSPAPI_CreateComponent(VXEngineHandle, uint32_t type, int32_t id, uint32_t rate, uint32_t recordRate) {
    note("CreateComponent(%u, %i, %u, %u)", type, id, rate, recordRate);
}

VXCOMN_ENGINE_API void VXDSPAPI_DisposeComponent(VXEngineHandle, uint32_t type, uint32_t id) {
    note("DisposeComponent(%u, %u)", type, id);
}

VXCOMN_ENGINE_API void VXDSPAPI_Clear(VXEngineHandle, uint32_t what) {
    note("Clear(%u)", what);
}

VXCOMN_ENGINE_API uint32_t VXDSPAPI_SetParameter(VXEngineHandle, int32_t componentId, int32_t paramId, uint32_t channel,
                                                 uint8_t *data, uint32_t dataSize) {
    std::string bytes;
    for (uint32_t i = 0; i < dataSize && i < 16; ++i) {
        char byte[4];
        std::snprintf(byte, sizeof byte, "%02X", data[i]);
        bytes += byte;
    }
    note("SetParameter(%i, %i, %u, [%s])", componentId, paramId, channel, bytes.c_str());
    return state().parameterResult;
}

VXCOMN_ENGINE_API uint32_t VXDSPAPI_ReadWriteData(VXEngineHandle, uint32_t componentId, int32_t paramId, const uint8_t *,
                                                  int32_t inputSize, uint8_t *) {
    note("ReadWriteData(%u, %i, %i)", componentId, paramId, inputSize);
    return state().dataResult;
}

VXCOMN_ENGINE_API void VXDSPAPI_Process(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output) {
    if (state().onProcess) state().onProcess(handle, buffers, input, output);
}

VXCOMN_ENGINE_API void VXDSPAPI_Record(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format) {
    if (state().onRecord) state().onRecord(handle, buffers, format);
}

VXCOMN_ENGINE_API void VXDSPAPI_OnIdle(VXEngineHandle) {
    note("OnIdle");
}
#endif
}
