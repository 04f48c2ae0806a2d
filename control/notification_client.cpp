// SPDX-License-Identifier: MIT
#include "control/notification_client.h"

#include "platform/endpoints.h"

using namespace vxcomn;

// The trace of one call. Keeps the listener where it is until the call has left.
class VXAPOCOMAPI_APIContext::CMMNotificationClient::Call {
  public:
    Call(const CMMNotificationClient &client, const VXWCHAR *name)
        : listener_(client.Owner), guard_(listener_->lock), scope_(listener_->trace, name) {}

    template <class... Arguments>
    void log(const VXWCHAR *format, const Arguments &...arguments) const {
        if (listener_->trace != nullptr) listener_->trace->log(format, arguments...);
    }

  private:
    const std::shared_ptr<NotificationListener> listener_;
    const std::lock_guard<std::recursive_mutex> guard_;
    const TraceScope scope_;
};

using Client = VXAPOCOMAPI_APIContext::CMMNotificationClient;

Client::CMMNotificationClient(std::shared_ptr<NotificationListener> listener) : Owner(std::move(listener)) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::CMMNotificationClient"));
}

Client::~CMMNotificationClient() {
    const Call call(*this, VX_TEXT("CMMNotificationClient::~CMMNotificationClient"));
}

HRESULT Client::QueryInterface(REFIID iid, void **object) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::QueryInterface"));
    if (object == nullptr) return E_POINTER;
    const bool known = iid == kIidUnknown || iid == kIidNotificationClient;
    *object = known ? static_cast<IMMNotificationClient *>(this) : nullptr;
    if (!known) return E_NOINTERFACE;
    AddRef();
    return S_OK;
}

ULONG Client::AddRef() {
    const Call call(*this, VX_TEXT("CMMNotificationClient::AddRef"));
    return RefCount.fetch_add(1) + 1;
}

ULONG Client::Release() {
    const Call call(*this, VX_TEXT("CMMNotificationClient::Release"));
    const uint32_t left = RefCount.fetch_sub(1) - 1;
    if (left == 0) delete this;
    return left;
}

HRESULT Client::OnDeviceStateChanged(LPCWSTR /*id*/, DWORD /*state*/) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::OnDeviceStateChanged"));
    DeviceChangeTag.fetch_add(1, std::memory_order_relaxed);
    return S_OK;
}

// Kept: these three and the next leave the tag alone. A client's list goes by the endpoints' states.
HRESULT Client::OnDeviceAdded(LPCWSTR /*id*/) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::OnDeviceAdded"));
    return S_OK;
}

HRESULT Client::OnDeviceRemoved(LPCWSTR /*id*/) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::OnDeviceRemoved"));
    return S_OK;
}

HRESULT Client::OnDefaultDeviceChanged(EDataFlow /*flow*/, ERole /*role*/, LPCWSTR /*id*/) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::OnDefaultDeviceChanged"));
    return S_OK;
}

HRESULT Client::OnPropertyValueChanged(LPCWSTR /*id*/, const PROPERTYKEY key) {
    const Call call(*this, VX_TEXT("CMMNotificationClient::OnPropertyValueChanged"));
    const GUID &guid = key.fmtid;
    call.log(VX_TEXT("Key = {{%08lX-%04hX-%04hX-%02hhX%02hhX-%02hhX%02hhX%02hhX%02hhX%02hhX%02hhX}, %i}\n"), guid.Data1, guid.Data2,
             guid.Data3, guid.Data4[0], guid.Data4[1], guid.Data4[2], guid.Data4[3], guid.Data4[4], guid.Data4[5], guid.Data4[6],
             guid.Data4[7], key.pid);
    return S_OK;
}
