// SPDX-License-Identifier: MIT
//
// Endpoints as a test wants them, behind the system's interfaces: any number, with any property, failing where it is told to.
// They live as long as the test; references are counted so that what isn't given back shows.
#pragma once

#include <deque>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/endpoints.h"
#include "platform/text.h"
#include "vxcomn/com_memory.h"

// The SDK's interfaces have no virtual destructor; nobody deletes one from outside.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"

namespace test {

template <class Interface>
class Fake : public Interface {
  public:
    virtual ~Fake() = default;
    HRESULT QueryInterface(REFIID, void **object) override {
        *object = nullptr;
        return E_NOINTERFACE;
    }
    ULONG AddRef() override { return ++references; }
    ULONG Release() override { return --references; }

    ULONG references = 0;  // beyond the test's own
};

struct KeyLess {
    bool operator()(const PROPERTYKEY &left, const PROPERTYKEY &right) const { return std::memcmp(&left, &right, sizeof left) < 0; }
};

class FakeStore final : public Fake<IPropertyStore> {
  public:
    HRESULT GetCount(DWORD *) override { return E_NOTIMPL; }
    HRESULT GetAt(DWORD, PROPERTYKEY *) override { return E_NOTIMPL; }
    HRESULT GetValue(REFPROPERTYKEY key, PROPVARIANT *value) override {
        PropVariantInit(value);
        if (const auto found = failures.find(key); found != failures.end()) return found->second;
        if (const auto found = texts.find(key); found != texts.end()) {
            value->vt = VT_LPWSTR;
            const size_t bytes = (found->second.size() + 1) * sizeof(VXWCHAR);
            value->pwszVal = static_cast<LPWSTR>(CoTaskMemAlloc(bytes));
            std::memcpy(value->pwszVal, found->second.c_str(), bytes);
        } else if (const auto number = numbers.find(key); number != numbers.end()) {
            value->vt = VT_UI4;
            value->ulVal = number->second;
        }
        return S_OK;
    }
    HRESULT SetValue(REFPROPERTYKEY, REFPROPVARIANT) override { return E_ACCESSDENIED; }
    HRESULT Commit() override { return S_OK; }

    std::map<PROPERTYKEY, vxcomn::WideString, KeyLess> texts;
    std::map<PROPERTYKEY, uint32_t, KeyLess> numbers;
    std::map<PROPERTYKEY, HRESULT, KeyLess> failures;
};

class FakeDevice final : public Fake<IMMDevice> {
  public:
    HRESULT Activate(REFIID, DWORD, PROPVARIANT *, void **) override { return E_NOTIMPL; }
    HRESULT OpenPropertyStore(DWORD access, IPropertyStore **opened) override {
        accesses.push_back(access);
        *opened = nullptr;
        if (const HRESULT result = access == STGM_READ ? readResult : writeResult; FAILED(result)) return result;
        store.AddRef();
        *opened = &store;
        return S_OK;
    }
    HRESULT GetId(LPWSTR *text) override {
        *text = nullptr;
        if (FAILED(idResult)) return idResult;
        const size_t bytes = (id.size() + 1) * sizeof(VXWCHAR);
        *text = static_cast<LPWSTR>(CoTaskMemAlloc(bytes));
        std::memcpy(*text, id.c_str(), bytes);
        return S_OK;
    }
    HRESULT GetState(DWORD *now) override {
        *now = state;
        return stateResult;
    }

    vxcomn::WideString id;
    DWORD state = DEVICE_STATE_ACTIVE;
    FakeStore store;
    HRESULT readResult = S_OK, writeResult = S_OK, idResult = S_OK, stateResult = S_OK;
    HRESULT itemResult = S_OK;  // of the collection that holds it
    std::vector<DWORD> accesses;
};

class FakeEnumerator final : public Fake<IMMDeviceEnumerator> {
  public:
    FakeDevice &add(const vxcomn::WideString &id) {
        devices.emplace_back().id = id;
        return devices.back();
    }
    // References that were not given back.
    ULONG held() const {
        ULONG sum = collection.references;
        for (const FakeDevice &device : devices) sum += device.references + device.store.references;
        return sum;
    }

    HRESULT EnumAudioEndpoints(EDataFlow flow, DWORD stateMask, IMMDeviceCollection **listed) override {
        askedFlow = flow;
        askedMask = stateMask;
        *listed = nullptr;
        if (FAILED(enumerateResult)) return enumerateResult;
        collection.AddRef();
        *listed = &collection;
        return S_OK;
    }
    HRESULT GetDefaultAudioEndpoint(EDataFlow, ERole, IMMDevice **) override { return E_NOTIMPL; }
    HRESULT GetDevice(LPCWSTR id, IMMDevice **found) override {
        *found = nullptr;
        for (FakeDevice &device : devices) {
            if (device.id != id) continue;
            device.AddRef();
            *found = &device;
            return S_OK;
        }
        return vxcomn::kNotFound;
    }
    HRESULT RegisterEndpointNotificationCallback(IMMNotificationClient *) override { return S_OK; }
    HRESULT UnregisterEndpointNotificationCallback(IMMNotificationClient *) override { return unregisterResult; }

    std::deque<FakeDevice> devices;
    HRESULT enumerateResult = S_OK, countResult = S_OK, unregisterResult = S_OK;
    EDataFlow askedFlow = eAll;
    DWORD askedMask = 0;

  private:
    class Collection final : public Fake<IMMDeviceCollection> {
      public:
        explicit Collection(FakeEnumerator &owner) : owner_(owner) {}
        HRESULT GetCount(UINT *count) override {
            *count = static_cast<UINT>(owner_.devices.size());
            return owner_.countResult;
        }
        HRESULT Item(UINT index, IMMDevice **found) override {
            FakeDevice &device = owner_.devices.at(index);
            *found = nullptr;
            if (FAILED(device.itemResult)) return device.itemResult;
            device.AddRef();
            *found = &device;
            return S_OK;
        }

      private:
        FakeEnumerator &owner_;
    };

    Collection collection{*this};
};

}  // namespace test

#pragma GCC diagnostic pop
