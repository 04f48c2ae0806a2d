// SPDX-License-Identifier: MIT
#include "preset/preset_names.h"

#include "preset/read_log.h"

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

}  // namespace vxcomn
