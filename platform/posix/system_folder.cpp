// SPDX-License-Identifier: MIT
#include "platform/system_folder.h"

namespace vxcomn {

WideString windowsFolder() {
    return VX_TEXT("C:\\Windows");
}

uint16_t nativeArchitecture() noexcept {
    return kArchitectureAmd64;
}

bool runsUnderWow64() noexcept {
    return false;
}

}  // namespace vxcomn
