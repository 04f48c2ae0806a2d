/* The smallest engine: one gain over all channels. Every other export may be missing; the host does without. */
#include <vxcomn/engine.h>

#include <stdlib.h>
#include <string.h>

typedef struct Instance {
    struct LibraryContext *context; /* the first word is the host's */
    _Atomic float gain;             /* control threads write, the render thread reads */
} Instance;

VXCOMN_ENGINE_API VXEngineHandle VXDSPAPI_Initialize(uint32_t hardware, const char *platform, const char *commandLine,
                                                     EngineEventCallback callback, struct LibraryContext *context, int32_t type) {
    Instance *instance = calloc(1, sizeof *instance);
    if (instance == NULL) return NULL; /* null declines */
    instance->gain = 1.0f;
    callback(context, 0, 0, "gain engine at your service\n");
    return instance;
}

VXCOMN_ENGINE_API void VXDSPAPI_Free(VXEngineHandle handle) {
    free(handle);
}

/* Component -1, parameter -12: an f32 gain. The result is what was read of it, 0 for a refusal. */
VXCOMN_ENGINE_API uint32_t VXDSPAPI_SetParameter(VXEngineHandle handle, int32_t component, int32_t id, uint32_t channel,
                                                 uint8_t *data, uint32_t size) {
    float gain;
    if (component != -1 || id != -12 || size < sizeof gain) return 0;
    memcpy(&gain, data, sizeof gain);
    if (!(gain >= 0 && gain <= 16)) return 0;
    ((Instance *)handle)->gain = gain;
    return sizeof gain;
}

VXCOMN_ENGINE_API void VXDSPAPI_Process(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output) {
    const float gain = ((Instance *)handle)->gain;
    for (int i = 0; i < output->channels && i < VX_SLOT_COUNT; ++i)
        for (int frame = 0; frame < output->frames; ++frame) buffers->channels[output->channelSlot[i] & 7][frame] *= gain;
}
