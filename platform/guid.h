// SPDX-License-Identifier: MIT
//
// GUIDs: their text in braces, as StringFromCLSID and CLSIDFromString have it, and new ones. Any thread.
#pragma once

#include "platform/text.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

// "{XXXXXXXX-XXXX-XXXX-XXXX-XXXXXXXXXXXX}", in capitals.
WideString guidText(const GUID &guid);

// Reads such a text, in either case. False, and `guid` is all zeros, if the text is anything else.
bool parseGuidText(WideView text, GUID &guid) noexcept;

// A GUID that nobody has. False, and `guid` is all zeros, if the system has no random numbers to give.
bool newGuid(GUID &guid) noexcept;

}  // namespace vxcomn
