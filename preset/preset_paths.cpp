// SPDX-License-Identifier: MIT
#include "preset/preset_paths.h"

#include "platform/file.h"
#include "platform/system_folder.h"

namespace vxcomn {
namespace {

WideString join(const PresetKey &key, VXWCHAR separator) {
    WideString path;
    read_log::append(path, key.endpointIndex == -1 ? 0 : key.endpointIndex);
    for (const WideString *part : {&key.apoType, &key.ioConfig, &key.contentType}) {
        path += separator;
        path += *part;
    }
    path += separator;
    return path + VX_TEXT("Preset.bin");
}

// As PathAppendW does for ordinary components.
WideString appended(WideString folder, const WideString &name) {
    if (folder.empty() || folder.back() != VX_TEXT('\\')) folder += VX_TEXT('\\');
    return folder + name;
}

}  // namespace

WideString presetPackageName(const WideString &deviceId) {
    WideString name = VX_TEXT("VXAPODATU.") + deviceId + VX_TEXT(".zip");
    const size_t backslash = name.find(VX_TEXT('\\'));
    if (backslash != WideString::npos) name[backslash] = VX_TEXT('.');
    return name;
}

WideString packagePresetPath(const PresetKey &key) {
    return join(key, VX_TEXT('/'));
}

WideString loosePresetPath(const PresetKey &key) {
    return kLoosePresetRoot + join(key, VX_TEXT('\\'));
}

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
