// SPDX-License-Identifier: MIT
//
// Tells that something changed at or below a registry key, whichever process changed it. Armed once it is signalled once, for any
// number of changes, and then has to be armed again. It is a hint to read, never the data: arm first, then read, then wait, and no
// change is missed. Now and then it may be signalled although nothing changed, and when its key is deleted. Waited for like an
// event (event.h). Control threads; one thread at a time arms and waits.
#pragma once

#include <cstdint>

#include "platform/event.h"
#include "platform/registry.h"

namespace vxcomn {

// What counts as a change, numbered as REG_NOTIFY_CHANGE_*: values written and deleted (not with their key), or keys made and
// deleted as well.
enum class ChangeFilter : uint32_t { values = 4, keysAndValues = 5 };

class ChangeSignal : public Waitable {
  public:
    ChangeSignal() noexcept;

    // For a key that was opened with the right to read. The signal does not need the key any longer, and is not armed yet.
    static Status open(const RegistryKey &key, ChangeFilter filter, ChangeSignal &signal);

    // From now on changes signal it; what signalled it before no longer does. 1018 if the key is gone.
    Status arm() noexcept;
};

}  // namespace vxcomn
