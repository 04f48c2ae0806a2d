// SPDX-License-Identifier: MIT
//
// Parameters as the engine has them: a component, an id and a channel, and bytes.
#pragma once

#include <cstdint>
#include <span>
#include <string>

#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

struct Triple {
    int32_t componentId = 0;
    int32_t paramId = 0;
    int32_t channel = 0;
};

// "COMPONENT,ID[,CHANNEL]".
Triple parseTriple(const std::string &text);

// What a person calls it: "bass", "EQ band 1", or an empty text.
std::string parameterTitle(int32_t componentId, int32_t paramId);

// The value in its usual form, as text and as JSON ("hex" always, beside it "on", "float" or "band" where one is known).
std::string rawText(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes);
// The same for a reader of changes: levels and bands in decibels.
std::string spokenText(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes);
Json rawJson(int32_t componentId, int32_t paramId, std::span<const uint8_t> bytes);

}  // namespace vx::client
