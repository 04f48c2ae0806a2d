// SPDX-License-Identifier: MIT
//
// The seventeen sliders and switches: from a value to what the store keeps, and back.
#include "control/user_parameters.h"

#include <algorithm>
#include <array>
#include <mutex>
#include <optional>

#include "VXAPOCOMAPI.h"
#include "control/export_call.h"
#include "control/handles.h"
#include "control/last_error.h"
#include "control/slot_call.h"
#include "platform/last_error.h"

namespace vxcomn {
namespace {

using Endpoint = VXAPOCOMAPI_EndpointContext;

constexpr float kNoValue = -1.0F;

// Of the levels, from id 1 on.
constexpr LevelRange Endpoint::*kLevelRanges[] = {&Endpoint::BassRange, &Endpoint::DetailRange, &Endpoint::VoiceRange,
                                                  &Endpoint::SurroundRange};

LevelRange rangeOf(Endpoint &endpoint, const UserParameter &parameter) {
    const std::lock_guard state(endpoint.stateLock());
    if (parameter.kind == UserParameterKind::band) return endpoint.EqRange;
    return endpoint.*kLevelRanges[parameter.id - 1];
}

// Logs a line with the parameter's name in it; a band's name has its number, from 1 on.
void logNamed(const Endpoint &endpoint, const VXWCHAR *before, const UserParameter &parameter, const VXWCHAR *behind) {
    if (endpoint.TraceTarget->Enabled == 0) return;
    const WideString format = WideString(before) + VX_TEXT("USER_PARAM_ID_") + parameter.name + behind;
    if (parameter.kind == UserParameterKind::band) {
        endpoint.log(format.c_str(), static_cast<int32_t>(parameter.band()) + 1);
    } else {
        endpoint.log(format.c_str());
    }
}

struct StoredValue {
    std::array<uint8_t, kLargestUserParameter> bytes = {};

