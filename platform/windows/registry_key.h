// SPDX-License-Identifier: MIT
//
// What a RegistryKey holds on Windows. Internal to platform/windows/.
#pragma once

#include "platform/registry.h"
#include "platform/security.h"
#include "platform/unique.h"
#include "platform/windows/sdk.h"

namespace vxcomn {

struct KeyTraits {
    using Raw = HKEY;
    static constexpr Raw none = nullptr;
    static void close(Raw key) noexcept { RegCloseKey(key); }
};
using SystemKey = Unique<KeyTraits>;

struct RegistryKey::Impl {
    SystemKey key;

    static Status open(HKEY above, WideView path, RegistryAccess access, RegistryKey &key);
    static Status create(HKEY above, WideView path, RegistryAccess access, RegistryKey &key, bool *created,
                         const SecurityRecord *security);
    static Status take(LSTATUS status, SystemKey &opened, RegistryKey &key);
};

}  // namespace vxcomn
