// SPDX-License-Identifier: MIT
//
// The enumerator, its collections and devices.
#include "platform/endpoints.h"

#include <mutex>

#include "platform/posix/com_object.h"
#include "platform/posix/endpoint_audio_client.h"
#include "platform/posix/endpoint_keys.h"
#include "platform/posix/endpoint_properties.h"
#include "platform/posix/endpoint_watch.h"

namespace vxcomn {
namespace {

class Device final : public ComObject<IMMDevice> {
  public:
    explicit Device(const Endpoint &endpoint) : ComObject(kIidDevice), endpoint_(endpoint) {}

    HRESULT Activate(REFIID iid, DWORD, PROPVARIANT *, void **object) override {
        if (object == nullptr) return E_POINTER;
        *object = nullptr;
        if (!(iid == kIidAudioClient)) return E_NOINTERFACE;
        IAudioClient *client = nullptr;
        const HRESULT result = makeAudioClient(endpoint_, &client);
        *object = client;
        return result;
    }
    HRESULT OpenPropertyStore(DWORD access, IPropertyStore **store) override {
        if (store == nullptr) return E_POINTER;
        *store = nullptr;
        return openPropertyStore(endpoint_, access, store);
    }
    HRESULT GetId(LPWSTR *id) override {
        if (id == nullptr) return E_POINTER;
        *id = taskMemText(endpoint_.id());
        return *id != nullptr ? S_OK : E_OUTOFMEMORY;
    }
    HRESULT GetState(DWORD *state) override {
        if (state == nullptr) return E_POINTER;
        *state = endpointState(endpoint_).value_or(DEVICE_STATE_NOTPRESENT);
        return S_OK;
    }

  private:
    const Endpoint endpoint_;
};

class Collection final : public ComObject<IMMDeviceCollection> {
  public:
    explicit Collection(std::vector<Endpoint> endpoints) : ComObject(kIidDeviceCollection), endpoints_(std::move(endpoints)) {}

    HRESULT GetCount(UINT *count) override {
        if (count == nullptr) return E_POINTER;
        *count = static_cast<UINT>(endpoints_.size());
        return S_OK;
    }
    HRESULT Item(UINT index, IMMDevice **device) override {
        if (device == nullptr) return E_POINTER;
        *device = nullptr;
        return index < endpoints_.size() ? makeCom<Device>(device, endpoints_[index]) : E_INVALIDARG;
    }

  private:
    const std::vector<Endpoint> endpoints_;
};

class Enumerator final : public ComObject<IMMDeviceEnumerator> {
  public:
    Enumerator() : ComObject(kIidDeviceEnumerator) {}

    HRESULT EnumAudioEndpoints(EDataFlow flow, DWORD stateMask, IMMDeviceCollection **devices) override {
        if (devices == nullptr) return E_POINTER;
        *devices = nullptr;
        if (!isFlow(flow, eAll) || (stateMask & ~uint32_t{DEVICE_STATEMASK_ALL}) != 0) return E_INVALIDARG;
        return makeCom<Collection>(devices, select(flow, stateMask));
    }

    // The first active one.
    HRESULT GetDefaultAudioEndpoint(EDataFlow flow, ERole, IMMDevice **device) override {
        if (device == nullptr) return E_POINTER;
        *device = nullptr;
        if (!isFlow(flow, eCapture)) return E_INVALIDARG;
        const std::vector<Endpoint> active = select(flow, DEVICE_STATE_ACTIVE);
        return active.empty() ? kNotFound : makeCom<Device>(device, active.front());
    }

    HRESULT GetDevice(LPCWSTR id, IMMDevice **device) override {
        if (device == nullptr) return E_POINTER;
        *device = nullptr;
        if (id == nullptr) return E_POINTER;
        auto endpoint = endpointOfId(id);
        if (!endpoint) return E_INVALIDARG;
        return findEndpoint(*endpoint) == status::ok ? makeCom<Device>(device, *endpoint) : kNotFound;
    }

    HRESULT RegisterEndpointNotificationCallback(IMMNotificationClient *client) override {
        if (client == nullptr) return E_POINTER;
        const std::lock_guard lock(mutex_);
        return watch_.add(client);
    }
    HRESULT UnregisterEndpointNotificationCallback(IMMNotificationClient *client) override {
        return client != nullptr ? watch_.remove(client) : E_POINTER;
    }

  private:
    static bool isFlow(EDataFlow flow, EDataFlow last) noexcept { return flow >= eRender && flow <= last; }

    static std::vector<Endpoint> select(EDataFlow flow, DWORD stateMask) {
        std::vector<Endpoint> endpoints = listEndpoints(flow);
        std::erase_if(endpoints, [stateMask](const Endpoint &endpoint) {
            return (endpointState(endpoint).value_or(DEVICE_STATE_NOTPRESENT) & stateMask) == 0;
        });
        return endpoints;
    }

    std::mutex mutex_;  // one registration at a time
    EndpointWatch watch_;
};

}  // namespace

HRESULT initializeCom() noexcept {
    return S_OK;
}

HRESULT createDeviceEnumerator(ComPtr<IMMDeviceEnumerator> &enumerator) noexcept {
    return makeCom<Enumerator>(enumerator.put());
}

}  // namespace vxcomn
