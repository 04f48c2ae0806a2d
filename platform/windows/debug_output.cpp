// SPDX-License-Identifier: MIT
#include "platform/debug_output.h"

#include "platform/windows/sdk.h"

namespace vxcomn {

void debugOutput(const WideString &line) noexcept {
    OutputDebugStringW(line.c_str());
}

void debugOutput(const std::string &utf8Line) noexcept {
    OutputDebugStringA(utf8Line.c_str());
}

}  // namespace vxcomn
