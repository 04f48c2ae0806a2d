// SPDX-License-Identifier: MIT
#include "preset/package_discovery.h"

#include "platform/file.h"
#include "platform/system_folder.h"
#include "preset/preset_names.h"

namespace vxcomn {
namespace {

// As PathAppendW does for ordinary components.
WideString appended(WideString folder, const WideString &name) {
    if (folder.empty() || folder.back() != VX_TEXT('\\')) folder += VX_TEXT('\\');
    return folder + name;
}

}  // namespace

SystemFacts systemFacts() {
    return {windowsFolder(), nativeArchitecture(), runsUnderWow64()};
}

WideString packageFolder(const SystemFacts &facts) {
    const VXWCHAR *const native = facts.underWow64 ? VX_TEXT("Sysnative") : VX_TEXT("System32");
    return appended(facts.windowsFolder, facts.nativeArchitecture == kArchitectureX86 ? VX_TEXT("SysWOW64") : native);
}

WideString findPresetPackage(const WideString &deviceId, const SystemFacts &facts, ReadLog *log) {
    if (deviceId.empty()) {
        say(log, VX_TEXT("Device ID is empty.\n"));
        return {};
    }
    const WideString path = appended(packageFolder(facts), presetPackageName(deviceId));
    say(log, VX_TEXT("Checking for preset .zip package at "), path, VX_TEXT(" ...\n"));
    if (findFiles(path).empty()) {
        say(log, VX_TEXT("Preset zip file doesn't exist.\n"));
        return {};
    }
    say(log, VX_TEXT("PresetZipPath = "), path, VX_TEXT("\n"));
    return path;
}

}  // namespace vxcomn
