// SPDX-License-Identifier: MIT
//
// What follows from the choice of a slot: the direct line to the effect module, what the preset says about sliders, and a store
// that fits the preset. A preset that is not the one that the store was filled from replaces everything but the seventeen settings
// of the user, which are read before and written back behind it.
#include <algorithm>
#include <cstring>

#include "control/endpoint_context.h"
#include "control/last_error.h"
#include "control/preset_tables.h"
#include "control/user_parameters.h"
#include "platform/security.h"
#include "preset/parameter_store.h"

using namespace vxcomn;

namespace {

constexpr float kUnread = -1.0F;

// Which of its parts the effect module is to be; 0 for a slot that is none.
int32_t moduleKind(int32_t type) noexcept {
    switch (static_cast<ApoType>(type)) {
        case ApoType::efx:
            return 3;
        case ApoType::mfx:
        case ApoType::gfx:
            return 2;
        case ApoType::sfx:
        case ApoType::lfx:
            return 1;
        default:
            return 0;
    }
}

}  // namespace

void VXAPOCOMAPI_EndpointContext::APOType_Changed() {
    using Self = VXAPOCOMAPI_EndpointContext;
    const int32_t type = APOType.get();
    if (type == 0) return;
    initializeApo(type);
    const std::lock_guard guard(stateLock());
    PresetFilePath.addChanging(handlerOf<&Self::PresetFilePath_Changing>(this));
    PresetFilePath.addChanged(handlerOf<&Self::PresetFilePath_Changed>(this));
    PresetFilePath_Changed();
    ParamRegKeyName.addChanging(handlerOf<&Self::ParamRegKeyName_Changing>(this));
    ParamRegKeyName.addChanged(handlerOf<&Self::ParamRegKeyName_Changed>(this));
    ParamRegKeyName_Changed();
}

void VXAPOCOMAPI_EndpointContext::APOType_Changing() {
    using Self = VXAPOCOMAPI_EndpointContext;
    if (APOType.get() == 0) return;
    const std::lock_guard guard(stateLock());
    PresetFilePath.removeChanging(handlerOf<&Self::PresetFilePath_Changing>(this));
    PresetFilePath.removeChanged(handlerOf<&Self::PresetFilePath_Changed>(this));
    ParamRegKeyName.removeChanging(handlerOf<&Self::ParamRegKeyName_Changing>(this));
    ParamRegKeyName.removeChanged(handlerOf<&Self::ParamRegKeyName_Changed>(this));
    if (ApoHandle != nullptr && ApoFree != nullptr) {
        ApoFree(ApoHandle);
        ApoHandle = nullptr;
    }
}

void VXAPOCOMAPI_EndpointContext::initializeApo(int32_t type) {
    if (ApoInitialize == nullptr || HostsAPO == 0) return;
    const GUID guid = EndpointGuid.get();
    HRESULT result = E_INVALIDARG;
    if (const int32_t kind = moduleKind(type); kind != 0) {
        const WideString guidText = EndpointGuidText.get();
        const ComRef<IPropertyStore> properties = DevicePropertyStore.get();
        result = ApoInitialize(kind, &ApoHandle, guidText.c_str(), &guid, properties.get(), HardwareOnly);
    } else {
        log(VX_TEXT("APOType contains unknown value %i\n"), type);
    }
    if (FAILED(result)) {
        log(VX_TEXT("Failed to initialize VXAPOAPI for endpoint: "
                    "{%08lX-%04hX-%04hX-%02hhX%02hhX-%02hhX%02hhX%02hhX%02hhX%02hhX%02hhX} with error code %i\n"),
            guid.Data1, guid.Data2, guid.Data3, guid.Data4[0], guid.Data4[1], guid.Data4[2], guid.Data4[3], guid.Data4[4],
            guid.Data4[5], guid.Data4[6], guid.Data4[7], result);
    }
}

void VXAPOCOMAPI_EndpointContext::PresetFilePath_Changed() {
    const WideString path = PresetFilePath.get();
    if (path.empty()) return;
    BypassAllInPreset = 0;
    log(VX_TEXT("Opening preset file: %s ...\n"), path);
    PresetTables tables(*this);
    LoadPreset(LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS, &tables);
}

