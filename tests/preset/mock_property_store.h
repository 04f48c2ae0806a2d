// SPDX-License-Identifier: MIT
//
// A property store that a test fills. It counts references and reads, and can hold what the system's stores cannot: any variant
// type, text that is null, reads that fail. Lives on the stack of a test.
#pragma once

#include <atomic>
#include <cstring>
#include <string>
#include <variant>
#include <vector>

#include "platform/com_ptr.h"
#include "platform/endpoints.h"
#include "platform/text.h"
#include "vxcomn/com_memory.h"

#if defined(__MINGW32__)
#define VXCOMN_COM_CALL __stdcall
#else
#define VXCOMN_COM_CALL
#endif

// The SDK's interfaces have no virtual destructor; nobody deletes one from outside.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"

namespace vxcomn::testing {

class MockPropertyStore final : public IPropertyStore {
  public:
    std::atomic<int> references{1};
    int reads = 0;
    std::vector<PROPERTYKEY> asked;

    MockPropertyStore() = default;
    MockPropertyStore(const MockPropertyStore &) = delete;
    MockPropertyStore &operator=(const MockPropertyStore &) = delete;
    virtual ~MockPropertyStore() = default;

    MockPropertyStore &number(const PROPERTYKEY &key, uint32_t value, VARTYPE type = VT_UI4) {
        return hold({key, S_OK, type, value, {}, false});
    }
    MockPropertyStore &text(const PROPERTYKEY &key, const std::string &value) {
        return hold({key, S_OK, VT_LPWSTR, 0, toWide(value), false});
    }
    MockPropertyStore &nullText(const PROPERTYKEY &key) { return hold({key, S_OK, VT_LPWSTR, 0, {}, true}); }
    MockPropertyStore &failure(const PROPERTYKEY &key, HRESULT result) { return hold({key, result, VT_EMPTY, 0, {}, false}); }
    void remove(const PROPERTYKEY &key) {
        std::erase_if(values_, [&](const Value &value) { return same(value.key, key); });
    }
    vxcomn::ComRef<IPropertyStore> ref() { return vxcomn::ComRef<IPropertyStore>(this); }

    HRESULT VXCOMN_COM_CALL QueryInterface(REFIID iid, void **object) override {
        const bool known = iid == kIidUnknown || iid == kIidPropertyStore;
        *object = known ? this : nullptr;
        if (!known) return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    ULONG VXCOMN_COM_CALL AddRef() override { return static_cast<ULONG>(++references); }
    ULONG VXCOMN_COM_CALL Release() override { return static_cast<ULONG>(--references); }

    HRESULT VXCOMN_COM_CALL GetCount(DWORD *count) override {
        *count = static_cast<DWORD>(values_.size());
        return S_OK;
    }
    HRESULT VXCOMN_COM_CALL GetAt(DWORD, PROPERTYKEY *) override { return E_INVALIDARG; }
    HRESULT VXCOMN_COM_CALL GetValue(REFPROPERTYKEY key, PROPVARIANT *out) override {
        ++reads;
        asked.push_back(key);
        PropVariantInit(out);
        for (const Value &value : values_) {
            if (same(value.key, key)) return deliver(value, *out);
        }
        return S_OK;  // as the system's store: there is no such property
    }
    HRESULT VXCOMN_COM_CALL SetValue(REFPROPERTYKEY, REFPROPVARIANT) override { return STG_E_ACCESSDENIED; }
    HRESULT VXCOMN_COM_CALL Commit() override { return S_OK; }

  private:
    struct Value {
        PROPERTYKEY key;
        HRESULT result;
        VARTYPE type;
        uint32_t number;
        WideString text;
        bool isNull;
    };

    static bool same(const PROPERTYKEY &left, const PROPERTYKEY &right) noexcept {
        return left.fmtid == right.fmtid && left.pid == right.pid;
    }
    static HRESULT deliver(const Value &value, PROPVARIANT &out) {
        if (FAILED(value.result)) return value.result;
        out.vt = value.type;
        if (value.type != VT_LPWSTR) {
            out.ulVal = value.number;
        } else if (!value.isNull) {
            const size_t bytes = (value.text.size() + 1) * sizeof(VXWCHAR);
            out.pwszVal = static_cast<LPWSTR>(CoTaskMemAlloc(bytes));
            std::memcpy(out.pwszVal, value.text.c_str(), bytes);
        }
        return S_OK;
    }
    MockPropertyStore &hold(Value value) {
        remove(value.key);
        values_.push_back(std::move(value));
        return *this;
    }

    std::vector<Value> values_;
};

}  // namespace vxcomn::testing

#pragma GCC diagnostic pop
