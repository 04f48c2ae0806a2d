// SPDX-License-Identifier: MIT
#include "platform/change_signal.h"

#include "platform/windows/registry_key.h"
#include "platform/windows/wait_object.h"

namespace vxcomn {
namespace {

// A key handle of its own, for arming a handle twice would only replace the first one's event.
class SignalObject final : public WaitObject {
  public:
    SignalObject(SystemHandle event, SystemKey key, ChangeFilter filter) noexcept
        : WaitObject(std::move(event)), key_(std::move(key)), filter_(filter) {}

    Status arm() noexcept {
        ResetEvent(get());
        return static_cast<Status>(RegNotifyChangeKeyValue(key_.get(), TRUE, static_cast<DWORD>(filter_), get(), TRUE));
    }

  private:
    const SystemKey key_;
    const ChangeFilter filter_;
};

}  // namespace

ChangeSignal::ChangeSignal() noexcept = default;

Status ChangeSignal::open(const RegistryKey &key, ChangeFilter filter, ChangeSignal &signal) {
    if (!key) return status::invalidHandle;
    SystemKey own;
    const LSTATUS opened = RegOpenKeyExW(key.impl_->key.get(), L"", 0, KEY_NOTIFY | KEY_WOW64_64KEY, own.put());
    if (opened != ERROR_SUCCESS) return static_cast<Status>(opened);
    SystemHandle event(CreateEventW(nullptr, FALSE, FALSE, nullptr));
    if (!event) return GetLastError();
    signal.adopt(std::make_unique<SignalObject>(std::move(event), std::move(own), filter));
    return status::ok;
}

Status ChangeSignal::arm() noexcept {
    return object() != nullptr ? static_cast<SignalObject *>(object())->arm() : status::invalidHandle;
}

}  // namespace vxcomn
