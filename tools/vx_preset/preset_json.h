// SPDX-License-Identifier: MIT
//
// A preset as JSON:
//
//     {"format": "preset", "version": "0x1000001",
//      "engine": {"name": "VXORLO", "config": {"size": 60, "reserved": 0, "components": [{"component": 1, "position": 0}, ...]}},
//      "blocks": [{"component": -1, "first": -18, "values": [{"id": -18, "on": false}]}, ...]}
//
// "engine" and "bypassAllWord" belong to versions below 0x1000010. A value without a form has no bytes; "id" may be left out.
// "last" is needed only for a block without entries. Unusual images have "hash", "layout" and "gaps", too, so that a round trip is
// the identity: without "hash" the digest is computed.
#pragma once

#include "preset/preset_writer.h"
#include "tools/vx_preset/json_at.h"

namespace vx::preset {

Json presetToJson(const vxcomn::PresetDocument &document);
vxcomn::PresetDocument presetFromJson(const JsonAt &json);

// An engine record as JSON, also for lists.
Json engineConfigToJson(std::span<const uint8_t> record);

}  // namespace vx::preset
