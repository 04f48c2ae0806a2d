// SPDX-License-Identifier: MIT
//
// The two maps that lead a package, SSIDMAP.bin and CHIDMAP.bin. They live only while a preset is being opened. Control threads.
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "preset/byte_cursor.h"
#include "preset/package_format.h"

namespace vxcomn {

using MapHeader = std::array<uint8_t, kMapHeaderBytes>;

struct SsidRecord {
    uint32_t packageIndex = 0;
    std::string text;  // the whole fixed-width field

    friend bool operator==(const SsidRecord &, const SsidRecord &) = default;
};

// A map body: which package index a text takes.
struct SsidMap {
    uint32_t recordSize = 0;  // 0 where there are no records
    std::vector<SsidRecord> records;

    // The package index of a subsystem id, or -1. Kept: a record matches when its text begins with the id, the first that does
    // wins, and an id as long as the text field or longer never matches.
    int32_t find(std::string_view ssid) const noexcept;

    friend bool operator==(const SsidMap &, const SsidMap &) = default;
};

struct ChidGroup {
    uint32_t word = 0;
    SsidMap map;

    friend bool operator==(const ChidGroup &, const ChidGroup &) = default;
};

struct ChidMap {
    MapHeader header{};
    std::vector<ChidGroup> groups;
};

// Read an entry's bytes from where the stream stands. False if they end too soon, a record is too short for its own index, or the
// map is larger than kLargestMapBytes; memory is taken only for what really stands there.
bool readSsidMap(ByteCursor &stream, MapHeader &header, SsidMap &map);
bool readChidMap(ByteCursor &stream, ChidMap &map);

// Texts are padded with NULs to the record size, which is at least what the longest needs.
std::vector<uint8_t> writeSsidMap(const MapHeader &header, const SsidMap &map);
std::vector<uint8_t> writeChidMap(const ChidMap &map);

}  // namespace vxcomn