    template <size_t size>
    void take(const std::array<uint8_t, size> &from) {
        std::copy(from.begin(), from.end(), bytes.begin());
    }
};

// What the store is to keep; nothing for a band that the preset leaves out. Under the state lock.
std::optional<StoredValue> storedValue(Endpoint &endpoint, const UserParameter &parameter, float value) {
    StoredValue stored;
    switch (parameter.kind) {
        case UserParameterKind::power:
            stored.bytes[0] = value == 1.0F ? 1 : 0;
            break;
        case UserParameterKind::flag:
            stored.bytes[0] = value == 0.0F ? 0 : 1;
            break;
        case UserParameterKind::level:
            stored.take(floatBytes(gainOfSlider(rangeOf(endpoint, parameter), value)));
            break;
        case UserParameterKind::band: {
            const size_t band = parameter.band();
            if (endpoint.EqBandType[band] == 0) return std::nullopt;
            stored.take(bandBytes({endpoint.EqBandType[band], endpoint.EqBandFrequency[band], endpoint.EqBandQ[band],
                                   levelOfSlider(endpoint.EqRange, value)}));
            break;
        }
    }
    return stored;
}

int32_t write(Endpoint &endpoint, const UserParameter &parameter, bool isGlobal, float value) {
    VXAPOCOMAPI_APIContext &api = *endpoint.ApiContext;
    const bool isPower = parameter.kind == UserParameterKind::power;
    logNamed(endpoint, VX_TEXT("Setting "), parameter,
             isPower ? VX_TEXT(" parameter... (always global for backward compatibility)\n") : VX_TEXT(" parameter...\n"));
    const std::optional<StoredValue> stored = storedValue(endpoint, parameter, value);
    if (!stored) {
        logNamed(endpoint, VX_TEXT("VXAPOCOMAPI_SetUserParameter("), parameter,
                 VX_TEXT("): VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED, Exiting with -1\n"));
        storeLastError(api, VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED);
        return 0;
    }
    const ParameterWrite parameterWrite{.component = parameter.component,
                                        .param = parameter.param,
                                        .data = stored->bytes.data(),
                                        .size = parameter.bytes,
                                        .isGlobal = isGlobal || isPower};
    if (!writeParameter(endpoint, parameterWrite)) return failWithWindowsError(api, lastError());
    endpoint.log(VX_TEXT("Done.\n"));
    return succeed(endpoint);
}

// What the store keeps of a parameter. False, with the thread's last error, if it can't be read or has another size.
bool readStored(Endpoint &endpoint, const UserParameter &parameter, StoredValue &stored) {
    uint32_t size = parameter.bytes;
    if (!endpoint.GetParameter(parameter.component, parameter.param, kAllChannels, stored.bytes.data(), size, nullptr, nullptr)) {
        return false;
    }
    if (size == parameter.bytes) return true;
    setLastError(status::invalidData);
    return false;
}

// The slider of a level or band; nothing with the error stored if there is none.
std::optional<float> sliderOf(Endpoint &endpoint, const UserParameter &parameter, const StoredValue &stored) {
    VXAPOCOMAPI_APIContext &api = *endpoint.ApiContext;
    std::optional<float> slider;
    if (parameter.kind == UserParameterKind::band) {
        const BandRecord record = bandFromBytes(stored.bytes);
        {
            const std::lock_guard state(endpoint.stateLock());
            endpoint.EqBandType[parameter.band()] = record.filterType;
            endpoint.EqBandFrequency[parameter.band()] = record.frequency;
            endpoint.EqBandQ[parameter.band()] = record.q;
        }
        if (record.filterType == 0) {
            storeLastError(api, VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED);
            return std::nullopt;
        }
        slider = sliderOfLevel(rangeOf(endpoint, parameter), record.gainDb);
    } else {
        slider = sliderOfGain(rangeOf(endpoint, parameter), floatFromBytes(stored.bytes));
    }
    if (slider && *slider >= 0.0F) return slider;
    failWith(api, endpoint, VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
    endpoint.log(VX_TEXT("VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE, Exiting with -1\n"));
    return std::nullopt;
}

}  // namespace

float readUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, int32_t id) {
    VXAPOCOMAPI_APIContext &api = *endpoint.ApiContext;
    if (!hasSlot(endpoint)) {
        failWith(api, endpoint, VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
        endpoint.log(VX_TEXT("VXAPOCOMAPI_GetUserParameter: VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET, Exiting with -1\n"));
        return kNoValue;
    }
    const UserParameter *const parameter = findUserParameter(endpoint.EngineShortName.get(), static_cast<uint32_t>(id));
    if (parameter == nullptr) {
        failWith(api, endpoint, VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
        endpoint.log(VX_TEXT("VXAPOCOMAPI_GetUserParameter(%i): VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID, Exiting with -1\n"), id);
        return kNoValue;
    }
    StoredValue stored;
    if (!readStored(endpoint, *parameter, stored)) {
        failWithWindowsError(api, lastError());
        logNamed(endpoint, VX_TEXT("VXAPOCOMAPI_GetUserParameter("), *parameter,
                 VX_TEXT("): VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE, Exiting with -1\n"));
        return kNoValue;
    }
    std::optional<float> value;
    if (parameter->kind == UserParameterKind::power || parameter->kind == UserParameterKind::flag) {
        value = stored.bytes[0] != 0 ? 1.0F : 0.0F;
    } else {
        value = sliderOf(endpoint, *parameter, stored);
    }
    if (!value) return kNoValue;
    succeed(endpoint);
    return *value;
}

int32_t setUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, uint32_t id, float value) {
    const bool isGlobal = (id & VXAPOCOMAPI_IS_GLOBAL) != 0;
    id &= ~uint32_t{VXAPOCOMAPI_IS_GLOBAL};
    const TraceScope scope(endpoint.TraceTarget, VX_TEXT("VXAPOCOMAPI_SetUserParameter"),
                           handleArgument(&endpoint)
                               .number(VX_TEXT(", ParamId = "), static_cast<int32_t>(id))
                               .real(VX_TEXT(", Value = "), static_cast<double>(value))
                               .number(VX_TEXT(", IsGlobal = "), isGlobal ? 1 : 0));
    if (endpoint.InSetUserParameter != 0) {
        endpoint.log(VX_TEXT("Triggered re-entry check, exiting...\n"));
        return 0;
    }
    const std::lock_guard state(endpoint.stateLock());
    const GlobalMutexLock slot(endpoint.Mutex);
    const InsideCall inside(endpoint.InSetUserParameter);
    VXAPOCOMAPI_APIContext &api = *endpoint.ApiContext;
    if (!hasSlot(endpoint)) return failWith(api, endpoint, VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    // Written so that what is no number is refused as well.
    if (!(value >= 0.0F)) return failWith(api, endpoint, VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
    const UserParameter *const parameter = findUserParameter(endpoint.EngineShortName.get(), id);
    if (parameter == nullptr) return failWith(api, endpoint, VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
    return write(endpoint, *parameter, isGlobal, value);
}

float getUserParameter(VXAPOCOMAPI_EndpointContext &endpoint, int32_t id) {
    if (endpoint.InGetUserParameter != 0) {
        endpoint.log(VX_TEXT("Triggered re-entry check, exiting with 0\n"));
        return 0.0F;
    }
    const InsideCall inside(endpoint.InGetUserParameter);
    return readUserParameter(endpoint, id);
}

}  // namespace vxcomn

int32_t VXAPOCOMAPI_SetUserParameter(VXAPOHandle apoComHandle, uint32_t paramId, float value) {
    return vxcomn::guarded(0, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = vxcomn::findEndpoint(apoComHandle);
        return endpoint != nullptr ? vxcomn::setUserParameter(*endpoint, paramId, value) : 0;
    });
}

float VXAPOCOMAPI_GetUserParameter(VXAPOHandle apoComHandle, int32_t paramId) {
    return vxcomn::guarded(vxcomn::kNoValue, [&] {
        VXAPOCOMAPI_EndpointContext *const endpoint = vxcomn::findEndpoint(apoComHandle);
        return endpoint != nullptr ? vxcomn::getUserParameter(*endpoint, paramId) : vxcomn::kNoValue;
    });
}
