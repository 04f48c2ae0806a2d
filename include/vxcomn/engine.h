/* SPDX-License-Identifier: MIT
 *
 * What an engine module exports and what the host hands to it. An engine author includes this header and nothing else of the
 * library. Compiles as C11 and C++17 by itself.
 *
 * The handle is a pointer to the engine's own instance record. The first pointer-sized word of that record belongs to the host,
 * which writes its LibraryContext there right after VXDSPAPI_Initialize has returned. A module may leave out any export but
 * VXDSPAPI_Initialize.
 */
#ifndef VXCOMN_ENGINE_H
#define VXCOMN_ENGINE_H

#include "block.h"

struct LibraryContext;

/* The opaque instance of an engine. */
typedef void *VXEngineHandle;

enum { VX_MAX_ENGINE_COMPONENTS = 64 };

/* One component of an engine: an effect stage and its place. */
typedef struct EngineComponent {
    int32_t ComponentId;
    int32_t Position;
} EngineComponent;

/* The identity of an engine's component chain. 524 bytes, little-endian. */
typedef struct EngineConfig {
    uint32_t Size;           /* bytes of the record that count */
    uint32_t Reserved;       /* 0 */
    uint32_t ComponentCount; /* entries in use */
    EngineComponent Components[VX_MAX_ENGINE_COMPONENTS];
} EngineConfig;

/*
 * What an engine calls to tell the host something, from VXDSPAPI_Initialize on. `context` is the LibraryContext that it received
 * there. Code 0 passes a text for the log; code -1 with subCode -1 declines to run.
 */
typedef void (*EngineEventCallback)(struct LibraryContext *context, int32_t code, int32_t subCode, const char *text);

/* The fourteen exports of an engine module, by type. Names are VXDSPAPI_ and what stands behind VXEngine. */

/* [control] Makes an instance and returns its handle, or null to decline. Strings may be null. */
typedef VXEngineHandle (*VXEngineInitialize)(uint32_t hardware, const char *platformName, const char *commandLine,
                                             EngineEventCallback callback, struct LibraryContext *context, int32_t hostType);
/* [control] Ends an instance. No block runs any more. */
typedef void (*VXEngineFree)(VXEngineHandle handle);
/* [control] 0 if `tested` is supported as offered beside `other`. */
typedef uint32_t (*VXEngineIsInputFormatSupported)(VXEngineHandle handle, IOFormat *tested, IOFormat *other);
typedef uint32_t (*VXEngineIsOutputFormatSupported)(VXEngineHandle handle, IOFormat *tested, IOFormat *other);
/* [control, no block runs] 0 for success. */
typedef uint32_t (*VXEngineSetIOFormat)(VXEngineHandle handle, IOFormat *input, IOFormat *output);
/* [control] Linear gain ahead of the engine's effects. May come during a block. */
typedef void (*VXEngineSetInputGain)(VXEngineHandle handle, float gain);
/* [control, no block runs] */
typedef void (*VXEngineCreateComponent)(VXEngineHandle handle, uint32_t componentType, int32_t componentId, uint32_t sampleRate,
                                        uint32_t recordSampleRate);
/* [control, no block runs] */
typedef void (*VXEngineDisposeComponent)(VXEngineHandle handle, uint32_t componentType, uint32_t componentId);
/* [control] Clears histories. */
typedef void (*VXEngineClear)(VXEngineHandle handle, uint32_t what);
/* [control] `data` is a little-endian byte string of `dataSize` bytes. May come during a block. */
typedef uint32_t (*VXEngineSetParameter)(VXEngineHandle handle, int32_t componentId, int32_t paramId, uint32_t channel,
                                         uint8_t *data, uint32_t dataSize);
/* [control] The engine's own data; packed little-endian streams. Returns the bytes written to `output`. */
typedef uint32_t (*VXEngineReadWriteData)(VXEngineHandle handle, uint32_t componentId, int32_t paramId, const uint8_t *input,
                                          int32_t inputSize, uint8_t *output);
/* [render] Processes one block in place: f32 samples, or 24-bit samples left-justified in 32-bit words on a fixed-point platform.
 */
typedef void (*VXEngineProcess)(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output);
/* [capture] Sees one block of the capture side. */
typedef void (*VXEngineRecord)(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format);
/* [control] Called often. */
typedef void (*VXEngineOnIdle)(VXEngineHandle handle);

#ifdef __cplusplus
static_assert(sizeof(EngineComponent) == 8, "EngineComponent crosses the interface");
static_assert(sizeof(EngineConfig) == 524 && offsetof(EngineConfig, ComponentCount) == 8 &&
                  offsetof(EngineConfig, Components) == 12,
              "EngineConfig crosses the interface");
#endif

#endif
