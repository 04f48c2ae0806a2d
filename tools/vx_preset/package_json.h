// SPDX-License-Identifier: MIT
//
// A package as JSON:
//
//     {"format": "package", "device": "HDAUDIO\\FUNC_01&VEN_1&DEV_2",
//      "ssidMap": {"records": [{"package": 0, "ssid": "SUBSYS_12345678"}]},
//      "chidMap": {"groups": []},
//      "entries": [{"name": "0/0/EFX/AnyOutput/AnyContent/Preset.bin", "preset": {...}}, ...]}
//
// An entry has its preset in place, or names a "file" beside the document (JSON or Preset.bin), or holds "bytes". Maps may carry a
// "header" of eight bytes and a "recordSize", or be given as "bytes". "device" names the package's file and is not part of the
// archive.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include "tools/vx_preset/archive.h"
#include "tools/vx_preset/json_at.h"

namespace vx::preset {

struct PackageInput {
    std::string device;  // may be empty
    std::vector<vxcomn::PackageEntry> entries;
};

// Fails where the archive would not pack to the same entries again.
Json packageToJson(const std::string &file, const Archive &archive);

// `folder` is where the document lies.
PackageInput packageFromJson(const JsonAt &json, const std::filesystem::path &folder);

// A folder with package.json for the maps (its "entries" are taken first) and a tree <package>/<endpoint>/.../Preset.bin or
// Preset.json.
PackageInput packageFromFolder(const std::filesystem::path &folder);

// The image that a file stands for, which may be a document or an image already.
Bytes imageOf(const std::string &file, const Bytes &content);

}  // namespace vx::preset
