// SPDX-License-Identifier: MIT
//
// A line for whoever debugs. OutputDebugString on Windows. On Linux the environment variable VXCOMN_DEBUG_OUTPUT says where it
// goes: "stderr", or the name of a file that lines are appended to; nowhere when it is unset. It is looked at on every call.
// Any control thread; not for the block path.
#pragma once

#include <string>

#include "platform/text.h"

namespace vxcomn {

// Each call writes one line in one piece, so lines of several processes do not mix. A line feed at the end of the text is not
// doubled.
void debugOutput(const WideString &line) noexcept;
void debugOutput(const std::string &utf8Line) noexcept;

}  // namespace vxcomn
