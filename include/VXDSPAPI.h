/* SPDX-License-Identifier: MIT
 *
 * VXDSPAPI: the DSP host. An audio processing object or a tuning tool loads this library, opens an engine module with
 * VXDSPAPI_InitializeLibrary, negotiates formats, creates components and then hands over blocks of audio. Compiles as C11 and C++17
 * by itself.
 *
 * What holds for all functions:
 *  1. Nothing raises. Control calls return u32 results, 0 for success, unless said otherwise.
 *  2. A handle is what VXDSPAPI_InitializeLibrary returned; it is valid until VXDSPAPI_FreeLibrary. Handles aren't checked.
 *  3. Strings are UTF-8, copied by the call, and may be null. Records are the caller's and are only used during the call.
 *  4. Where the engine module lacks an export, the call that needs it does the host's part and goes on.
 *  5. Tags tell the thread: [render] the one that runs VXDSPAPI_Process, [capture] the one that runs VXDSPAPI_Record, [control] any
 *     other, [control, no block runs] where the caller keeps both block functions out, [any].
 *
 * Each description says, in this order: effect; arguments; result; failures and what they leave; thread.
 */
#ifndef VXDSPAPI_H
#define VXDSPAPI_H

#include "vxcomn/library_context.h"

VXCOMN_EXTERN_C_BEGIN

typedef VXEngineHandle VXHandle;

/*
 * Loads an engine module and makes an instance of it.
 * EngineName: the module's file name without its ending. PlatformName: null or "Float" for f32 engines, "HiFi2", "iSST" or
 * "AIC326x" for engines on 24-bit words; exact, with case. Hardware: flags, handed to the engine. CommandLine: handed to the
 * engine;
 * "/wrpresetbinoff", "/wrboardparamsoff", "iepid:ID" and "oepid:ID" are the host's. APOPresetPath: null, or a preset to maintain:
 * such an instance never runs the engine's audio path. RecordSampleRate: Hz, of the capture side. HostType: 1 to 4, or anything
 * else. The module's file is EngineName.dll with a null platform name or host type 3, else EngineName.DSP.dll,
 * EngineName.DSP.HiFi2.dll
 * ("HiFi2", "iSST") or EngineName.DSP.AIC326x.dll. It is looked for as the system does, then beside this library.
 * Returns the handle, or null: no such module, no VXDSPAPI_Initialize in it, an unknown platform name, or an engine that declines.
 * An engine that declines keeps its module loaded.
 * [control]
 */
VXCOMN_API VXHandle VXDSPAPI_InitializeLibrary(const char *EngineName, const char *PlatformName, uint32_t Hardware,
                                               const char *CommandLine, const char *APOPresetPath, int32_t RecordSampleRate,
                                               int32_t HostType);

/*
 * Stops both block functions, tears down all objects, frees the engine's instance and releases the module.
 * Returns what releasing the module returned (nonzero for success), or 0 if there was none to release.
 * The handle is gone afterwards. No block may begin after this call has returned.
 * [control]
 */
VXCOMN_API int32_t VXDSPAPI_FreeLibrary(VXHandle handle);

/* Stand here only so that host and engine show the same surface. They do nothing. [any] */
VXCOMN_API void VXDSPAPI_Initialize(void);
VXCOMN_API void VXDSPAPI_Free(void);

/* The addresses of VXDSPAPI_Process and VXDSPAPI_Record, for callers that look no names up. [any] */
VXCOMN_API VXEngineProcess VXDSPAPI_GetProcessFuncAddress(void);
VXCOMN_API VXEngineRecord VXDSPAPI_GetRecordFuncAddress(void);

/*
 * Processes one block in place: test signals, silence test, meters, fold-down to the engine's speakers, engine.
 * buffers: eight buffers of at least output->frames samples each. input, output: the formats of the block's two sides; the block's
 * length is output->frames, at most 512.
 * Writes buffers->silent: 1 after more than one second of silence, else 0.
 * A block that is too long comes back as zeros on the output channels. While a control call holds the block path up, the samples
 * come back as they were. More than eight channels count as eight.
 * Allocates nothing, locks nothing, logs nothing; makes no system call but the clock's. The thread's floating-point mode is the
 * same before and after.
 * [render]
 */
VXCOMN_API void VXDSPAPI_Process(VXHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output);

/*
 * Takes one block of the capture side through the host's measuring and on to the engine.
 * buffers: as for VXDSPAPI_Process. format: the block's format.
 * A block of more than 512 frames is left alone.
 * [capture]
 */
VXCOMN_API void VXDSPAPI_Record(VXHandle handle, ProcessBuffers *buffers, IOFormat *format);

