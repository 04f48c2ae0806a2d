// SPDX-License-Identifier: MIT
//
// A whole package taken apart for the tools, with what a loader would not look at (methods, checksums, local names), and the
// package as a document that packs to the same archive again.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "preset/package_maps.h"
#include "preset/package_writer.h"
#include "tools/vx_preset/files.h"

namespace vx::preset {

struct ArchiveEntry {
    std::string name;
    uint64_t headerOffset = 0;  // of the central header, in the file
    uint64_t dataOffset = 0;    // of the first byte, in the file
    uint16_t method = 0;        // 0: stored
    uint32_t crc = 0;
    uint32_t size = 0;  // as the central header says
    Bytes bytes;        // what there is of it in the file
};

struct ArchiveProblem {
    uint64_t offset;
    std::string what;
};

struct Archive {
    std::vector<ArchiveEntry> entries;
    std::optional<ArchiveProblem> problem;  // where the directory could not be read on

    // The maps, where they stand in their places and are sound.
    vxcomn::MapHeader ssidHeader{};
    std::optional<vxcomn::SsidMap> ssids;
    std::optional<vxcomn::ChidMap> chids;
};

// Whether the bytes are to be taken for a package rather than for a preset: an archive's or an entry's signature at their
// beginning.
bool looksLikePackage(std::span<const uint8_t> bytes);

Archive readArchive(std::span<const uint8_t> bytes);

// Whether an entry is named as a preset is: <package>/<endpoint>/<APO type>/<I/O configuration>/<content>/Preset.bin.
bool isPresetName(const std::string &name);

}  // namespace vx::preset
