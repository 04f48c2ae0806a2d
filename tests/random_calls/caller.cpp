// SPDX-License-Identifier: MIT
#include "tests/random_calls/caller.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>

#include "control/endpoint_context.h"
#include "platform/variant.h"
#include "tests/support/host_log.h"

namespace vxcomn::testing {

namespace {

// As many as a client may hold without slowing the run down.
constexpr size_t kMostApis = 3, kMostEndpoints = 6;

}  // namespace

RandomCaller::RandomCaller(const SampleMachine &machine, uint32_t seed) : machine_(machine), random_(seed), data_(70000) {
    names_ = {"",
              "VXORLO",
              "KZNOVA",
              "EFX",
              "MFX",
              "SFX",
              "GFX",
              "LFX",
              "AnyOutput",
              "AnyContent",
              "GlobalProfile",
              "sfx",
              "%s%n%i",
              "a\\b",
              "..\\..\\x",
              "\xFF\xC0",
              "caf\xC3\xA9",
              std::string(300, 'n'),
              std::string(1100, 'w')};
    foreign_.fill(kHandleSignature);
    SampleMachine::putPreset(orloPreset(), "EFX", "Headphones");
    SampleMachine::putPreset(novaraPreset(), "MFX");
    // Without an equaliser.
    SampleMachine::putPreset(orloPreset(SampleValues().add(-1, -2, {1}).add(5, 117, std::vector<uint8_t>(13))), "SFX");
}

RandomCaller::~RandomCaller() {
    for (VXAPOHandle api : apis_) VXAPOCOMAPI_FreeAPI(api);
}

const std::vector<RandomCaller::Weighted> &RandomCaller::actions() {
    using Self = RandomCaller;
    static const std::vector<Weighted> all = {
        {4, &Self::initializeApi},     {2, &Self::freeApi},          {12, &Self::openEndpoint},   {6, &Self::freeEndpoint},
        {1, &Self::initializeByIndex}, {1, &Self::initializeByGuid}, {1, &Self::freeBoth},        {8, &Self::setSlot},
        {20, &Self::listEndpoints},    {60, &Self::getProperty},     {700, &Self::getErrors},     {300, &Self::setError},
        {30, &Self::select},           {150, &Self::tellSelection},  {200, &Self::defaultConfig}, {250, &Self::setUser},
        {400, &Self::getUser},         {200, &Self::setRaw},         {250, &Self::getRaw},        {4, &Self::reset},
        {30, &Self::activate},         {150, &Self::receive},        {150, &Self::cancel},
    };
    return all;
}

void RandomCaller::step() {
    static const int total = [] {
        int sum = 0;
        for (const Weighted &each : actions()) sum += each.weight;
        return sum;
    }();
    auto place = static_cast<int>(below(static_cast<uint32_t>(total)));
    for (const Weighted &each : actions()) {
        place -= each.weight;
        if (place >= 0) continue;
        const int32_t before = VXAPOCOMAPI_GetLastError(nullptr);
        (this->*each.action)();
        const int32_t after = VXAPOCOMAPI_GetLastError(nullptr);
        if (each.action != &RandomCaller::setError && (after != before || after == 0)) codes_.insert(after);
        return;
    }
}

void RandomCaller::expect(bool right, const char *what) {
    if (!right) complaints_.emplace_back(what);
}

int32_t RandomCaller::someNumber() {
    switch (below(6)) {
        case 0:
            return static_cast<int32_t>(random_());
        case 1:
            return INT32_MIN;
        case 2:
            return -static_cast<int32_t>(below(70));
        default:
            return static_cast<int32_t>(below(130));
    }
}

float RandomCaller::someValue() {
    switch (below(8)) {
        case 0:
            return -static_cast<float>(below(1000)) / 100.0F;
        case 1:
            return std::numeric_limits<float>::quiet_NaN();
        case 2:
            return std::numeric_limits<float>::infinity();
        case 3:
            return static_cast<float>(random_());
        default:
            return static_cast<float>(below(100001)) / 100000.0F;
    }
}

const char *RandomCaller::someName() {
    return oneIn(10) ? nullptr : names_[below(static_cast<uint32_t>(names_.size()))].c_str();
}

VXAPOHandle RandomCaller::someApi() {
    return apis_.empty() || oneIn(10) ? someHandle() : apis_[below(static_cast<uint32_t>(apis_.size()))];
}

VXAPOHandle RandomCaller::someEndpoint() {
    return endpoints_.empty() || oneIn(10) ? someHandle() : endpoints_[below(static_cast<uint32_t>(endpoints_.size()))];
}

// Of any kind, and mostly none.
VXAPOHandle RandomCaller::someHandle() {
    const auto oneOf = [this](const std::vector<VXAPOHandle> &handles) {
        return handles.empty() ? nullptr : handles[below(static_cast<uint32_t>(handles.size()))];
    };
    switch (below(7)) {
        case 0:
            return nullptr;
        case 1:
            return oneOf(apis_);
        case 2:
            return oneOf(endpoints_);
        case 3:
            return oneOf(freed_);
        case 4:
            return foreign_.data() + below(32);
        case 5: {
            // A live one, a little beside.
            auto *const live = static_cast<uint8_t *>(oneOf(endpoints_));
            return live != nullptr ? live + 8 : nullptr;
        }
        default: {
            const uintptr_t wild = (uintptr_t{random_()} << 32) | random_();
            return reinterpret_cast<VXAPOHandle>(wild);  // NOLINT(performance-no-int-to-ptr)
        }
    }
}

void RandomCaller::forget(VXAPOHandle handle) {
    std::erase(apis_, handle);
    std::erase(endpoints_, handle);
    if (freed_.size() >= 50) freed_.erase(freed_.begin());
    freed_.push_back(handle);
}

void RandomCaller::initializeApi() {
    if (apis_.size() >= kMostApis) return freeApi();
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    expect(api != nullptr, "no API handle");
    if (api != nullptr) apis_.push_back(api);
}

void RandomCaller::freeApi() {
    VXAPOHandle const api = someApi();
    const bool lives = std::find(apis_.begin(), apis_.end(), api) != apis_.end();
    std::vector<VXAPOHandle> its;
    for (VXAPOHandle each : endpoints_) {
        if (lives && static_cast<VXAPOCOMAPI_EndpointContext *>(each)->ApiContext == api) its.push_back(each);
    }
    expect(VXAPOCOMAPI_FreeAPI(api) == (lives ? 1 : 0), "an API handle was freed that doesn't live, or the other way round");
    if (!lives) return;
    forget(api);
    for (VXAPOHandle each : its) forget(each);
}

void RandomCaller::openEndpoint() {
    if (endpoints_.size() >= kMostEndpoints) return freeEndpoint();
    const WideString nobody = toWide(names_[below(static_cast<uint32_t>(names_.size()))]);
    const VXWCHAR *const id = oneIn(8) ? nullptr : oneIn(8) ? nobody.c_str() : machine_.endpointId().c_str();
    GUID identity = {};
    VXAPOHandle const api = someApi();
    VXAPOHandle endpoint = nullptr;
    switch (below(3)) {
        case 0:
            endpoint = VXAPOCOMAPI_GetEndpoint(api, id, flag());
            break;
        case 1:
            endpoint = VXAPOCOMAPI_GetEndpointEx(api, id, flag(), orNull(identity));
            break;
        default:
            endpoint = _VXAPOCOMAPI_GetEndpoint(api, id, flag(), flag(), orNull(identity));
    }
    if (endpoint == nullptr) return;
    endpoints_.push_back(endpoint);
    if (!oneIn(4)) VXAPOCOMAPI_SetAPOType(endpoint, names_[3 + below(3)].c_str());
}

void RandomCaller::freeEndpoint() {
    VXAPOHandle const endpoint = someEndpoint();
    const bool lives = std::find(endpoints_.begin(), endpoints_.end(), endpoint) != endpoints_.end();
    expect(VXAPOCOMAPI_FreeEndpoint(endpoint) == (lives ? 1 : 0),
           "an endpoint was freed that doesn't live, or the other way round");
    if (lives) forget(endpoint);
}

// That the last endpoint couldn't be read is overwritten by the failure to open none; the log keeps it.
void RandomCaller::initializeByIndex() {
    const ControlLines log;
    bool &seen = indexFailureSeen_;
    std::optional<FlickeringEndpoint> flicker;
    if (!seen) flicker.emplace();
    for (int i = 0; i < (seen ? 1 : 20); ++i) {
        VXAPOHandle const endpoint = VXAPOCOMAPI_Initialize(oneIn(3) ? 7 : someNumber());
        if (endpoint != nullptr) expect(VXAPOCOMAPI_Free(endpoint) == 1, "what was initialised isn't freed");
    }
    seen = seen || log.has("Error: -11");
    if (seen) codes_.insert(VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND);
}

void RandomCaller::initializeByGuid() {
    const std::string id = toUtf8(machine_.endpointId());
    const std::string guid = id.substr(id.rfind('{'));
    const bool good = oneIn(2);
    VXAPOHandle const endpoint = VXAPOCOMAPI_InitializeEx(someName(), good ? guid.c_str() : someName(), flag());
    if (good) expect(endpoint != nullptr, "an endpoint isn't opened by its GUID");
    if (endpoint != nullptr) expect(VXAPOCOMAPI_Free(endpoint) == 1, "what was initialised isn't freed");
}

void RandomCaller::freeBoth() {
    // Of a live handle it would free the other endpoints of its client, too.
    VXAPOHandle const handle = someHandle();
    if (std::find(endpoints_.begin(), endpoints_.end(), handle) != endpoints_.end()) return;
    expect(VXAPOCOMAPI_Free(handle) == 0, "a bad handle is freed");
}

void RandomCaller::setSlot() {
    VXAPOCOMAPI_SetAPOType(someEndpoint(), someName());
}

void RandomCaller::listEndpoints() {
    uint32_t count = 0;
    VXWCHAR **ids = nullptr;
    uint64_t tag = below(4);
    VXAPOHandle const api = someApi();
    const uint32_t states = oneIn(3) ? static_cast<uint32_t>(random_()) : DEVICE_STATEMASK_ALL;
    if (VXAPOCOMAPI_GetEndpointIDs(api, orNull(count), orNull(ids), flag(), states, orNull(tag)) == 1 && ids != nullptr) {
        VXAPOCOMAPI_FreeEndpointIDs(api, count, ids);
    }
}

void RandomCaller::getProperty() {
    VARIANT value = {};
    const GUID guid = {static_cast<uint32_t>(random_()), 1, 2, {3, 4, 5, 6, 7, 8, 9, 10}};
    VXAPOCOMAPI_GetEndpointPropertyValue(someEndpoint(), oneIn(2) ? nullptr : &guid, oneIn(4) ? random_() : below(9),
                                         orNull(value));
    VariantClear(&value);
}

void RandomCaller::getErrors() {
    static const std::set<int32_t> known = {-256, -16, -15, -11, -10, -9, -4, -3, -2, 0};
    expect(known.count(VXAPOCOMAPI_GetLastError(someHandle())) == 1, "an error that is none");
    VXAPOCOMAPI_GetWindowsLastError(someEndpoint());
}

void RandomCaller::setError() {
    VXAPOCOMAPI_SetLastError(oneIn(2) ? someHandle() : someEndpoint(), oneIn(2) ? 0 : VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
}

void RandomCaller::select() {
    EngineConfig config = {static_cast<uint32_t>(oneIn(4) ? random_() : 8 * below(70)), 0, below(65), {}};
    VXAPOHandle const handle = someEndpoint();
    switch (below(4)) {
        case 0:
            VXAPOCOMAPI_SetEngine(handle, oneIn(2) ? "VXORLO" : someName(), orNull(config));
            break;
        case 1:
            VXAPOCOMAPI_SetIOConfig(handle, someName());
            break;
        case 2:
            VXAPOCOMAPI_SetUserProfile(handle, someName());
            break;
        default:
            VXAPOCOMAPI_SetContentType(handle, someName());
    }
}

void RandomCaller::tellSelection() {
    using Getter = int32_t (*)(VXAPOHandle, char *);
    const Getter getters[] = {VXAPOCOMAPI_GetEngine, VXAPOCOMAPI_GetIOConfig, VXAPOCOMAPI_GetUserProfile,
                              VXAPOCOMAPI_GetContentType};
    const uint32_t which = below(4);
    std::vector<char> exact(which < 2 ? 1024 : 512);
    getters[which](someEndpoint(), oneIn(5) ? nullptr : exact.data());
}

void RandomCaller::defaultConfig() {
    expect(VXAPOCOMAPI_GetEngineDefaultConfig(someName())->ComponentCount != 0, "an engine without components");
}

void RandomCaller::setUser() {
    const uint32_t id = oneIn(8) ? static_cast<uint32_t>(someNumber()) : below(18);
    VXAPOCOMAPI_SetUserParameter(someEndpoint(), oneIn(20) ? id | VXAPOCOMAPI_IS_GLOBAL : id, someValue());
}

void RandomCaller::getUser() {
    const float value = VXAPOCOMAPI_GetUserParameter(someEndpoint(), oneIn(8) ? someNumber() : static_cast<int32_t>(below(18)));
    expect(value == -1.0F || (value >= 0.0F && std::isfinite(value)), "a value that is none");
}

void RandomCaller::setRaw() {
    GUID identity = {};
    uint64_t time = 0;
    // Those of the user parameters now and then, with data of any size.
    const bool user = oneIn(3);
    const int32_t component = user ? static_cast<int32_t>(below(6)) : someNumber();
    const int32_t param = user ? (component == 5 ? 117 + static_cast<int32_t>(below(10)) : -12) : someNumber();
    const uint32_t size = oneIn(200) ? static_cast<uint32_t>(data_.size()) - below(10000) : below(20);
    for (uint32_t i = 0; i < std::min(size, 16U); ++i) data_[i] = static_cast<uint8_t>(oneIn(3) ? 0 : random_());
    const void *const data = oneIn(10) ? nullptr : data_.data();
    const int32_t global = oneIn(20) ? 1 : 0, transient = oneIn(4) ? 1 : 0;
    VXAPOHandle const handle = someEndpoint();
    switch (below(3)) {
        case 0:
            VXAPOCOMAPI_SetParameter(handle, component, param, someNumber(), data, size, global);
            break;
        case 1:
            VXAPOCOMAPI_SetParameterEx(handle, component, param, someNumber(), data, size, global, transient, orNull(identity),
                                       orNull(time));
            break;
        default:
            VXAPOCOMAPI_SetUserParameterEx(handle, component, param, someNumber(), data, size, global, transient, orNull(identity),
                                           orNull(time));
    }
}

void RandomCaller::getRaw() {
    GUID source = {};
    uint64_t time = 0;
    uint32_t size = oneIn(50) ? 65536 : below(30);
    std::vector<uint8_t> room(size);
    // Most of what is asked for is there; what isn't makes the store fill itself from the preset.
    const bool stored = !oneIn(50);
    const int32_t component = stored ? static_cast<int32_t>(below(4)) : someNumber(), param = stored ? -12 : someNumber();
    VXAPOCOMAPI_GetUserParameterEx(someEndpoint(), component, param, someNumber(), oneIn(20) ? nullptr : room.data(), orNull(size),
                                   orNull(source), orNull(time));
}

void RandomCaller::reset() {
    VXAPOHandle const handle = someEndpoint();
    switch (below(3)) {
        case 0:
            VXAPOCOMAPI_ResetUserParameter(handle, someNumber(), someNumber(), flag());
            break;
        case 1:
            VXAPOCOMAPI_ResetUserParametersEx(handle, flag());
            break;
        default:
            VXAPOCOMAPI_ResetUserParameters(handle);
    }
}

void RandomCaller::activate() {
    if (oneIn(2)) {
        VXAPOCOMAPI_ActivateEndpoint(someEndpoint());
    } else {
        VXAPOCOMAPI_DeactivateEndpoint(someEndpoint());
    }
}

void RandomCaller::receive() {
    const uint32_t time = oneIn(200) ? 1 : 0;
    VXAPOHandle const handle = someEndpoint();
    if (oneIn(2)) {
        const VXWCHAR *name = nullptr;
        const void *data = nullptr;
        uint32_t size = 0;
        if (VXAPOCOMAPI_ReceiveConfigChange(handle, orNull(name), orNull(data), orNull(size), time, oneIn(20) ? 1 : 0) == 1 &&
            name != nullptr) {
            expect(WideString(name).size() >= 8, "a notice without a name");
        }
        return;
    }
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    if (VXAPOCOMAPI_ReceiveParamChange(handle, &blob, &size, &count, time, oneIn(20) ? 1 : 0) == 1) {
        expect(count != 0 && size >= 48 * count && blob != nullptr, "a blob without records");
    }
}

void RandomCaller::cancel() {
    VXAPOHandle const handle = someEndpoint();
    expect(VXAPOCOMAPI_CancelReceiveParamChange(handle) == VXAPOCOMAPI_CancelReceiveConfigChange(handle), "cancels that disagree");
}

}  // namespace vxcomn::testing