/*
 * Asks whether a format suits as input (output) beside another. Sets `frames` of both records to 512 in every case.
 * Returns the engine's answer, 0 for "as offered". Without an engine's answer: 0 for two channels; else `tested` is rewritten to
 * stereo and the result is 1 (input) or 2 (output).
 * [control]
 */
VXCOMN_API uint32_t VXDSPAPI_IsInputFormatSupported(VXHandle handle, IOFormat *tested, IOFormat *other);
VXCOMN_API uint32_t VXDSPAPI_IsOutputFormatSupported(VXHandle handle, IOFormat *tested, IOFormat *other);

/*
 * Sets the formats of both sides and makes all measuring objects anew for them. All-zero formats only tear down. Formats that equal
 * the present ones in channels, mask, frames and rate change nothing.
 * Returns the engine's result, else 0.
 * [control, no block runs]
 */
VXCOMN_API uint32_t VXDSPAPI_SetIOFormat(VXHandle handle, IOFormat *input, IOFormat *output);

/* Hands a linear gain to the engine. The host keeps no copy. [control] */
VXCOMN_API void VXDSPAPI_SetInputGain(VXHandle handle, float gain);

/*
 * Creates a component of the engine, with the block functions held up meanwhile. componentId -1 is the host's own: it changes both
 * sample rates (Hz) and restarts the silence count; the engine sees nothing of it.
 * [control]
 */
VXCOMN_API void VXDSPAPI_CreateComponent(VXHandle handle, uint32_t componentType, int32_t componentId, uint32_t sampleRate,
                                         uint32_t recordSampleRate);

/* Disposes a component of the engine, with the block functions held up meanwhile. [control] */
VXCOMN_API void VXDSPAPI_DisposeComponent(VXHandle handle, uint32_t componentType, uint32_t componentId);

/* Asks the engine to clear its histories; `what` is the engine's. [control] */
VXCOMN_API void VXDSPAPI_Clear(VXHandle handle, uint32_t what);

/* Lets the engine do slow work. To be called often. [control] */
VXCOMN_API void VXDSPAPI_OnIdle(VXHandle handle);

/*
 * Sends a parameter. The ids -6, -13 to -17, -25 and -26 are the host's own (component enables, FIR filters, pink noise, the iSST
 * module); all others go to the engine.
 * data: a little-endian byte string of dataSize bytes, at least one byte readable.
 * Returns the bytes that the host read of an id of its own, or the engine's result.
 * A FIR load of more than 4096 coefficients, or of more than the data holds, returns 0 and changes nothing; so does a component or
 * channel number beyond the host's tables.
 * [control] May come while blocks run.
 */
VXCOMN_API uint32_t VXDSPAPI_SetParameter(VXHandle handle, int32_t componentId, int32_t paramId, uint32_t channel, uint8_t *data,
                                          uint32_t dataSize);

/* The same; `transient` nonzero marks a value that the preset store is not to keep. [control] */
VXCOMN_API uint32_t VXDSPAPI_SetParameterEx(VXHandle handle, int32_t componentId, int32_t paramId, uint32_t channel, uint8_t *data,
                                            uint32_t dataSize, int32_t transient);

/*
 * Turns a power spectrum of the caller's into fractional-octave bands. Needs no handle.
 * power: fftSize / 2 + 1 linear values, from 0 Hz to half of sampleRate (Hz). bandsPerOctave: 3, 6, 12, 24, 48, or -24 for 24 bands
 * shifted by a quarter octave; any other number means 1. integrate: nonzero for the power between a band's edges, 0 for the value
 * at its centre. bands: room for one value less than the result; 555 are enough for every table. Returns the number of band edges,
 * one more than the values written. A band above half of sampleRate is 0. With fftSize below 2 or sampleRate below 1 nothing is
 * written. [any] One caller for each `bands`.
 */
VXCOMN_API int32_t VXDSPAPI_RTA_CalcSpectrum(const float *power, int32_t fftSize, float *bands, int32_t sampleRate,
                                             int32_t bandsPerOctave, int32_t integrate);

/*
 * The same over a table of the caller's.
 * power: halfSize + 1 values. edges: tableSize frequencies in Hz, rising; centres: one less, each between its two edges. bands:
 * room for tableSize - 1 values. No result. A band whose frequencies are below 0 or no number keeps what its slot holds; so do all
 * with halfSize or sampleRate below 1. [any] One caller for each `bands`.
 */
VXCOMN_API void VXDSPAPI_RTA_FFTToBands(const float *power, int32_t halfSize, const float *edges, const float *centres,
                                        int32_t tableSize, float *bands, int32_t sampleRate, int32_t integrate);

VXCOMN_EXTERN_C_END

#endif
