// SPDX-License-Identifier: MIT
//
// What the machine holds about one effect slot of one endpoint, read without touching it: choosing a slot through the control API
// would fill its store, and whoever asks what is wrong wants to see it as it is. The rules are those of the formats and the store's
// layout; which of the values count is said here, and judged elsewhere. Texts are as they stand: see printable (device_list.h).
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tools/vx_client/device_list.h"

namespace vx::client {

// Where a selection comes from.
enum class Origin : uint8_t { none, derived, preset, forced, stored };
const char *originName(Origin origin);

struct Selection {
    std::string value;
    Origin origin = Origin::none;
    std::string setter;   // the client that forces it, or forced it
    std::string ignored;  // a value that stands in the store and does not count, because its setter is gone
};

struct PresetFacts {
    std::string packageName;    // that the device asks for
    std::string packageFolder;  // where it is looked for
    std::string packagePath;    // empty: not there
    std::string path;           // of the preset: in the package, or of a file
    std::string entry;          // the package's entry that was chosen
    bool found = false;
    bool sound = false;        // its header can be read
    bool digestHolds = false;  // the digest in it is that of its bytes
    std::string digest;        // hexadecimal
    std::string engine;
    uint32_t version = 0;
    std::vector<std::string> log;  // the loader's own lines
};

struct Client {
    std::string id;
    bool alive = false;
};

struct SlotFacts {
    std::string apo;
    std::string configurationKey;
    bool keyThere = false;
    Selection engine, ioConfig, profile, content;
    PresetFacts preset;
    std::string parameterKey;  // empty: nothing chooses one
    bool parametersThere = false;
    std::optional<std::string> storedDigest;  // hexadecimal
    std::optional<bool> power, bypass;
    std::vector<Client> clients;
    bool receiverRuns = false;
};

// `moduleVersion` decides how parameter keys are named.
SlotFacts readSlot(const Device &device, const std::string &apo, uint64_t moduleVersion);

}  // namespace vx::client
