// SPDX-License-Identifier: MIT
//
// Reads the names that stand below a parameter key. Any process may write there, so a name may be anything: only what the writers
// of this library produce is taken. Pure functions over text. Any thread.
//
//     component   a decimal number, "-1"
//     value       a decimal number, "-18", or such a number, a comma and the id of the client whose own value it is, "-18,{...}"
#pragma once

#include <cstdint>
#include <optional>

#include "platform/text.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

inline constexpr size_t kMaxNumberUnits = 15;

// A number as this library writes it: no blanks, no plus sign, no zeros in front, 32 bits.
std::optional<int32_t> parseDecimal(WideView text) noexcept;

struct StoreValueName {
    std::optional<int32_t> paramId;  // nothing if it is no number
    bool isPrivate = false;          // there is a comma
    std::optional<GUID> client;      // nothing if what is behind the comma is no GUID
};
StoreValueName parseValueName(WideView name) noexcept;

}  // namespace vxcomn
