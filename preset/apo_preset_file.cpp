// SPDX-License-Identifier: MIT
#include "preset/apo_preset_file.h"

#include "preset/chain_link.h"
#include "preset/module_version.h"

using namespace vxcomn;

CAPOPresetFile::CAPOPresetFile() : Mutex(*this) {
    UserProfileName.set(kDefaultUserProfile);
    ContentTypeName.set(kDefaultContentType);
    ResetLastParamTime();
    link<&CAPOPresetFile::DevicePropertyStore_Changing, &CAPOPresetFile::DevicePropertyStore_Changed>(DevicePropertyStore);
    ModuleVersion.addChanging(handlerOf<&CAPOPresetFile::ModuleVersion_Changing>(this));
    ModuleVersion.addChanged(handlerOf<&CAPOPresetFile::ModuleVersion_Changed>(this));
}

CAPOPresetFile::~CAPOPresetFile() {
    StopUpdateThread();
}

void CAPOPresetFile::OnConfigurationPolled(const RegistryKey &, bool) {}
void CAPOPresetFile::OnParametersPolled(bool) {}
void CAPOPresetFile::OnGradualMute() {}

void CAPOPresetFile::InitializeAPOPresetFile() {
    log(VX_TEXT("Retrieving module version ...\n"));
    const uint64_t version = GetAPOModuleVersion(*this, systemFacts(), nullptr);
    ModuleVersion.set(version);
    for (int part = 0; part < 4; ++part) VersionBytes[part] = static_cast<uint8_t>(versionPart(version, part));
    log(VX_TEXT("APO module version = { %i, %i, %i, %i }.\n"), versionPart(version, 0), versionPart(version, 1),
        versionPart(version, 2), versionPart(version, 3));
    log(VX_TEXT("Done.\n"));
}
