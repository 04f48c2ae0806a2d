// SPDX-License-Identifier: MIT
//
// Values of properties as trace lines show them. Control threads.
#pragma once

#include <concepts>
#include <string>

#include "platform/com_ptr.h"
#include "platform/guid.h"
#include "preset/preset_format.h"
#include "preset/read_log.h"
#include "vxcomn/engine.h"

namespace vxcomn {

inline void appendHexadecimal(WideString &text, uint64_t number) {
    const auto high = static_cast<uint32_t>(number >> 32);
    if (high != 0) read_log::append(text, Hexadecimal{high});
    WideString low;
    read_log::append(low, Hexadecimal{static_cast<uint32_t>(number)});
    if (high != 0) text.append(8 - low.size(), VXWCHAR{'0'});
    text += low;
}

inline void appendValue(WideString &text, const WideString &value) {
    text += value;
}
inline void appendValue(WideString &text, std::integral auto value) {
    read_log::append(text, value);
}
inline void appendValue(WideString &text, const GUID &value) {
    text += guidText(value);
}
template <class Interface>
void appendValue(WideString &text, const ComRef<Interface> &value) {
    text += VX_TEXT("0x");
    appendHexadecimal(text, reinterpret_cast<uintptr_t>(value.get()));
}
// The components, of which a record that came from elsewhere may count more than it has.
inline void appendValue(WideString &text, const EngineConfig &value) {
    for (uint32_t i = 0; i < value.ComponentCount && i < VX_MAX_ENGINE_COMPONENTS; ++i) {
        text += i == 0 ? VX_TEXT("{ ") : VX_TEXT(", { ");
        read_log::append(text, value.Components[i].Position);
        text += VX_TEXT(", ");
        read_log::append(text, value.Components[i].ComponentId);
        text += VX_TEXT(" }");
    }
}

}  // namespace vxcomn
