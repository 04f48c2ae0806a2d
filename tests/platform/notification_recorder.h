// SPDX-License-Identifier: MIT
//
// A notification client that remembers what it was told, and can be waited for.
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include "platform/endpoints.h"
#include "platform/text.h"

#if defined(__MINGW32__)
#define VXCOMN_COM_CALL __stdcall
#else
#define VXCOMN_COM_CALL
#endif

// The SDK's interfaces have no virtual destructor; nobody deletes one from outside.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"

namespace test {

// Lives on the stack of a test; references are counted and nothing else.
class NotificationRecorder final : public IMMNotificationClient {
  public:
    std::atomic<int> references{1};

    virtual ~NotificationRecorder() = default;
    HRESULT VXCOMN_COM_CALL QueryInterface(REFIID iid, void **object) override {
        const bool known = iid == vxcomn::kIidUnknown || iid == vxcomn::kIidNotificationClient;
        *object = known ? this : nullptr;
        if (!known) return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    ULONG VXCOMN_COM_CALL AddRef() override { return static_cast<ULONG>(++references); }
    ULONG VXCOMN_COM_CALL Release() override { return static_cast<ULONG>(--references); }

    HRESULT VXCOMN_COM_CALL OnDeviceStateChanged(LPCWSTR id, DWORD state) override {
        return note("state " + std::to_string(state) + " ", id);
    }
    HRESULT VXCOMN_COM_CALL OnDeviceAdded(LPCWSTR id) override { return note("added ", id); }
    HRESULT VXCOMN_COM_CALL OnDeviceRemoved(LPCWSTR id) override { return note("removed ", id); }
    HRESULT VXCOMN_COM_CALL OnDefaultDeviceChanged(EDataFlow, ERole, LPCWSTR) override { return S_OK; }
    HRESULT VXCOMN_COM_CALL OnPropertyValueChanged(LPCWSTR, const PROPERTYKEY) override { return S_OK; }

    // The first `count` things that it was told; fewer only if they do not come.
    std::vector<std::string> told(size_t count) {
        std::unique_lock lock(mutex_);
        more_.wait_for(lock, std::chrono::seconds(20), [&] { return told_.size() >= count; });
        return told_;
    }

  private:
    HRESULT note(const std::string &what, LPCWSTR id) {
        const std::lock_guard lock(mutex_);
        told_.push_back(what + vxcomn::toUtf8(id));
        more_.notify_all();
        return S_OK;
    }

    std::mutex mutex_;
    std::condition_variable more_;
    std::vector<std::string> told_;
};

}  // namespace test

#pragma GCC diagnostic pop
