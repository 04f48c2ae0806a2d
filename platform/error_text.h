// SPDX-License-Identifier: MIT
//
// What the system says about one of its error numbers, for the log: FormatMessageW on Windows, a table of the numbers that the
// library meets elsewhere. Any thread; allocates.
#pragma once

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// Empty for a number that the system has no words for.
WideString errorText(Status error);

}  // namespace vxcomn
