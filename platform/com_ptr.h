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

}  // namespace vxcomn
