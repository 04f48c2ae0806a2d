// SPDX-License-Identifier: MIT
//
// A parameter's value as people read and write it. What the library knows of a parameter
// decides the form in which a value is shown; any form may be written for any parameter. A form is shown only if it gives the same
// bytes back, otherwise the bytes themselves are.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "tools/vx_preset/json_at.h"

namespace vx::preset {

// The name of a parameter that the library knows, or an empty text.
std::string parameterName(int32_t componentId, int32_t paramId);

// Adds the member that holds the value: "on", "byte", "float", "band" or "bytes".
void putValue(Json &entry, int32_t componentId, int32_t paramId, std::span<const uint8_t> value);

// One line of text for tables and differences.
std::string valueText(int32_t componentId, int32_t paramId, std::span<const uint8_t> value);

// Reads the one member that holds a value; none means no value.
std::vector<uint8_t> takeValue(const JsonAt &entry);

}  // namespace vx::preset
