// SPDX-License-Identifier: MIT
//
// Variants: owners that clear them, and the conversion from the one kind to the other. The conversion is our own, because not every
// Windows environment implements the system's PropVariantToVariant. Any thread.
#pragma once

#include "vxcomn/com_memory.h"

namespace vxcomn {

// Owns the content of a PROPVARIANT.
class OwnedPropVariant {
  public:
    OwnedPropVariant() noexcept { PropVariantInit(&value_); }
    ~OwnedPropVariant() { PropVariantClear(&value_); }
    OwnedPropVariant(const OwnedPropVariant &) = delete;
    OwnedPropVariant &operator=(const OwnedPropVariant &) = delete;

    // For out-parameters: clears what is held and hands out the place.
    PROPVARIANT *put() noexcept {
        PropVariantClear(&value_);
        return &value_;
    }
    const PROPVARIANT &operator*() const noexcept { return value_; }
    const PROPVARIANT *operator->() const noexcept { return &value_; }

  private:
    PROPVARIANT value_;
};

// Converts into `to`, which is taken as it is and not cleared first. Numbers keep their type, text of either kind and a GUID become
// a BSTR. DISP_E_BADVARTYPE for what has no counterpart (a blob), E_OUTOFMEMORY; `to` then is empty.
HRESULT convertVariant(const PROPVARIANT &from, VARIANT &to);

}  // namespace vxcomn
