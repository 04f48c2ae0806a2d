/* SPDX-License-Identifier: MIT
 *
 * VXAPOCOMAPI: the control API. A control application finds the audio endpoints that the product serves, opens one, chooses one of
 * its effect slots and then selects engines and configurations, moves sliders, and is told what others changed. Compiles as C11 and
 * C++17 by itself.
 *
 * What holds for all functions:
 *  1. Nothing raises. A result of 1 is success and 0 failure, unless said otherwise.
 *  2. There are two kinds of handle. An API handle is one client's use of the library; an endpoint handle is one endpoint, opened
 *     through an API handle, and ends with it at the latest. Any other address is a bad handle: the call does nothing, leaves the
 *     errors as they were and gives 0 (null, or -1.0 where the result is a float), unless said otherwise.
 *  3. A call that succeeds stores 0 as its client's last error and as the process's; one that fails stores a VXAPOCOMAPI_ERROR in
 *     both, unless said otherwise.
 *  4. Narrow text is UTF-8 and copied by the call; endpoint ids are wide text. Pointers marked optional may be null.
 *  5. Functions that need an effect slot fail with VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET until VXAPOCOMAPI_SetAPOType has chosen one.
 *  6. Tags tell the thread: [control] any thread but those that process audio, one at a time for one handle's receive functions;
 *     [any] any thread at any time, while the handle lives.
 *
 * Each description says, in this order: effect; arguments; result; failures and what they leave; thread.
 */
#ifndef VXAPOCOMAPI_H
#define VXAPOCOMAPI_H

#include "vxcomn/com_types.h"
#include "vxcomn/engine.h"

VXCOMN_EXTERN_C_BEGIN

/* An API handle or an endpoint handle. */
typedef void *VXAPOHandle;

/* What a call leaves as last error. A client compares with the numbers. */
enum VXAPOCOMAPI_ERROR {
    VXAPOCOMAPI_ERROR_NONE = 0,
    VXAPOCOMAPI_ERROR_INVALID_APO_TYPE = -2,         /* no name of an effect slot */
    VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID = -3,     /* a user parameter that the engine doesn't have */
    VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE = -4,  /* a negative value, or one that reads back negative */
    VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET = -9,         /* VXAPOCOMAPI_SetAPOType comes first */
    VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED = -10, /* an equaliser band that the preset leaves out */
    VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND = -11,
    VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE = -15, /* it can't be opened, or the system lists no endpoints */
    VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE = -16,
    VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE = -256 /* VXAPOCOMAPI_GetWindowsLastError tells which */
};

/* The user parameters: what a control panel shows. Levels go from 0.0 to 1.0 over a range in dB that the preset may narrow. */
enum VXAPOCOMAPI_UserParameter {
    USER_PARAM_ID_POWER_ON = 0, /* 1.0 is on, everything else off; always set for all configurations */
    USER_PARAM_ID_BASS_LEVEL = 1,
    USER_PARAM_ID_DETAIL_LEVEL = 2,
    USER_PARAM_ID_VOICE_LEVEL = 3,
    USER_PARAM_ID_SURROUND_LEVEL = 4,
    USER_PARAM_ID_ENABLE_EQ = 5, /* 0.0 is off, everything else on */
    USER_PARAM_ID_EQ_BAND1_LEVEL = 6,
    USER_PARAM_ID_EQ_BAND2_LEVEL = 7,
    USER_PARAM_ID_EQ_BAND3_LEVEL = 8,
    USER_PARAM_ID_EQ_BAND4_LEVEL = 9,
    USER_PARAM_ID_EQ_BAND5_LEVEL = 10,
    USER_PARAM_ID_EQ_BAND6_LEVEL = 11,
    USER_PARAM_ID_EQ_BAND7_LEVEL = 12,
    USER_PARAM_ID_EQ_BAND8_LEVEL = 13,
    USER_PARAM_ID_EQ_BAND9_LEVEL = 14,
    USER_PARAM_ID_EQ_BAND10_LEVEL = 15,
    USER_PARAM_ID_BYPASS_ALL = 16, /* 0.0 is off, everything else on */

    VXAPOCOMAPI_IS_GLOBAL = 0x8000 /* added to an id: set it for every configuration of the slot */
};

/* The endpoint properties that are known by number. */
enum VXAPOCOMAPI_EndpointPropID {
    VXAPOCOMAPI_EndpointPropID_DeviceID = 0,      /* VT_BSTR */
    VXAPOCOMAPI_EndpointPropID_SSID = 1,          /* VT_BSTR */
    VXAPOCOMAPI_EndpointPropID_FriendlyName = 2,  /* as the endpoint's property store has it, normally VT_BSTR */
    VXAPOCOMAPI_EndpointPropID_EngineName = 3,    /* VT_BSTR */
    VXAPOCOMAPI_EndpointPropID_EndpointIndex = 4, /* VT_I4, -1 for none */
    VXAPOCOMAPI_EndpointPropID_EndpointState = 5, /* VT_I4, the system's DEVICE_STATE */
    VXAPOCOMAPI_EndpointPropID_PresetZipPath = 6, /* VT_BSTR */
    VXAPOCOMAPI_EndpointPropID_PresetFilePath = 7 /* VT_BSTR */
};

