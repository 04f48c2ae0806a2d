// SPDX-License-Identifier: MIT
//
// ComPtr: owns one reference to an interface. Any thread, as the interface allows.
#pragma once

#include "platform/unique.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

template <class Interface>
struct ComTraits {
    using Raw = Interface *;
    static constexpr Raw none = nullptr;
    static void close(Raw object) noexcept { object->Release(); }
};

template <class Interface>
class ComPtr : public Unique<ComTraits<Interface>> {
  public:
    using Unique<ComTraits<Interface>>::Unique;
    Interface *operator->() const noexcept { return this->get(); }
};

// Takes a reference of its own to an interface that somebody else holds.
template <class Interface>
ComPtr<Interface> shareCom(Interface *object) noexcept {
    if (object != nullptr) object->AddRef();
    return ComPtr<Interface>(object);
}

// The same, for holders that are copied: every copy has a reference of its own. Equal by address.
template <class Interface>
class ComRef {
  public:
    ComRef() noexcept = default;
    explicit ComRef(Interface *object) noexcept : held_(shareCom(object)) {}
    ComRef(const ComRef &other) noexcept : held_(shareCom(other.get())) {}
    ComRef(ComRef &&) noexcept = default;
    ComRef &operator=(ComRef other) noexcept {
        held_ = std::move(other.held_);
        return *this;
    }

    Interface *get() const noexcept { return held_.get(); }
    Interface *operator->() const noexcept { return held_.get(); }
    explicit operator bool() const noexcept { return static_cast<bool>(held_); }
    friend bool operator==(const ComRef &left, const ComRef &right) noexcept { return left.get() == right.get(); }

  private:
    ComPtr<Interface> held_;
};

}  // namespace vxcomn
