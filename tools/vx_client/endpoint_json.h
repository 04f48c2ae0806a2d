// SPDX-License-Identifier: MIT
//
// Endpoints and slots as JSON, the same in every verb.
#pragma once

#include <nlohmann/json.hpp>
#include <string>

#include "tools/vx_client/device_list.h"
#include "tools/vx_client/slot_facts.h"

namespace vx::client {

using Json = nlohmann::ordered_json;

Json textOrNull(const std::string &text);
// Id, name, flow, state, index, device and subsystem id.
Json deviceJson(const Device &device);
Json slotJson(const SlotFacts &slot);

// One document, or one line of a stream. What is no UTF-8 is replaced.
std::string documentText(const Json &json);
std::string lineText(const Json &json);

}  // namespace vx::client