/* ---- Clients and errors ---- */

/*
 * Begins a client's use of the library: lists no endpoints yet, but listens for their changes from here on.
 * Returns the API handle, or null if the system's endpoints can't be reached; the errors stay as they were.
 * Initialises COM for the calling thread, for as long as that lives. [control]
 */
VXCOMN_API VXAPOHandle VXAPOCOMAPI_InitializeAPI(void);

/*
 * Ends a client's use: frees the endpoint handles that are left, takes back the engines and configurations that it set, and frees
 * the handle. No other call of this client may be under way.
 * Returns 1, or 0 for a bad handle. Errors stay as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_FreeAPI(VXAPOHandle apiHandle);

/*
 * The last error of the client that an API handle or an endpoint handle belongs to. A null or bad handle gives that of the process,
 * the last one of any client. [any]
 */
VXCOMN_API int32_t VXAPOCOMAPI_GetLastError(VXAPOHandle handle);

/* The same for the Windows error that went with the last VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE. [any] */
VXCOMN_API uint32_t VXAPOCOMAPI_GetWindowsLastError(VXAPOHandle handle);

/* Stores a code as the process's last error and, unless the handle is null or bad, as its client's. [any] */
VXCOMN_API void VXAPOCOMAPI_SetLastError(VXAPOHandle handle, int32_t code);

/* ---- Endpoints ---- */

/*
 * Lists the endpoints that the product's USB audio package serves.
 * count, ids: receive the list, which VXAPOCOMAPI_FreeEndpointIDs frees; an empty one is a success. captureFlag: 0 for render
 * endpoints, else capture. stateMask: the system's DEVICE_STATE bits. tag: optional; holds the tag of an earlier call, or 0. If no
 * endpoint's state has changed since, the result is 1 with a null list and a count of 0: the list of then still holds. Otherwise it
 * receives the new tag.
 * Returns 1, or 0: without an endpoint enumerator (VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE), or if the system's listing fails or
 * its last endpoint can't be read, which leaves the errors as they were, the list null and the count 0. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_GetEndpointIDs(VXAPOHandle apiHandle, uint32_t *count, VXWCHAR ***ids, int32_t captureFlag,
                                              uint32_t stateMask, uint64_t *tag);

/* Frees a list of endpoint ids. Returns 1, or 0 for a bad handle, and then frees nothing. [control] */
VXCOMN_API int32_t VXAPOCOMAPI_FreeEndpointIDs(VXAPOHandle apiHandle, uint32_t count, VXWCHAR **ids);

/*
 * Opens an endpoint. hardwareOnly: ignored, it is always 1. instanceId: optional, receives the identity that marks this handle's
 * changes, even if opening fails.
 * Returns the endpoint handle, or null with VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE. [control]
 */
VXCOMN_API VXAPOHandle VXAPOCOMAPI_GetEndpointEx(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t hardwareOnly,
                                                 GUID *instanceId);

/* The same without the identity. [control] */
VXCOMN_API VXAPOHandle VXAPOCOMAPI_GetEndpoint(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t hardwareOnly);

/*
 * The same, with the choices that the two above make for their callers. hardwareOnly: the endpoint's software side isn't used.
 * hostAPO: nonzero to talk to the effect module VXAPO64U.dll directly, if there is one. [control]
 */
VXCOMN_API VXAPOHandle _VXAPOCOMAPI_GetEndpoint(VXAPOHandle apiHandle, const VXWCHAR *endpointId, int32_t hardwareOnly,
                                                int32_t hostAPO, GUID *instanceId);

/*
 * Closes an endpoint: wakes a thread that is inside one of its receive functions and waits for it to leave.
 * Returns 1, or 0 for a bad handle. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_FreeEndpoint(VXAPOHandle epHandle);

/*
 * Begins a use and opens the first active or unplugged render endpoint that bears a product endpoint index.
 * Returns an endpoint handle on an API handle of its own, for VXAPOCOMAPI_Free, or null with
 * VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE, to be asked for with a null handle. [control]
 */
VXCOMN_API VXAPOHandle VXAPOCOMAPI_Initialize(int32_t endpointIndex);

/*
 * Begins a use and opens a render endpoint by its GUID. endpointId: only logged. endpointGuid: "{...}". hardwareOnly: only logged.
 * Returns as VXAPOCOMAPI_Initialize. [control]
 */
