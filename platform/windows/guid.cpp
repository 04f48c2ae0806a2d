// SPDX-License-Identifier: MIT
#include "platform/guid.h"

#include <cstring>

namespace vxcomn {

bool newGuid(GUID &guid) noexcept {
    const bool made = SUCCEEDED(CoCreateGuid(&guid));
    if (!made) std::memset(&guid, 0, sizeof guid);
    return made;
}

}  // namespace vxcomn
