// SPDX-License-Identifier: MIT
//
// What a loader would say of a preset or a package, and what it would not notice though a sound file has it otherwise.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tools/vx_preset/files.h"

namespace vx::preset {

struct Finding {
    uint64_t offset = 0;  // in the file
    std::string entry;    // of a package; empty for a preset of its own or the archive itself
    std::string found;
    std::string expected;
    std::string loader;  // what a loader does about it
};

struct CheckReport {
    std::vector<Finding> findings;
    std::vector<std::string> log;  // the loader's own lines
};

// What an endpoint would ask a package for.
struct OpenRequest {
    std::string ssid;
    std::string path;  // such as 0/EFX/AnyOutput/AnyContent/Preset.bin
};

CheckReport checkPreset(const Bytes &image);

// Without a request every preset of the package is loaded; with one, the one that the endpoint would get.
CheckReport checkPackage(const Bytes &bytes, const std::optional<OpenRequest> &request);

}  // namespace vx::preset
