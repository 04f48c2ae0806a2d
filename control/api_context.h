// SPDX-License-Identifier: MIT
//
// VXAPOCOMAPI_APIContext: one client's use of the control API. Owns the endpoint enumerator, hears of changes of the system's
// endpoints, proves by a named mutex that the client lives, and takes back what the client set for as long as it lives. API handles
// (handles.h) are pointers to it.
//
// Control threads; the system's notification thread enters through CMMNotificationClient alone. Lock order: EndpointHandlesLock
// ahead of a context's state lock; SetterValuesLock_ is a leaf.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <vector>

#include "diag/debug_trace.h"
#include "platform/com_ptr.h"
#include "platform/named_mutex.h"
#include "platform/text.h"
#include "vxcomn/com_types.h"

struct VXAPOCOMAPI_EndpointContext;

namespace vxcomn {

// Stands in every live context of both kinds.
inline constexpr uint32_t kHandleSignature = 0x46D3C1DF;

enum class HandleType : int32_t { api = 0, endpoint = 1 };  // TypeID

struct NotificationListener;

// Both kinds of contexts log by the same switch under the same tag.
void beginControlTrace(DBG_TRACE &trace);

}  // namespace vxcomn

struct VXAPOCOMAPI_APIContext final : CTraceFuncCallTargetAndTypeID {
    class CMMNotificationClient;

    VXAPOCOMAPI_APIContext();
    ~VXAPOCOMAPI_APIContext() override;

    // Reads the module's version, makes the enumerator and registers with it. False if the enumerator can't be made or refuses.
    bool Initialize();

    // Moves whenever the state of some endpoint of the system does.
    uint64_t deviceChangeTag() const noexcept;

    // Remembers a value below HKLM that goes with this client. Each pair stands once.
    void noteSetterValue(const vxcomn::WideString &keyPath, const vxcomn::WideString &valueName);

    uint32_t HandleSignature = vxcomn::kHandleSignature;
    // Plain words: the last writer wins.
    std::atomic<int32_t> LastError{0};
    std::atomic<uint32_t> WindowsLastError{0};
    bool Initialized = false;
    vxcomn::ComPtr<IMMDeviceEnumerator> DeviceEnumerator;
    vxcomn::ComPtr<CMMNotificationClient> NotificationClient;
    std::set<VXAPOCOMAPI_EndpointContext *> EndpointHandles;
    std::recursive_mutex EndpointHandlesLock;
    uint64_t ModuleVersion = 0;
    std::array<uint8_t, 4> ModuleVersionBytes = {};
    GUID ClientGuid = {};
    vxcomn::WideString SetterMutexName;  // the setter id; empty if there is no GUID
    vxcomn::NamedMutex SetterMutex;
    std::map<vxcomn::WideString, std::vector<vxcomn::WideString>> SetterValues;  // by key path

  private:
    void proveLife();
    void takeBackSetterValues();
    void Free();

    std::shared_ptr<vxcomn::NotificationListener> Listener_;
    std::mutex SetterValuesLock_;
};
