// SPDX-License-Identifier: MIT
#include "platform/guid.h"

#include <cstring>

#include <sys/random.h>

namespace vxcomn {

// A random one, marked as such: version 4, variant 1.
bool newGuid(GUID &guid) noexcept {
    const bool made = getrandom(&guid, sizeof guid, 0) == static_cast<ssize_t>(sizeof guid);
    if (!made) std::memset(&guid, 0, sizeof guid);
    guid.Data3 = static_cast<uint16_t>(made ? (guid.Data3 & 0x0FFF) | 0x4000 : 0);
    guid.Data4[0] = static_cast<uint8_t>(made ? (guid.Data4[0] & 0x3F) | 0x80 : 0);
    return made;
}

}  // namespace vxcomn
