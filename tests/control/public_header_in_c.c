/* SPDX-License-Identifier: MIT
 *
 * A C program's view of the control API: every function is called once, with nothing behind the handle. The two with C++ names are
 * bound by their decorated symbols.
 */
#include "tests/control/public_header_in_c.h"

#include "VXAPOCOMAPI.h"

int32_t controlCallsInC(void *handle) {
    int32_t sum = 0;
    uint32_t count = 0, size = 0;
    uint64_t time = 0;
    VXWCHAR **ids = NULL;
    const VXWCHAR *name = NULL;
    const void *data = NULL;
    char text[1024];
    GUID guid;
    VARIANT value;
    EngineConfig config = *VXAPOCOMAPI_GetEngineDefaultConfig("VXORLO");
    sum += VXAPOCOMAPI_FreeAPI(handle);
    sum += VXAPOCOMAPI_GetEndpointIDs(handle, &count, &ids, 0, DEVICE_STATE_ACTIVE, &time);
    sum += VXAPOCOMAPI_FreeEndpointIDs(handle, 0, NULL);
    sum += VXAPOCOMAPI_GetEndpointEx(handle, NULL, 1, &guid) != NULL;
    sum += VXAPOCOMAPI_GetEndpoint(handle, NULL, 1) != NULL;
    sum += _VXAPOCOMAPI_GetEndpoint(handle, NULL, 1, 1, &guid) != NULL;
    sum += VXAPOCOMAPI_FreeEndpoint(handle);
    sum += VXAPOCOMAPI_Free(handle);
    sum += VXAPOCOMAPI_SetAPOType(handle, "EFX");
    sum += VXAPOCOMAPI_GetEndpointPropertyValue(handle, NULL, VXAPOCOMAPI_EndpointPropID_SSID, &value);
    sum += VXAPOCOMAPI_SetEngine(handle, "VXORLO", &config);
    sum += VXAPOCOMAPI_SetIOConfig(handle, "LineOut");
    sum += VXAPOCOMAPI_SetUserProfile(handle, "Mine");
    sum += VXAPOCOMAPI_SetContentType(handle, "Music");
    sum += VXAPOCOMAPI_GetEngine(handle, text);
    sum += VXAPOCOMAPI_GetIOConfig(handle, text);
    sum += VXAPOCOMAPI_GetUserProfile(handle, text);
    sum += VXAPOCOMAPI_GetContentType(handle, text);
    sum += VXAPOCOMAPI_SetUserParameter(handle, USER_PARAM_ID_VOICE_LEVEL | VXAPOCOMAPI_IS_GLOBAL, 0.5F);
    sum += VXAPOCOMAPI_GetUserParameter(handle, USER_PARAM_ID_VOICE_LEVEL) != -1.0F;
    sum += VXAPOCOMAPI_ResetUserParameter(handle, 0, 1, 0);
    sum += VXAPOCOMAPI_ResetUserParameters(handle);
    sum += VXAPOCOMAPI_ResetUserParametersEx(handle, 0);
    sum += VXAPOCOMAPI_ActivateEndpoint(handle);
    sum += VXAPOCOMAPI_DeactivateEndpoint(handle);
    sum += VXAPOCOMAPI_ReceiveConfigChange(handle, &name, &data, &size, 0, 0);
    sum += VXAPOCOMAPI_ReceiveParamChange(handle, &data, &size, &count, 0, 0);
    sum += VXAPOCOMAPI_CancelReceiveConfigChange(handle);
    sum += VXAPOCOMAPI_CancelReceiveParamChange(handle);
    sum += VXAPOCOMAPI_SetUserParameterEx(handle, 0, 1, 0, text, 1, 0, 0, &guid, &time);
    size = sizeof text;
    sum += VXAPOCOMAPI_GetUserParameterEx(handle, 0, 1, 0, text, &size, &guid, &time);
    sum += VXAPOCOMAPI_SetParameter(handle, 0, 1, 0, text, 1, 0);
    sum += VXAPOCOMAPI_SetParameterEx(handle, 0, 1, 0, text, 1, 0, 0, &guid, &time);
    return sum;
}

int32_t setParameterInC(void *handle, int32_t componentId, int32_t paramId, uint8_t value, uint64_t *time) {
    return VXAPOCOMAPI_SetParameter(handle, componentId, paramId, 0, &value, 1, 0) +
           VXAPOCOMAPI_SetParameterEx(handle, componentId, paramId + 1, 0, &value, 1, 0, 0, NULL, time);
}
