// SPDX-License-Identifier: MIT
//
// Where Windows lies and what the machine is: the facts that choose the folder of preset packages and of the installed module.
// GetWindowsDirectoryW, GetNativeSystemInfo and IsWow64Process, or their stand-ins. Control threads.
#pragma once

#include <cstdint>

#include "platform/text.h"

namespace vxcomn {

inline constexpr uint16_t kArchitectureX86 = 0;
inline constexpr uint16_t kArchitectureAmd64 = 9;

// Without a backslash at its end; "C:\Windows" on Linux.
WideString windowsFolder();

// The processor architecture of the machine itself, numbered as in winnt.h; AMD64 on Linux.
uint16_t nativeArchitecture() noexcept;

// Whether this is a 32-bit process on a 64-bit system; never on Linux.
bool runsUnderWow64() noexcept;

}  // namespace vxcomn
