// SPDX-License-Identifier: MIT
//
// WaitObject on Windows: a handle of the system. Internal to platform/windows/.
#pragma once

#include "platform/unique.h"
#include "platform/windows/sdk.h"

namespace vxcomn {

struct HandleTraits {
    using Raw = HANDLE;
    static constexpr Raw none = nullptr;
    // Closing keeps the reason of the failure that led to it.
    static void close(Raw handle) noexcept {
        const DWORD savedError = GetLastError();
        CloseHandle(handle);
        SetLastError(savedError);
    }
};
using SystemHandle = Unique<HandleTraits>;

class WaitObject {
  public:
    explicit WaitObject(SystemHandle handle) noexcept : handle_(std::move(handle)) {}
    virtual ~WaitObject() = default;
    HANDLE get() const noexcept { return handle_.get(); }

  private:
    SystemHandle handle_;
};

}  // namespace vxcomn
