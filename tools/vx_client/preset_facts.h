// SPDX-License-Identifier: MIT
//
// Which preset an endpoint's slot gets, and what it is: the package or the loose file, the entry, the digest and the engine.
#pragma once

#include "tools/vx_client/slot_facts.h"

namespace vx::client {

PresetFacts findPreset(const Device &device, const std::string &apo, const std::string &ioConfig, const std::string &content);

// Eight words as they stand in a preset and in the store.
std::string digestText(const uint8_t *bytes);

}  // namespace vx::client
