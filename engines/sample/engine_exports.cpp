// SPDX-License-Identifier: MIT
//
// The fourteen functions that the host binds, and the instance record that its handle points to. Start here when reading the
// engine, and with this file when copying it.
#include <vxcomn/engine.h>
#include <vxcomn/library_context.h>

#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstring>
#include <new>

#include "deterministic_math.h"
#include "engine.h"

namespace {

using sample_engine::Engine;
using sample_engine::Settings;

struct Instance {
    LibraryContext *context = nullptr;  // the host's word: it writes its context here
    Engine engine;
};
static_assert(offsetof(Instance, context) == 0, "the host writes to the first word of the instance");

// The data id of VXDSPAPI_ReadWriteData.
constexpr int32_t kGainReduction = 0;

Engine *engineOf(VXEngineHandle handle) {
    return handle == nullptr ? nullptr : &static_cast<Instance *>(handle)->engine;
}

uint32_t negotiate(VXEngineHandle handle, IOFormat *tested, uint32_t refusal) {
    if (handle == nullptr || tested == nullptr || sample_engine::isSupported(*tested)) return 0;
    sample_engine::offerStereo(*tested);
    return refusal;
}

void setPresent(VXEngineHandle handle, int64_t componentId, bool present) {
    Engine *engine = engineOf(handle);
    if (engine == nullptr || componentId < 0 || componentId >= sample_engine::kComponents) return;
    engine->change([&](Settings &settings) { return settings.components[componentId].present = present; });
}

void writeWord(uint8_t *output, uint32_t word) {
    for (int byte = 0; byte < 4; ++byte) output[byte] = static_cast<uint8_t>(word >> (8 * byte));
}

}  // namespace

VXCOMN_EXTERN_C_BEGIN

// [control] Makes an instance. Null if memory is short or the command line holds "/decline", which lets the error paths of hosts
// and tools be tried.
VXCOMN_ENGINE_API VXEngineHandle VXDSPAPI_Initialize(uint32_t, const char *, const char *commandLine, EngineEventCallback callback,
                                                     LibraryContext *context, int32_t) {
    if (commandLine != nullptr && std::strstr(commandLine, "/decline") != nullptr) {
        if (callback != nullptr) callback(context, 0, 0, "SampleEngine declines, as the command line asks.\n");
        return nullptr;
    }
    auto *instance = new (std::nothrow) Instance;
    if (instance != nullptr) instance->context = context;
    return instance;
}

// [control, no block runs] Ends an instance.
VXCOMN_ENGINE_API void VXDSPAPI_Free(VXEngineHandle handle) {
    delete static_cast<Instance *>(handle);
}

// [control] 0 if the format is supported; else rewrites it to stereo and returns 1.
VXCOMN_ENGINE_API uint32_t VXDSPAPI_IsInputFormatSupported(VXEngineHandle handle, IOFormat *tested, IOFormat *) {
    return negotiate(handle, tested, 1);
}

// [control] 0 if the format is supported; else rewrites it to stereo and returns 2.
VXCOMN_ENGINE_API uint32_t VXDSPAPI_IsOutputFormatSupported(VXEngineHandle handle, IOFormat *tested, IOFormat *) {
    return negotiate(handle, tested, 2);
}

// [control, no block runs] Takes the formats and clears histories; 0, or 1 for an output format that is unsupported, with which
// blocks pass as they are.
VXCOMN_ENGINE_API uint32_t VXDSPAPI_SetIOFormat(VXEngineHandle handle, IOFormat *input, IOFormat *output) {
    Engine *engine = engineOf(handle);
    if (engine == nullptr || input == nullptr || output == nullptr) return 1;
    const bool taken = engine->setFormat(*input, *output);
    return taken || (input->channels == 0 && output->channels == 0) ? 0 : 1;
}

// [control] Linear gain ahead of the effects, 0 to 16.
VXCOMN_ENGINE_API void VXDSPAPI_SetInputGain(VXEngineHandle handle, float gain) {
    Engine *engine = engineOf(handle);
    if (engine != nullptr) engine->change([&](Settings &settings) { return sample_engine::storeGain(settings.inputGain, gain); });
}

// [control, no block runs] Brings a component back. The id alone says which; type and rates are not needed.
VXCOMN_ENGINE_API void VXDSPAPI_CreateComponent(VXEngineHandle handle, uint32_t, int32_t componentId, uint32_t, uint32_t) {
    setPresent(handle, componentId, true);
}

// [control, no block runs] Takes a component out. Its parameters are kept.
VXCOMN_ENGINE_API void VXDSPAPI_DisposeComponent(VXEngineHandle handle, uint32_t, uint32_t componentId) {
    setPresent(handle, componentId, false);
}

// [control] Clears all histories, whatever `what` says.
VXCOMN_ENGINE_API void VXDSPAPI_Clear(VXEngineHandle handle, uint32_t) {
    if (Engine *engine = engineOf(handle)) engine->clear();
}

// [control] Sets a parameter; settings.h lists them. Returns the bytes read, 0 for a refusal. The channel is not read.
VXCOMN_ENGINE_API uint32_t VXDSPAPI_SetParameter(VXEngineHandle handle, int32_t componentId, int32_t paramId, uint32_t,
                                                 uint8_t *data, uint32_t dataSize) {
    Engine *engine = engineOf(handle);
    if (engine == nullptr) return 0;
    return engine->change(
        [&](Settings &settings) { return sample_engine::applyParameter(settings, componentId, paramId, data, dataSize); });
}

// [control, formats set] Id 0, without input: u32 count, then for each speaker of the output in slot order an f32, the gain
// reduction in dB that its loudest sample since the last call asked for (0 if none). Any other id writes nothing.
VXCOMN_ENGINE_API uint32_t VXDSPAPI_ReadWriteData(VXEngineHandle handle, uint32_t, int32_t paramId, const uint8_t *, int32_t,
                                                  uint8_t *output) {
    Engine *engine = engineOf(handle);
    if (engine == nullptr || output == nullptr || paramId != kGainReduction) return 0;
    uint32_t count = 0;
    for (int slot = 0; slot < VX_SLOT_COUNT; ++slot) {
        if (!engine->plan().processed[slot]) continue;
        const float peak = engine->takePeak(slot);
        const float reduction = static_cast<float>(sample_engine::gainToDecibels(std::max(1.0F, peak)));
        ++count;
        writeWord(output + std::size_t{4} * count, std::bit_cast<uint32_t>(reduction));
    }
    writeWord(output, count);
    return 4 + 4 * count;
}

// [render] Processes one block in place.
VXCOMN_ENGINE_API void VXDSPAPI_Process(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *, IOFormat *output) {
    Engine *engine = engineOf(handle);
    if (engine != nullptr && buffers != nullptr && buffers->channels != nullptr && output != nullptr)
        engine->process(buffers->channels, output->frames);
}

// [capture] The engine has no capture effects.
VXCOMN_ENGINE_API void VXDSPAPI_Record(VXEngineHandle, ProcessBuffers *, IOFormat *) {}

// [control] Nothing waits for it.
VXCOMN_ENGINE_API void VXDSPAPI_OnIdle(VXEngineHandle) {}

VXCOMN_EXTERN_C_END
