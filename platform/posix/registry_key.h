// SPDX-License-Identifier: MIT
//
// What a RegistryKey holds on Linux: the numbers of the key and of all keys above it, and the identity of the file that gave them.
// So a call costs one statement and no walk, and a write knows whose subtrees it changes. Internal to platform/posix/.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/registry.h"

namespace vxcomn {

// From the root to the key.
using KeyChain = std::vector<int64_t>;

// The rights inside RegistryAccess that a call asks for.
enum Right : uint32_t { kQueryValue = 1, kSetValue = 2, kEnumerate = 8, kNotify = 16 };

struct RegistryKey::Impl {
    int64_t store;  // identity of the file
    KeyChain chain;
    uint32_t access;

    int64_t key() const noexcept { return chain.back(); }
    bool may(Right right) const noexcept { return (access & right) != 0; }
};

}  // namespace vxcomn
