// SPDX-License-Identifier: MIT
#include "preset/forced_selection.h"

#include "platform/security.h"
#include "preset/apo_preset_file.h"
#include "preset/endpoint_properties.h"
#include "preset/trace_read_log.h"

namespace vxcomn {
namespace {

// Empty if there is none.
WideString textOf(const RegistryKey &configuration, WideView name) {
    WideString text;
    configuration.readText(name, text);
    return text;
}

}  // namespace

RegistryKey openConfiguration(WideView keyPath) {
    RegistryKey key;
    if (!keyPath.empty()) RegistryKey::open(RegistryRoot::localMachine, keyPath, RegistryAccess::read, key);
    return key;
}

bool setterAlive(const RegistryKey &configuration, WideView setterValueName) {
    WideString mutex;
    return configuration.readText(setterValueName, mutex) == RegistryRead::value && NamedMutex::exists(mutex);
}

WideString readForcedEngineName(const RegistryKey &configuration) {
    return setterAlive(configuration, store_name::engineSetter) ? textOf(configuration, store_name::engineName) : WideString();
}

EngineConfig readForcedEngineConfig(const RegistryKey &configuration) {
    std::vector<uint8_t> bytes;
    if (!setterAlive(configuration, store_name::engineSetter) ||
        configuration.readBytes(store_name::engineConfig, bytes, sizeof(EngineConfig)) != RegistryRead::value)
        return {};
    EngineConfig config = engineConfigFromBytes(bytes);
    config.Size = static_cast<uint32_t>(bytes.size());
    return config;
}

Status readForcedIOConfig(const RegistryKey &configuration, WideString &name) {
    name.clear();
    if (!setterAlive(configuration, store_name::ioConfigSetter)) return kSetterGone;
    return configuration.readText(store_name::ioConfig, name) == RegistryRead::value ? status::ok : status::fileNotFound;
}

WideString readUserProfile(const RegistryKey &configuration) {
    return textOf(configuration, store_name::userProfile);
}

WideString readContentType(const RegistryKey &configuration) {
    return textOf(configuration, store_name::contentType);
}

}  // namespace vxcomn

using namespace vxcomn;

void CAPOPresetFile::UpdateIOConfig(bool GraduallyMute) {
    const WideString key = APOTypeRegKeyName.get();
    WideString name;
    if (const RegistryKey configuration = openConfiguration(key);
        configuration && readForcedIOConfig(configuration, name) == status::ok && !name.empty()) {
        return adopt(IOConfigName, name, VX_TEXT("CAPOPresetFile::UpdateIOConfig"), VX_TEXT("Forced IOConfigName = %s\n"));
    }
    const ComRef<IPropertyStore> store = DevicePropertyStore.get();
    StorePropertyReader properties(store.get());
    TraceReadLog readLog(this);
    const VXWCHAR *const derived = devicePropsToIOConfig(properties, &readLog);
    if (derived == nullptr) {
        const TraceScope scope(TraceTarget, VX_TEXT("CAPOPresetFile::UpdateIOConfig"));
        log(VX_TEXT("Couldn't retrieve I/O Config\n"));
        return;
    }
    if (IOConfigName.get() == derived) return;
    const TraceScope scope(TraceTarget, VX_TEXT("CAPOPresetFile::UpdateIOConfig"));
    log(VX_TEXT("Retrieved IOConfigName = %s, GraduallyMute = %i\n"), derived, GraduallyMute);
    const std::lock_guard guard(StateLock_);
    const GlobalMutexLock lock(Mutex);
    if (GraduallyMute) OnGradualMute();
    IOConfigName.set(derived);
    log(VX_TEXT("Resulting I/O config name = %s\n"), IOConfigName.get());
    if (!key.empty()) writeDerivedIOConfig(key, derived);
}

// Without a stamp: that a configuration was derived is no news for other processes, which derive it themselves.
void CAPOPresetFile::writeDerivedIOConfig(const WideString &keyPath, WideView name) {
    log(VX_TEXT("Writing I/O config name at HKLM\\%s\\IOConfig ...\n"), keyPath);
    RegistryKey key;
    Status status =
        RegistryKey::create(RegistryRoot::localMachine, keyPath, RegistryAccess::write, key, nullptr, &registrySecurity());
    if (status != status::ok) {
        log(VX_TEXT("Failed to create/open registry key HKLM\\%s to write IOConfig with error code 0x%X\n"), keyPath, status);
        return;
    }
    status = key.setText(store_name::ioConfig, name);
    if (status != status::ok) {
        log(VX_TEXT("Failed to write I/O config name at HKLM\\%s\\IOConfig with error code 0x%X\n"), keyPath, status);
        return;
    }
    key.deleteValue(store_name::ioConfigSetter);
    log(VX_TEXT("Done.\n"));
}

// What is not forced keeps standing. A force that has gone gives the engine back to the preset.
void CAPOPresetFile::UpdateEngine() {
    WideString name;
    ::EngineConfig config = {};
    if (const RegistryKey configuration = openConfiguration(APOTypeRegKeyName.get())) {
        name = readForcedEngineName(configuration);
        config = readForcedEngineConfig(configuration);
    }
    const std::lock_guard guard(StateLock_);
    const bool nameForced = !name.empty(), configForced = engineConfigSet(config);
    if (!nameForced && !configForced) {
        if (EngineForced_) restorePresetEngine();
        return;
    }
    EngineForced_ = true;
    const bool nameMoves = nameForced && name != EngineShortName.get();
    const bool configMoves = configForced && !sameEngineConfig(config, EngineConfig.get());
    if (!nameMoves && !configMoves) return;
    log(VX_TEXT("Forced EngineName = %s\n"), name);
    if (!nameForced) name = EngineShortName.get();
    if (!configForced) config = EngineConfig.get();
    EngineConfig.set({});
    EngineShortName.set({});
    EngineShortName.set(name);
    EngineConfig.set(config);
}

void CAPOPresetFile::restorePresetEngine() {
    EngineForced_ = false;
    if (!PresetFilePath.get().empty()) {
        LoadPreset(LOAD_PRESET_ENGINE, nullptr);
    } else if (!EngineLocked.get()) {
        EngineConfig.set({});
        EngineShortName.set({});
    }
}

void CAPOPresetFile::UpdateUserProfile() {
    const RegistryKey configuration = openConfiguration(APOTypeRegKeyName.get());
    if (!configuration) return;
    adopt(UserProfileName, readUserProfile(configuration), VX_TEXT("CAPOPresetFile::UpdateUserProfile"),
          VX_TEXT("Forced UserProfileName = %s\n"));
}

void CAPOPresetFile::UpdateContentType() {
    const RegistryKey configuration = openConfiguration(APOTypeRegKeyName.get());
    if (!configuration) return;
    adopt(ContentTypeName, readContentType(configuration), VX_TEXT("CAPOPresetFile::UpdateContentType"),
          VX_TEXT("Forced ContentTypeName = %s\n"));
}

void CAPOPresetFile::adopt(Text &property, const WideString &value, const VXWCHAR *traceName, const VXWCHAR *format) {
    if (value.empty()) return;
    const std::lock_guard guard(StateLock_);
    if (property.get() == value) return;
    const TraceScope scope(TraceTarget, traceName);
    log(format, value);
    property.set(value);
}
