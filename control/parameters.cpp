// SPDX-License-Identifier: MIT
//
// The engine's parameters as they stand: written, read, and taken back to the preset's.
#include <algorithm>
#include <mutex>
#include <span>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "control/slot_call.h"
#include "control/user_parameters.h"
#include "platform/last_error.h"

namespace vxcomn {

using Endpoint = VXAPOCOMAPI_EndpointContext;

namespace {

bool writeBelow(const Endpoint &endpoint, const WideString &key, const ParameterWrite &write) {
    const std::span data(static_cast<const uint8_t *>(write.data), write.size);
    if (WriteParameter(endpoint.TraceTarget, key, write.component, write.param, write.channel, data,
                       {endpoint.InstanceGuid, endpoint.InstanceId}, write.isTransient, write.time)) {
        return true;
    }
    endpoint.log(VX_TEXT("Failed to set parameter with path %s\n"), key);
    return false;
}

int32_t setUserParameterEx(void *handle, const ParameterWrite &write) {
    Endpoint *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    const TraceScope scope(endpoint->TraceTarget, VX_TEXT("VXAPOCOMAPI_SetUserParameterEx"),
                           handleArgument(handle)
                               .number(VX_TEXT(", componentId = "), write.component)
                               .number(VX_TEXT(", paramId = "), write.param)
                               .number(VX_TEXT(", dataSize = "), write.size)
                               .number(VX_TEXT(", IsGlobal = "), write.isGlobal ? 1 : 0)
                               .number(VX_TEXT(", isTransient = "), write.isTransient ? 1 : 0));
    if (endpoint->InSetUserParameterEx != 0) {
        endpoint->log(VX_TEXT("Triggered re-entry check, exiting...\n"));
        return 0;
    }
    const std::lock_guard state(endpoint->stateLock());
    const GlobalMutexLock slot(endpoint->Mutex);
    const InsideCall inside(endpoint->InSetUserParameterEx);
    return writeParameter(*endpoint, write) ? 1 : 0;
}

int32_t getUserParameterEx(void *handle, int32_t component, int32_t param, int32_t channel, void *data, uint32_t *size,
                           GUID *source, uint64_t *time) {
    Endpoint *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr || size == nullptr || (data == nullptr && *size != 0)) return 0;
    const TraceScope scope(endpoint->TraceTarget, VX_TEXT("VXAPOCOMAPI_GetUserParameterEx"),
                           handleArgument(handle)
                               .number(VX_TEXT(", componentId = "), component)
                               .number(VX_TEXT(", paramId = "), param)
                               .number(VX_TEXT(", *dataSize = "), *size));
    if (endpoint->InGetUserParameterEx != 0) {
        endpoint->log(VX_TEXT("Triggered re-entry check, exiting...\n"));
        return 0;
    }
    const InsideCall inside(endpoint->InGetUserParameterEx);
    return endpoint->GetParameter(component, param, channel, static_cast<uint8_t *>(data), *size, source, time) ? 1 : 0;
}

// The frame of the resets. `reset` runs with both locks held.
template <class Reset>
int32_t callReset(void *handle, const VXWCHAR *traceName, const CallArguments &arguments, Reset &&reset) {
    Endpoint *const endpoint = findEndpoint(handle);
    if (endpoint == nullptr) return 0;
    const TraceScope scope(endpoint->TraceTarget, traceName, arguments);
    const std::lock_guard state(endpoint->stateLock());
    const GlobalMutexLock slot(endpoint->Mutex);
    if (!hasSlot(*endpoint)) return failWith(*endpoint->ApiContext, *endpoint, VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    if (!reset(*endpoint)) return failWithWindowsError(*endpoint->ApiContext, lastError());
    return succeed(*endpoint);
}

int32_t resetAll(void *handle, int32_t globally) {
    return callReset(handle, VX_TEXT("VXAPOCOMAPI_ResetUserParametersEx"),
                     handleArgument(handle).number(VX_TEXT(", Globally = "), globally), [globally](Endpoint &endpoint) {
                         const bool done = endpoint.ResetParameters(globally != 0, true);
                         // What the seeding left out: a reset leaves the effects on.
                         setUserParameter(endpoint, USER_PARAM_ID_POWER_ON, 1.0F);
                         return done;
                     });
}

}  // namespace

bool writeParameter(VXAPOCOMAPI_EndpointContext &endpoint, const ParameterWrite &write) {
    if (write.instanceId != nullptr) *write.instanceId = endpoint.InstanceGuid;
    const WideString key = endpoint.ParamRegKeyName.get();
    if (write.size > kLargestValueBytes || (write.data == nullptr && write.size != 0)) {
        setLastError(status::invalidParameter);
        endpoint.log(VX_TEXT("Failed to set parameter with path %s\n"), key);
        return false;
    }
    if (!write.isGlobal) return writeBelow(endpoint, key, write);
    std::vector<WideString> keys;
    endpoint.GetAllParamRegKeysForAPOType(endpoint.APOTypeStr.get(), keys);
    return std::all_of(keys.begin(), keys.end(), [&](const WideString &each) { return writeBelow(endpoint, each, write); });
}

}  // namespace vxcomn

