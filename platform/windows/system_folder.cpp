// SPDX-License-Identifier: MIT
#include "platform/system_folder.h"

#include "platform/windows/sdk.h"

namespace vxcomn {

WideString windowsFolder() {
    VXWCHAR path[MAX_PATH];
    const UINT length = GetWindowsDirectoryW(path, MAX_PATH);
    return length < MAX_PATH ? WideString(path, length) : WideString();
}

uint16_t nativeArchitecture() noexcept {
    SYSTEM_INFO facts;
    GetNativeSystemInfo(&facts);
    return facts.wProcessorArchitecture;
}

bool runsUnderWow64() noexcept {
    BOOL answer = FALSE;
    return IsWow64Process(GetCurrentProcess(), &answer) && answer;
}

}  // namespace vxcomn
