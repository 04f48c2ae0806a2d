// SPDX-License-Identifier: MIT
#include "tools/vx_preset/archive.h"

#include <algorithm>

#include "preset/zip_directory.h"

namespace vx::preset {
namespace {

using namespace vxcomn;

bool isNamed(const ArchiveEntry &entry, std::string_view name) {
    return entry.name.size() == name.size() && beginsIgnoringCase(entry.name, name);
}

void readMaps(Archive &archive) {
    if (!archive.entries.empty() && isNamed(archive.entries[0], kSsidMapName)) {
        ByteCursor in(archive.entries[0].bytes);
        SsidMap map;
        if (readSsidMap(in, archive.ssidHeader, map)) archive.ssids = std::move(map);
    }
    if (archive.entries.size() > 1 && isNamed(archive.entries[1], kChidMapName)) {
        ByteCursor in(archive.entries[1].bytes);
        ChidMap map;
        if (readChidMap(in, map)) archive.chids = std::move(map);
    }
}

}  // namespace

bool looksLikePackage(std::span<const uint8_t> bytes) {
    uint32_t signature = 0;
    ByteCursor(bytes).u32(signature);
    return signature == kLocalSignature || signature == kCentralSignature || signature == kEndSignature;
}

Archive readArchive(std::span<const uint8_t> bytes) {
    Archive archive;
    MemorySource source(bytes);
    ZipEndRecord end;
    if (const char *const message = ReadZipEndRecord(source, end)) {
        archive.problem = {bytes.size() > kEndBytes ? bytes.size() - kEndBytes : 0, message};
        return archive;
    }
    ByteCursor directory(source);
    directory.seek(end.centralDirectoryOffset);
    uint64_t kept = 0;
    for (uint32_t i = 0; i < end.totalEntries; ++i) {
        ArchiveEntry entry;
        entry.headerOffset = directory.position();
        ZipHeader header;
        if (const char *const reason = readZipHeader(directory, kEntryNameBytes, header)) {
            archive.problem = {entry.headerOffset,
                               "entry #" + std::to_string(i) + ": " + (*reason == '\0' ? "The name is empty." : reason)};
            break;
        }
        entry.name = header.name;
        entry.method = header.method;
        entry.crc = header.crc;
        entry.size = header.size;
        ByteCursor data(source);
        seekZipEntry(data, header);
        entry.dataOffset = data.position();
        if (entry.dataOffset < bytes.size()) {
            const auto part = bytes.subspan(entry.dataOffset, std::min<uint64_t>(entry.size, bytes.size() - entry.dataOffset));
            entry.bytes.assign(part.begin(), part.end());
        }
        // Overlapping entries could make a small file into a large one.
        kept += entry.bytes.size();
        if (kept > kLargestInputBytes) {
            archive.problem = {entry.headerOffset,
                               "entry #" + std::to_string(i) + ": The entries together are too large; do they overlap?"};
            break;
        }
        archive.entries.push_back(std::move(entry));
    }
    readMaps(archive);
    return archive;
}

bool isPresetName(const std::string &name) {
    constexpr auto kSlashes = 5;
    const size_t last = name.rfind('/');
    if (std::count(name.begin(), name.end(), '/') != kSlashes) return false;
    return name.size() - last - 1 == kPresetFileName.size() &&
           beginsIgnoringCase(std::string_view(name).substr(last + 1), kPresetFileName);
}

}  // namespace vx::preset