VXCOMN_API VXAPOHandle VXAPOCOMAPI_InitializeEx(const char *endpointId, const char *endpointGuid, int32_t hardwareOnly);

/* Closes the endpoint and then its API handle. Returns 1, or 0 for a bad handle, and then frees nothing. [control] */
VXCOMN_API int32_t VXAPOCOMAPI_Free(VXAPOHandle epHandle);

/*
 * Chooses the effect slot that the handle addresses: finds its preset and brings the parameter store into line with it, keeping the
 * user parameters if the preset is another one than the store was filled from.
 * name: "EFX", "MFX", "SFX", "GFX" or "LFX", exactly.
 * Returns 1, or 0 with VXAPOCOMAPI_ERROR_INVALID_APO_TYPE. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_SetAPOType(VXAPOHandle apoComHandle, const char *name);

/*
 * Reads a property of an endpoint. propertyGuid: null for one of VXAPOCOMAPI_EndpointPropID, else the first half of a property key
 * of the endpoint's store. propertyId: of the enumeration, or the key's second half. value: receives the value, which the caller
 * clears.
 * Returns 1 without a GUID, also on failure, so that VXAPOCOMAPI_GetLastError tells; with one, 1 or 0. Failure is
 * VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_GetEndpointPropertyValue(VXAPOHandle epHandle, const GUID *propertyGuid, uint32_t propertyId,
                                                        VARIANT *value);

/* ---- Selections ---- */

/*
 * Select what the slot runs, for all processes that serve it. An engine and a configuration last as long as this client; a profile
 * and a content type stay. Names are text; config: at most 524 bytes of the record count.
 * Return 1, or 0: VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET, with nothing changed; VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE if the registry
 * refuses a value, with what was written before it left standing. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_SetEngine(VXAPOHandle apoComHandle, const char *name, const EngineConfig *config);
VXCOMN_API int32_t VXAPOCOMAPI_SetIOConfig(VXAPOHandle apoComHandle, const char *name);
VXCOMN_API int32_t VXAPOCOMAPI_SetUserProfile(VXAPOHandle apoComHandle, const char *name);
VXCOMN_API int32_t VXAPOCOMAPI_SetContentType(VXAPOHandle apoComHandle, const char *name);

/*
 * Tell what is selected, after a look at what others selected. name: optional; room for 1024 bytes (engine and configuration) or
 * 512 (profile and content type). A longer name isn't delivered.
 * Return 1 if the client's last error is 0 afterwards, else 0. A selection that nobody has reported yet fails with
 * VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET before a slot is chosen, except for the configuration; one that is the same as at the last
 * call leaves the errors as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_GetEngine(VXAPOHandle apoComHandle, char *name);
VXCOMN_API int32_t VXAPOCOMAPI_GetIOConfig(VXAPOHandle apoComHandle, char *name);
VXCOMN_API int32_t VXAPOCOMAPI_GetUserProfile(VXAPOHandle apoComHandle, char *name);
VXCOMN_API int32_t VXAPOCOMAPI_GetContentType(VXAPOHandle apoComHandle, char *name);

/*
 * The component chain that an engine starts with; an unknown name gives that of "VXORLO". Needs no handle. The record lives as long
 * as the process and isn't to be freed. [any]
 */
VXCOMN_API const EngineConfig *VXAPOCOMAPI_GetEngineDefaultConfig(const char *name);

/* ---- Parameters ---- */

/*
 * Sets a user parameter. paramId: of VXAPOCOMAPI_UserParameter, with VXAPOCOMAPI_IS_GLOBAL if it is for every configuration.
 * value: from 0.0; there is no upper bound, and levels above 1.0 pass the range.
 * Returns 1, or 0: VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET, _INVALID_PARAMETER_VALUE, _INVALID_PARAMETER_ID, _PARAMETER_NOT_SUPPORTED,
 * each with nothing changed, or _WINDOWS_ERRORCODE; and 0 without a code when another call of this function is inside. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_SetUserParameter(VXAPOHandle apoComHandle, uint32_t paramId, float value);

/*
 * Reads a user parameter; a store that doesn't have it is filled from the preset first.
 * Returns the value, rounded to five decimals, or -1.0 with an error as above; and 0.0 without a code when another call of this
 * function is inside. [control]
 */
VXCOMN_API float VXAPOCOMAPI_GetUserParameter(VXAPOHandle apoComHandle, int32_t paramId);

