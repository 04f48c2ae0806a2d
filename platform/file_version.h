// SPDX-License-Identifier: MIT
//
// The version of a module file, as one number of four 16-bit parts, major highest (2.1.0.0 is 0x0002000100000000). On Windows it
// comes from the file's version resource, on Linux from the 52-byte fixed version record in the ELF section `.vxversion`. Control
// threads.
#pragma once

#include <cstdint>
#include <optional>

#include "platform/status.h"
#include "platform/text.h"

namespace vxcomn {

// The version of a file; nothing if the file cannot be read or bears none, with the reason in `why` (if given): 2 or 3 not found, 5
// not readable, 193 no module, 1813 no version in it.
std::optional<uint64_t> fileVersion(const WideString &path, Status *why = nullptr);

}  // namespace vxcomn
