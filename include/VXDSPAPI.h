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

#include "vxcomn/com_types.h"
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
 * The commands of VXDSPAPI_ReadWriteData that are the host's own. Streams are packed, little-endian, without header or alignment;
 * "in" is what the command reads of its input, "out" what it writes. Channels are 0 to 7, analysers 0 (engine input), 1 (engine
 * output), 2 (capture). Peaks and spectra are linear.
 */
enum VXDspData {
    /* Meters: largest magnitude of each channel since the last read. out: i32 count, count x f32. Reading empties the meter. */
    VXDSP_DATA_METER_RECORD = -1, /* the capture side, behind its filters and measurements; at most 4 channels */
    VXDSP_DATA_METER_INPUT = -2,  /* ahead of the engine */
    VXDSP_DATA_METER_OUTPUT = -3, /* behind the engine */

    /* in: u8 analyser, u8 on. Switches a feed; off also clears what the analyser holds. Analysers come up off after each format. */
    VXDSP_DATA_RTA_ENABLE = -7,
    /* in: u8 choice. What analysers 1 and 2 listen to: channel 0, channel 1, or the mean of all from 2 on. */
    VXDSP_DATA_RTA_CHANNEL = -8,
    /*
     * in: u8 analyser, u8 ignored, u8 integrate, u32 fftSize, i32 bandsPerOctave; the last three as for VXDSPAPI_RTA_CalcSpectrum.
     * out: u64 address of the bands, u8 0. Analyses the newest fftSize / 2 samples; fftSize is a power of two, at most twice the
     * rate. The bands are the analyser's own f32 values, one less than the table has edges; the next readout overwrites them. One
     * reader for each analyser.
     */
    VXDSP_DATA_RTA_READ = -9,

    /* Share of real time, in percent, that a block function took. out: f32. Worked out anew after a quarter of a second of audio.
     */
    VXDSP_DATA_LOAD_PROCESS = -10,
    VXDSP_DATA_LOAD_RECORD = -11,

    /* in: i32, i32. Reads both and does nothing with them. */
    VXDSP_DATA_IGNORED_PAIR = -12,

    /* Test signals on all channels, ahead of the engine. in: u8 on. White noise goes before pink, pink before the sine. */
    VXDSP_DATA_WHITE_NOISE = -13, /* between 0 and 2, with a mean of 1 */
    VXDSP_DATA_PINK_NOISE = -14,
    /* in: u8 on, u16 frequency in Hz, 0 for what is set. A sine of full scale, on the first four channels. */
    VXDSP_DATA_SINE = -15,

    /*
     * in: u8 on, u8 channel, u16 start, u16 stop (Hz), u16 sweepTime, u16 preDelay, u16 postDelay (ms), u16 bandsPerOctave. Arms
     * one channel's sweep, which measures distortion by itself while blocks run on both sides, or stops it. Start has to be above 0
     * and below stop, and sweepTime above 0, also to stop. The search for the sweep on the capture side wants more than sixfold
     * growth within 10 ms: on a clean chain it finds lead-in tones of a half length below about 64 ms, which is a preDelay below
     * about 128 ms.
     */
    VXDSP_DATA_SWEEP_START = -17,
    /*
     * in: u8 n, then n times: u8 ring, u8 k, k x u64 address of a sample buffer, u64 address of k u8 flags, u8 oneShot. Programs
     * the rings of capture channels 0 to 3; a ring from 4 on, or a k from 8 on, ends the list. Buffers and flags are the caller's
     * until VXDSP_DATA_CAPTURE_STOP.
     */
    VXDSP_DATA_CAPTURE_ARM = -18,
    /* Forgets the capture rings. */
    VXDSP_DATA_CAPTURE_STOP = -19,
    /*
     * in: u8 channel. out: i32 points, i32 index, u64 address. The sweep's results so far: f32 ratios of what is not the
     * fundamental, one a band of the table, of which those below index are final, and those from the sweep's first band on
     * measured; 1.0 stands for "not measured". A sweep that has come to its end leaves index at points - 1.
     */
    VXDSP_DATA_SWEEP_RESULT = -20,

    /* in: u8 on, u8 channel, u8 ignored, u16 halfLength in ms. Plays one channel's polarity tone and listens for it. */
    VXDSP_DATA_POLARITY_START = -21,
    /* in: u8 channel. out: i32, -1 for a chain that keeps the polarity, +1 for one that inverts it, 0 while it is unknown. */
    VXDSP_DATA_POLARITY_RESULT = -22,

    /* out: u8, nonzero while the iSST module is in use. */
    VXDSP_DATA_ISST_LOADED = -26,
    /* Versions: out: u64 of four 16-bit parts, major highest. */
    VXDSP_DATA_MODULE_VERSION = -27, /* of this library */
    VXDSP_DATA_APO_VERSION = -28,    /* of the installed copy */
    /* out: u8. 0: no iSST module; 1: some enabled component runs in the main engine; 2: all enabled ones run on the module. */
    VXDSP_DATA_ISST_STATE = -29
};

/*
 * Runs a diagnostic command, or exchanges data with the engines. The ids of VXDspData are the host's; all others, which are those
 * from 0 on, those below -29, and -4, -5, -6, -16, -23, -24 and -25, go to the engine and then to the iSST module, if it is loaded.
 * componentId: the engine's; the host's commands do not look at it. input: inputSize bytes, or null for none. output: room for all
 * that the command writes, at most 36 bytes for the host's own; may be null for commands that write nothing. Addresses in the
 * streams are those of this process.
 * Returns the bytes written to output, or the engine's result, of which the module's goes last.
 * A command of the host's returns 0 and changes nothing if its input is shorter than what it reads, if a channel or analyser number
 * is too high, if an fftSize is no power of two or more than twice the rate, if memory is short, and if a sweep's values are none.
 * [control] May come while blocks run, from several threads.
 */
VXCOMN_API uint32_t VXDSPAPI_ReadWriteData(VXHandle handle, uint32_t componentId, int32_t paramId, const uint8_t *input,
                                           int32_t inputSize, uint8_t *output);

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

/*
 * Tells an audio endpoint's I/O configuration by its properties. Needs no handle.
 * trace: a logger that gets the steps, or null. properties: the endpoint's property store; only its GetValue is called. Null counts
 * as a store that holds nothing.
 * Returns the name ("AnyOutput", "Headphones", ...), which is the library's and lives as long as it; null if the store has no form
 * factor. [any]
 */
VXCOMN_API const VXWCHAR *VXDSPAPI_DevicePropsToIOConfig(struct CTraceFuncCallTarget *trace, IPropertyStore *properties);

/*
 * Tells an audio endpoint's index by its properties: that of the product's own property, else that of the jack's type.
 * trace, properties: as above. index: receives the index, -1 (all bits set) if there is none; may be null.
 * Returns the name of the node type, which is the library's; "KSNODETYPE_UNKNOWN" if the store tells none. [any]
 */
VXCOMN_API const VXWCHAR *VXDSPAPI_DevicePropsToEndpointIndex(struct CTraceFuncCallTarget *trace, IPropertyStore *properties,
                                                              uint32_t *index);

VXCOMN_EXTERN_C_END

#endif
