// SPDX-License-Identifier: MIT
#include "preset/store_value_name.h"

#include "platform/guid.h"

namespace vxcomn {

std::optional<int32_t> parseDecimal(WideView text) noexcept {
    if (text.size() > kMaxNumberUnits) return std::nullopt;
    const bool isNegative = !text.empty() && text.front() == VXWCHAR{'-'};
    if (isNegative) text.remove_prefix(1);
    if (text.empty()) return std::nullopt;
    if (text.front() == VXWCHAR{'0'} && (text.size() > 1 || isNegative)) return std::nullopt;
    int64_t value = 0;  // fifteen digits fit
    for (const VXWCHAR unit : text) {
        if (unit < VXWCHAR{'0'} || unit > VXWCHAR{'9'}) return std::nullopt;
        value = value * 10 + (unit - VXWCHAR{'0'});
    }
    if (isNegative) value = -value;
    if (value < INT32_MIN || value > INT32_MAX) return std::nullopt;
    return static_cast<int32_t>(value);
}

StoreValueName parseValueName(WideView name) noexcept {
    StoreValueName parsed;
    const size_t comma = name.find(VXWCHAR{','});
    parsed.paramId = parseDecimal(name.substr(0, comma));
    if (comma == WideView::npos) return parsed;
    parsed.isPrivate = true;
    if (GUID client; parseGuidText(name.substr(comma + 1), client)) parsed.client = client;
    return parsed;
}

}  // namespace vxcomn
