// SPDX-License-Identifier: MIT
//
// ComObject: what every object behind an interface does alike, counting references and telling which interface it is. Any thread.
#pragma once

#include <atomic>
#include <new>
#include <utility>

#include "platform/com_ptr.h"
#include "platform/endpoints.h"
#include "platform/status.h"
#include "platform/text.h"
#include "vxcomn/com_memory.h"

namespace vxcomn {

template <class Interface>
class ComObject : public Interface {
  public:
    HRESULT QueryInterface(REFIID iid, void **object) override {
        if (object == nullptr) return E_POINTER;
        const bool known = iid == kIidUnknown || iid == iid_;
        *object = known ? static_cast<Interface *>(this) : nullptr;
        if (!known) return E_NOINTERFACE;
        AddRef();
        return S_OK;
    }
    ULONG AddRef() override { return references_.fetch_add(1) + 1; }
    ULONG Release() override {
        const ULONG left = references_.fetch_sub(1) - 1;
        if (left == 0) delete this;
        return left;
    }

  protected:
    explicit ComObject(const GUID &iid) noexcept : iid_(iid) {}
    virtual ~ComObject() = default;

  private:
    const GUID iid_;
    std::atomic<ULONG> references_{1};
};

// Makes an object and hands its one reference to the caller.
template <class Object, class Interface, class... Arguments>
HRESULT makeCom(Interface **out, Arguments &&...arguments) noexcept {
    try {
        *out = new Object(std::forward<Arguments>(arguments)...);
        return S_OK;
    } catch (const std::bad_alloc &) {
        *out = nullptr;
        return E_OUTOFMEMORY;
    }
}

// HRESULT_FROM_WIN32
inline HRESULT resultOf(Status status) noexcept {
    return static_cast<HRESULT>(status == status::ok ? 0 : (status & 0xFFFF) | 0x80070000);
}

// A copy that the receiver frees with CoTaskMemFree; null if memory runs out.
inline LPWSTR taskMemText(WideView text) noexcept {
    auto *copy = static_cast<LPWSTR>(CoTaskMemAlloc((text.size() + 1) * sizeof(VXWCHAR)));
    if (copy == nullptr) return nullptr;
    text.copy(copy, text.size());
    copy[text.size()] = 0;
    return copy;
}

}  // namespace vxcomn
