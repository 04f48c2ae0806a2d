// SPDX-License-Identifier: MIT
//
// How packages and presets are named and where they lie. Pure functions over text, and the one question to the file system whether
// a package is there. Control threads.
#pragma once

#include <cstdint>

#include "platform/text.h"

namespace vxcomn {

// The loose presets' root. Kept: a literal; the folder is not asked of the system.
inline constexpr const VXWCHAR *kLoosePresetRoot = VX_TEXT("C:\\ProgramData\\Ondrevale\\APO\\");

// What chooses a preset on one endpoint. An endpoint index of -1 stands as 0 in paths.
struct PresetKey {
    int32_t endpointIndex = -1;
    WideString apoType;
    WideString ioConfig;
    WideString contentType;
};

// "VXAPODATU." + device id + ".zip", with the first backslash in it replaced by a full stop.
WideString presetPackageName(const WideString &deviceId);

// <endpointIndex>/<APOType>/<IOConfig>/<ContentType>/Preset.bin, what an entry's name holds behind its package index.
WideString packagePresetPath(const PresetKey &key);

// The same with backslashes, below kLoosePresetRoot.
WideString loosePresetPath(const PresetKey &key);

}  // namespace vxcomn
