// SPDX-License-Identifier: MIT
//
// The rows of the chain from the module's version down to the parameter key. A row's _Changing unlinks the row below, so that
// everything below a point of change is built anew; its _Changed computes what the row below needs and links it. Where a value is
// missing the chain stops.
#include "preset/chain_link.h"
#include "preset/forced_selection.h"

using namespace vxcomn;

void CAPOPresetFile::ModuleVersion_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("ModuleVersion_Changing"), ModuleVersion);
    unlink<&CAPOPresetFile::DeviceIDAndEndpointIndex_Changing, &CAPOPresetFile::DeviceIDAndEndpointIndex_Changed>(
        DeviceIDAndEndpointIndex);
}

void CAPOPresetFile::ModuleVersion_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("ModuleVersion_Changed"), ModuleVersion);
    if (ModuleVersion.get() == 0) return;
    link<&CAPOPresetFile::DeviceIDAndEndpointIndex_Changing, &CAPOPresetFile::DeviceIDAndEndpointIndex_Changed>(
        DeviceIDAndEndpointIndex);
}

void CAPOPresetFile::DeviceIDAndEndpointIndex_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("DeviceIDAndEndpointIndex_Changing"), DeviceIDAndEndpointIndex);
    unlink<&CAPOPresetFile::APOTypeStr_Changing, &CAPOPresetFile::APOTypeStr_Changed>(APOTypeStr);
}

void CAPOPresetFile::DeviceIDAndEndpointIndex_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("DeviceIDAndEndpointIndex_Changed"), DeviceIDAndEndpointIndex);
    if (DeviceIDAndEndpointIndex.get().empty()) return;
    link<&CAPOPresetFile::APOTypeStr_Changing, &CAPOPresetFile::APOTypeStr_Changed>(APOTypeStr);
}

void CAPOPresetFile::APOTypeStr_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("APOTypeStr_Changing"), APOTypeStr);
    unlink<&CAPOPresetFile::IOConfigName_Changing, &CAPOPresetFile::IOConfigName_Changed>(IOConfigName);
    Mutex.close();
}

void CAPOPresetFile::APOTypeStr_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("APOTypeStr_Changed"), APOTypeStr);
    const WideString type = APOTypeStr.get();
    if (type.empty()) return;
    const WideView mutexName = slotMutexName(type);
    log(VX_TEXT("Global mutex name = %s\n"), WideString(mutexName));
    Mutex.create(mutexName);
    const WideString key = configurationKey(DeviceIDAndEndpointIndex.get(), type);
    log(VX_TEXT("APOTypeRegKeyName = %s\n"), key);
    APOTypeRegKeyName.set(key);
    WideString name;
    if (const RegistryKey configuration = openConfiguration(key);
        configuration && readForcedIOConfig(configuration, name) == status::ok) {
        IOConfigName.set(name);
    }
    link<&CAPOPresetFile::IOConfigName_Changing, &CAPOPresetFile::IOConfigName_Changed>(IOConfigName);
}

void CAPOPresetFile::IOConfigName_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("IOConfigName_Changing"), IOConfigName);
    unlink<&CAPOPresetFile::ContentTypeName_Changing, &CAPOPresetFile::ContentTypeName_Changed>(ContentTypeName);
}

void CAPOPresetFile::IOConfigName_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("IOConfigName_Changed"), IOConfigName);
    if (IOConfigName.get().empty()) return;
    WideString content;
    if (const RegistryKey configuration = openConfiguration(APOTypeRegKeyName.get());
        configuration && configuration.readText(store_name::contentType, content) == RegistryRead::value) {
        ContentTypeName.set(content);
    }
    link<&CAPOPresetFile::ContentTypeName_Changing, &CAPOPresetFile::ContentTypeName_Changed>(ContentTypeName);
}

void CAPOPresetFile::ContentTypeName_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("ContentTypeName_Changing"), ContentTypeName);
    unlink<&CAPOPresetFile::UserProfileName_Changing, &CAPOPresetFile::UserProfileName_Changed>(UserProfileName);
}

void CAPOPresetFile::ContentTypeName_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("ContentTypeName_Changed"), ContentTypeName);
    if (ContentTypeName.get().empty()) return;
    findPreset();
    WideString profile;
    if (const RegistryKey configuration = openConfiguration(APOTypeRegKeyName.get());
        configuration && configuration.readText(store_name::userProfile, profile) == RegistryRead::value) {
        UserProfileName.set(profile);
    }
    link<&CAPOPresetFile::UserProfileName_Changing, &CAPOPresetFile::UserProfileName_Changed>(UserProfileName);
}

void CAPOPresetFile::UserProfileName_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("UserProfileName_Changing"), UserProfileName);
    unlink<&CAPOPresetFile::EngineConfig_Changing, &CAPOPresetFile::EngineConfig_Changed>(EngineConfig);
}

void CAPOPresetFile::UserProfileName_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("UserProfileName_Changed"), UserProfileName);
    if (UserProfileName.get().empty()) return;
    link<&CAPOPresetFile::EngineConfig_Changing, &CAPOPresetFile::EngineConfig_Changed>(EngineConfig);
}

void CAPOPresetFile::EngineConfig_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("EngineConfig_Changing"), EngineConfig);
    unlink<&CAPOPresetFile::EngineShortName_Changing, &CAPOPresetFile::EngineShortName_Changed>(EngineShortName);
}

void CAPOPresetFile::EngineConfig_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("EngineConfig_Changed"), EngineConfig);
    if (!engineConfigSet(EngineConfig.get())) return;
    link<&CAPOPresetFile::EngineShortName_Changing, &CAPOPresetFile::EngineShortName_Changed>(EngineShortName);
}

void CAPOPresetFile::EngineShortName_Changing() {
    const HandlerTrace trace(*this, VX_TEXT("EngineShortName_Changing"), EngineShortName);
}

// The last row: where the parameters lie, and that they are there.
void CAPOPresetFile::EngineShortName_Changed() {
    const HandlerTrace trace(*this, VX_TEXT("EngineShortName_Changed"), EngineShortName);
    const WideString engine = EngineShortName.get();
    if (engine.empty()) return;
    log(VX_TEXT("Updating parameter registry keys ...\n"));
    const WideString configuration = configurationKey(DeviceIDAndEndpointIndex.get(), APOTypeStr.get());
    const WideString ioConfig = IOConfigName.get(), profile = UserProfileName.get(), content = ContentTypeName.get();
    const WideString key = parameterKey({configuration, engine, ioConfig, profile, content}, ModuleVersion.get());
    log(VX_TEXT("Parameter registry key: %s\n"), key);
    const WideString muteKey = key + VX_TEXT("\\-1\\Data");
    log(VX_TEXT("Preset switch muting parameters registry key: %s\n"), muteKey);
    PresetSwitchMuteKey.set(muteKey);
    ParamRegKeyName.set(key);
    EnsureParametersAreInRegistry();
    log(VX_TEXT("Done.\n"));
}
