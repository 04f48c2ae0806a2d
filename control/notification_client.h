// SPDX-License-Identifier: MIT
//
// CMMNotificationClient: what the system calls when something about its endpoints changes. Only a change of state moves the tag by
// which clients poll for a new list of endpoints. Callbacks come on a thread of the system's, at any time while it is registered.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>

#include "control/api_context.h"

namespace vxcomn {

// Whose logger the callbacks trace through. Cleared ahead of its end, since the system may hold on to the client for longer.
struct NotificationListener {
    std::recursive_mutex lock;  // the last Release ends the client within its own trace
    CTraceFuncCallTarget *trace = nullptr;
};

}  // namespace vxcomn

// The SDK's interfaces have no virtual destructor; nobody deletes one from outside.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"

class VXAPOCOMAPI_APIContext::CMMNotificationClient final : public IMMNotificationClient {
  public:
    // With one reference, the caller's.
    explicit CMMNotificationClient(std::shared_ptr<vxcomn::NotificationListener> listener);

    HRESULT QueryInterface(REFIID iid, void **object) override;
    ULONG AddRef() override;
    ULONG Release() override;
    HRESULT OnDeviceStateChanged(LPCWSTR id, DWORD state) override;
    HRESULT OnDeviceAdded(LPCWSTR id) override;
    HRESULT OnDeviceRemoved(LPCWSTR id) override;
    HRESULT OnDefaultDeviceChanged(EDataFlow flow, ERole role, LPCWSTR id) override;
    HRESULT OnPropertyValueChanged(LPCWSTR id, const PROPERTYKEY key) override;

    uint64_t deviceChangeTag() const noexcept { return DeviceChangeTag.load(std::memory_order_relaxed); }

  private:
    class Call;

    virtual ~CMMNotificationClient();

    const std::shared_ptr<vxcomn::NotificationListener> Owner;
    std::atomic<uint32_t> RefCount{1};
    std::atomic<uint64_t> DeviceChangeTag{1};
};

#pragma GCC diagnostic pop
