// SPDX-License-Identifier: MIT
//
// Where a device's preset package lies: the one question to the file system that comes before packages are opened. Control threads.
#pragma once

#include <cstdint>

#include "platform/text.h"
#include "preset/read_log.h"

namespace vxcomn {

// What chooses the folder of packages.
struct SystemFacts {
    WideString windowsFolder;
    uint16_t nativeArchitecture = 0;
    bool underWow64 = false;
};
SystemFacts systemFacts();

// The system folder that packages and the installed module lie in.
WideString packageFolder(const SystemFacts &facts);

// The path of the device's package, or nothing if there is none.
WideString findPresetPackage(const WideString &deviceId, const SystemFacts &facts, ReadLog *log);

}  // namespace vxcomn
