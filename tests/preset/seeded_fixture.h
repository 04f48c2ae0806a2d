// SPDX-License-Identifier: MIT
//
// The machine of graph_fixture.h with a preset that has seeded its parameter key.
#pragma once

#include <cstring>

#include "tests/preset/graph_fixture.h"

namespace vxcomn::testing {

// Power on, bypass, a few values, and the bounds that stay in the preset.
inline PresetDocument seedDocument(uint8_t mark = 1) {
    PresetDocument document = longDocument();
    document.blocks = {{-1, -2, -2, {{0, 0, 128, 63}}},
                       {-1, -18, -18, {{1}}},
                       {0, -21, -20, {{0, 0, 64, 65}, {0, 0, 64, 193}}},
                       {5, -21, -21, {{9}}},
                       {5, 115, 116, {{mark}, {}}}};
    return document;
}

struct Seeded : Graph {
    Seeded() {
        putPreset(seedDocument());
        open();
        REQUIRE_FALSE(host->ParamRegKeyName.get().empty());
    }
    RegistryKey parameters() const { return key(host->ParamRegKeyName.get()); }
    Bytes storedHash() const {
        std::vector<uint8_t> bytes;
        parameters().readBytes(store_name::presetHash, bytes, 32);
        return bytes;
    }
    Bytes hashBytes() const {
        Bytes bytes(32);
        std::memcpy(bytes.data(), host->PresetHash.data(), 32);
        return bytes;
    }
};

}  // namespace vxcomn::testing