int32_t VXAPOCOMAPI_SetParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                   const void *data, uint32_t dataSize, int32_t IsGlobal, int32_t isTransient, GUID *instanceId,
                                   uint64_t *time) {
    return vxcomn::guarded(0, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = vxcomn::findEndpoint(apoComHandle);
        if (endpoint == nullptr) return 0;
        return vxcomn::writeParameter(
                   *endpoint, {componentId, paramId, channel, data, dataSize, IsGlobal != 0, isTransient != 0, instanceId, time})
                   ? 1
                   : 0;
    });
}

int32_t VXAPOCOMAPI_SetParameter(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel, const void *data,
                                 uint32_t dataSize, int32_t IsGlobal) {
    return VXAPOCOMAPI_SetParameterEx(apoComHandle, componentId, paramId, channel, data, dataSize, IsGlobal, 0, nullptr, nullptr);
}

int32_t VXAPOCOMAPI_SetUserParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel,
                                       const void *data, uint32_t dataSize, int32_t IsGlobal, int32_t isTransient, GUID *instanceId,
                                       uint64_t *time) {
    return vxcomn::guarded(0, [&] {
        return vxcomn::setUserParameterEx(
            apoComHandle, {componentId, paramId, channel, data, dataSize, IsGlobal != 0, isTransient != 0, instanceId, time});
    });
}

int32_t VXAPOCOMAPI_GetUserParameterEx(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t channel, void *data,
                                       uint32_t *dataSize, GUID *source, uint64_t *time) {
    return vxcomn::guarded(
        0, [&] { return vxcomn::getUserParameterEx(apoComHandle, componentId, paramId, channel, data, dataSize, source, time); });
}

int32_t VXAPOCOMAPI_ResetUserParameter(VXAPOHandle apoComHandle, int32_t componentId, int32_t paramId, int32_t globally) {
    return vxcomn::guarded(0, [&] {
        return vxcomn::callReset(
            apoComHandle, VX_TEXT("VXAPOCOMAPI_ResetUserParameter"),
            vxcomn::handleArgument(apoComHandle)
                .number(VX_TEXT(", componentId = "), componentId)
                .number(VX_TEXT(", paramId = "), paramId)
                .number(VX_TEXT(", globally = "), globally),
            [&](VXAPOCOMAPI_EndpointContext &endpoint) { return endpoint.ResetParameter(componentId, paramId, globally != 0); });
    });
}

int32_t VXAPOCOMAPI_ResetUserParameters(VXAPOHandle apoComHandle) {
    return VXAPOCOMAPI_ResetUserParametersEx(apoComHandle, 1);
}

int32_t VXAPOCOMAPI_ResetUserParametersEx(VXAPOHandle apoComHandle, int32_t globally) {
    return vxcomn::guarded(0, [&] { return vxcomn::resetAll(apoComHandle, globally); });
}
