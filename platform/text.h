// SPDX-License-Identifier: MIT
//
// Wide and narrow text. Narrow text is UTF-8, wide text is UTF-16 in units of VXWCHAR on both platforms. Conversions never fail:
// what is malformed becomes U+FFFD. Any thread; allocates.
#pragma once

#include <string>
#include <string_view>

#include "vxcomn/types.h"

namespace vxcomn {

using WideString = std::basic_string<VXWCHAR>;
using WideView = std::basic_string_view<VXWCHAR>;

WideString toWide(std::string_view utf8);
std::string toUtf8(WideView wide);

// Compares as the registry and the file system do: without regard to the case of letters. Letters are those of the Basic
// Multilingual Plane that have a simple one-to-one pair in Latin, Greek and Cyrillic.
bool equalIgnoringCase(WideView left, WideView right);

// Folds for such comparisons.
WideString foldCase(WideView text);

}  // namespace vxcomn
