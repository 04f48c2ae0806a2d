// SPDX-License-Identifier: MIT
#include "host/handshake.h"

#include <array>
#include <cstdint>

namespace vxcomn {

std::recursive_mutex &controlLock(const LibraryContext *context) noexcept {
    static std::array<std::recursive_mutex, 64> locks;
    return locks[(reinterpret_cast<uintptr_t>(context) >> 6) % locks.size()];
}

}  // namespace vxcomn