/*
 * Writes a parameter of the engine to the store, as it stands. channel: the store keeps none. data: dataSize bytes. IsGlobal:
 * nonzero to write it for every configuration of the slot. isTransient: nonzero for a value that lapses with this client.
 * instanceId: optional, receives the identity that marks the change. time: optional, receives its stamp.
 * Returns 1 or 0; the errors stay as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_SetUserParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                                  const void *data, uint32_t dataSize, int32_t IsGlobal, int32_t isTransient,
                                                  GUID *instanceId, uint64_t *time);

/*
 * Reads a parameter of the engine; a store that doesn't have it is filled from the preset first. dataSize: the room in data before
 * the call, the value's size behind it. source, time: optional; receive who wrote it and when.
 * Returns 1 or 0; the errors stay as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_GetUserParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                                  void *data, uint32_t *dataSize, GUID *source, uint64_t *time);

/*
 * Takes one parameter (all parameters of the slot) back to the preset's. globally: nonzero for every configuration; a single
 * parameter doesn't look at it. Resetting all switches the power on.
 * Return 1, or 0: VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET or _WINDOWS_ERRORCODE. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_ResetUserParameter(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t globally);
VXCOMN_API int32_t VXAPOCOMAPI_ResetUserParameters(VXAPOHandle apoComHandle);
VXCOMN_API int32_t VXAPOCOMAPI_ResetUserParametersEx(VXAPOHandle apoComHandle, int32_t globally);

/* ---- Audio and notification ---- */

/*
 * Keeps a silent shared-mode stream open on the endpoint, so that the system has its effects loaded; or lets go of it.
 * Return 1 or 0; a failure to open leaves no code, and without a stream there is nothing to close, which is a success. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_ActivateEndpoint(VXAPOHandle apoComHandle);
VXCOMN_API int32_t VXAPOCOMAPI_DeactivateEndpoint(VXAPOHandle apoComHandle);

/*
 * Waits until somebody changes a selection of the slot. name: receives "EngineName", "EngineConfig", "IOConfig", "UserProfile" or
 * "ContentType". data, size: receive what stands selected as yet, in bytes, texts with their end; the getter above then takes the
 * new value over. timeoutMs: 0 looks once, 0xFFFFFFFF has no end. force: nonzero to read the store even if it is unchanged.
 * What is handed out lives until the next call. Returns 1 for a change, 0 for none. The errors stay as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_ReceiveConfigChange(VXAPOHandle apoComHandle, const VXWCHAR **name, const void **data,
                                                   uint32_t *size, uint32_t timeoutMs, int32_t force);

/*
 * Waits until somebody changes parameters. blob, size, count: receive the changes, weightiest first, as packed little-endian
 * records: 16 bytes source, u64 time, i32 component, i32 parameter, i32 channel, u32 size of the data, u8 nonzero for a transient
 * one, seven zeros, and then the data. timeoutMs, force: as above.
 * What is handed out lives until the next call. Returns 1 for changes, 0 for none. The errors stay as they were. [control]
 */
VXCOMN_API int32_t VXAPOCOMAPI_ReceiveParamChange(VXAPOHandle apoComHandle, const void **blob, uint32_t *size, uint32_t *count,
                                                  uint32_t timeoutMs, int32_t force);

/*
 * Wake the thread that waits in a receive function; it returns 0. If none waits, the next wait ends at once.
 * Return 1, or 0 for a bad handle. [any]
 */
VXCOMN_API int32_t VXAPOCOMAPI_CancelReceiveConfigChange(VXAPOHandle apoComHandle);
VXCOMN_API int32_t VXAPOCOMAPI_CancelReceiveParamChange(VXAPOHandle apoComHandle);

VXCOMN_EXTERN_C_END

/*
 * Two exports bear C++ names, decorated with their arguments. C binds them by the decorated form, where its compiler can say so.
 * These write as VXAPOCOMAPI_SetUserParameterEx does, without its check for a call inside another, and without a lock: for callers
 * that write from their own handlers. VXAPOCOMAPI_SetParameter isn't transient and tells neither identity nor stamp. [control]
 */
#ifdef __cplusplus
#define VXAPOCOMAPI_SYMBOL(common, windows, others)
#elif VXCOMN_SYSTEM_HAS_COM
#define VXAPOCOMAPI_SYMBOL(common, windows, others) __asm__(common windows)
#else
#define VXAPOCOMAPI_SYMBOL(common, windows, others) __asm__(common others)
#endif
#if defined(__cplusplus) || defined(__GNUC__)
VXCOMN_API int32_t VXAPOCOMAPI_SetParameter(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                            const void *data, uint32_t dataSize, int32_t IsGlobal)
    VXAPOCOMAPI_SYMBOL("_Z24VXAPOCOMAPI_SetParameterPviiiPKvji", "", "");
VXCOMN_API int32_t VXAPOCOMAPI_SetParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                              const void *data, uint32_t dataSize, int32_t IsGlobal, int32_t isTransient,
                                              GUID *instanceId, uint64_t *time)
    VXAPOCOMAPI_SYMBOL("_Z26VXAPOCOMAPI_SetParameterExPviiiPKvjii", "P5_GUIDPy", "P4GUIDPm");
#endif

#endif
