// SPDX-License-Identifier: MIT
//
// The properties of an endpoint as its IPropertyStore has them, for who classifies endpoints (endpoint_class.h) and for the
// property graph. Control threads.
#pragma once

#include "preset/endpoint_class.h"

namespace vxcomn {

// {B3F8FA53-0004-438E-9003-51A46E139BFC}, 2: the text that names the hardware behind the endpoint
inline constexpr PROPERTYKEY kEndpointHidKey = {{0xB3F8FA53, 0x0004, 0x438E, {0x90, 0x03, 0x51, 0xA4, 0x6E, 0x13, 0x9B, 0xFC}}, 2};

// Asks the store for each property and clears what it hands out.
class StorePropertyReader final : public PropertyReader {
  public:
    // Null is a store in which every read fails. Outlives this.
    explicit StorePropertyReader(IPropertyStore *store) noexcept : store_(store) {}

    PropertyAnswer read(const PROPERTYKEY &key) override;

  private:
    IPropertyStore *const store_;
};

}  // namespace vxcomn
