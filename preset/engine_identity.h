// SPDX-License-Identifier: MIT
//
// Comparing and reading EngineConfig records, as presets, the store and the properties do. Any thread.
#pragma once

#include <span>

#include "vxcomn/engine.h"

namespace vxcomn {

// Equal if the first words are equal and so are the bytes that they count, at most the whole record.
bool sameEngineConfig(const EngineConfig &left, const EngineConfig &right) noexcept;

// Whether the record says anything: it counts bytes.
inline bool engineConfigSet(const EngineConfig &config) noexcept {
    return config.Size != 0;
}

// The record that the bytes stand for, over zeros; what is past its capacity is dropped.
EngineConfig engineConfigFromBytes(std::span<const uint8_t> bytes) noexcept;

}  // namespace vxcomn
