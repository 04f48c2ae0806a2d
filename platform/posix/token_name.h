// SPDX-License-Identifier: MIT
//
// How the name of a named mutex becomes the name of its file in `tokens`.
#pragma once

#include <string>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// Letters, digits and -_.{} stay, all else becomes %XX, byte for byte of the UTF-8; what gets too long for a file name ends in a
// digest of the whole. The first character is never a dot. 3 (path not found) for a name with a further backslash, as on Windows;
// 87 for an empty one, one with a NUL, and one with nothing behind the prefix.
Status tokenFileName(WideView name, std::string &fileName);

}  // namespace vxcomn