// The consistency check.
void VXAPOCOMAPI_EndpointContext::ParamRegKeyName_Changed() {
    const WideString path = ParamRegKeyName.get();
    if (path.empty()) return;
    log(VX_TEXT("Accessing parameters' registry key: %s ...\n"), path);
    RegistryKey key;
    if (RegistryKey::create(RegistryRoot::localMachine, path, RegistryAccess::read, key, nullptr, &registrySecurity()) !=
        status::ok) {
        log(VX_TEXT("Couldn't access parameters' registry key\n"));
        return;
    }
    log(VX_TEXT("Checking if the parameters in the registry correspond to the preset file...\n"));
    if (storeFitsPreset(key)) {
        log(VX_TEXT("Parameters are consistent with the preset file.\n"));
        return;
    }
    key.close();
    resetKeepingSettings();
}

// Where the property graph finds a store that doesn't fit by itself: a key that comes up while the preset is opened for the first
// time does so before the slot has its subscriber for it, and one that it comes back to doesn't move.
void VXAPOCOMAPI_EndpointContext::reseed() {
    if (storeHoldsSettings()) {
        resetKeepingSettings();
    } else {
        ResetParameters(false, false);
    }
}

bool VXAPOCOMAPI_EndpointContext::storeFitsPreset(const RegistryKey &key) const {
    std::vector<uint8_t> stored;
    return key.readBytes(store_name::presetHash, stored, sizeof PresetHash) == RegistryRead::value &&
           stored.size() == sizeof PresetHash && std::memcmp(stored.data(), PresetHash.data(), sizeof PresetHash) == 0;
}

bool VXAPOCOMAPI_EndpointContext::storeHoldsSetting(const WideString &key, const UserParameter &parameter) const {
    uint8_t value[kLargestUserParameter];
    uint32_t size = parameter.bytes;
    return ReadParameterValue(key, parameter.component, parameter.param, value, size, nullptr, nullptr) == status::ok;
}

bool VXAPOCOMAPI_EndpointContext::storeHoldsSettings() const {
    const WideString engine = EngineShortName.get();
    const WideString key = ParamRegKeyName.get();
    for (int32_t id = 0; id < kUserParameterCount; ++id) {
        const UserParameter *const parameter = findUserParameter(engine, static_cast<uint32_t>(id));
        if (parameter != nullptr && storeHoldsSetting(key, *parameter)) return true;
    }
    return false;
}

// Settings that the store doesn't hold aren't asked for: asking would fill it from the preset and cost those that are still to be
// read.
VXAPOCOMAPI_EndpointContext::UserSettings VXAPOCOMAPI_EndpointContext::readUserSettings() {
    const WideString engine = EngineShortName.get();
    const WideString key = ParamRegKeyName.get();
    UserSettings settings;
    settings.fill(kUnread);
    for (int32_t id = 0; id < kUserParameterCount; ++id) {
        const UserParameter *const parameter = findUserParameter(engine, static_cast<uint32_t>(id));
        if (parameter == nullptr || !storeHoldsSetting(key, *parameter)) continue;
        settings[static_cast<size_t>(id)] = readUserParameter(*this, id);
    }
    return settings;
}

void VXAPOCOMAPI_EndpointContext::resetKeepingSettings() {
    log(VX_TEXT("Resetting parameters in the regsitry by reading them from the preset file...\n"));
    // No call of the client's, so no business of its last error.
    const int32_t lastError = ApiContext->LastError;
    const GlobalMutexLock slot(Mutex);
    // A key that comes up while the preset is opened does so ahead of the ranges that the settings are measured by.
    PresetTables tables(*this);
    LoadPreset(LOAD_PRESET_PARAMETERS, &tables);
    const UserSettings settings = readUserSettings();
    ResetParameters(false, false);
    for (int32_t id = 0; id < kUserParameterCount; ++id) {
        const float value = settings[static_cast<size_t>(id)];
        if (value != kUnread) setUserParameter(*this, static_cast<uint32_t>(id), value);
    }
    storeLastError(*ApiContext, lastError);
}
