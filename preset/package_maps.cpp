// SPDX-License-Identifier: MIT
#include "preset/package_maps.h"

#include <algorithm>

#include "preset/zip_directory.h"

namespace vxcomn {
namespace {

// Reads a record's text in pieces that a cursor can take, so that its length costs nothing before its bytes have been seen.
bool readText(ByteCursor &stream, size_t length, std::string &text) {
    while (length > 0) {
        const size_t piece = std::min(length, ByteCursor::kLargestTake);
        const uint8_t *const bytes = stream.take(piece);
        if (bytes == nullptr) return false;
        text.append(reinterpret_cast<const char *>(bytes), piece);
        length -= piece;
    }
    return true;
}

// `budget` is what the whole map may still take.
bool readBody(ByteCursor &stream, size_t &budget, SsidMap &map) {
    map = {};
    uint32_t count = 0;
    if (!stream.u32(count)) return false;
    if (count == 0) return true;
    if (!stream.u32(map.recordSize) || map.recordSize < kRecordIndexBytes) return false;
    if (count > budget / map.recordSize) return false;
    budget -= static_cast<size_t>(count) * map.recordSize;
    for (; count > 0; --count) {
        SsidRecord record;
        if (!stream.u32(record.packageIndex) || !readText(stream, map.recordSize - kRecordIndexBytes, record.text)) return false;
        map.records.push_back(std::move(record));
    }
    return true;
}

bool readHeader(ByteCursor &stream, MapHeader &header) {
    const uint8_t *const bytes = stream.take(header.size());
    if (bytes == nullptr) return false;
    std::copy_n(bytes, header.size(), header.begin());
    return true;
}

void writeBody(ByteWriter &out, const SsidMap &map) {
    out.u32(static_cast<uint32_t>(map.records.size()));
    if (map.records.empty()) return;
    size_t size = map.recordSize;
    for (const SsidRecord &record : map.records) size = std::max(size, kRecordIndexBytes + record.text.size());
    out.u32(static_cast<uint32_t>(size));
    for (const SsidRecord &record : map.records) {
        out.u32(record.packageIndex);
        out.bytes({reinterpret_cast<const uint8_t *>(record.text.data()), record.text.size()});
        out.zeros(size - kRecordIndexBytes - record.text.size());
    }
}

}  // namespace

int32_t SsidMap::find(std::string_view ssid) const noexcept {
    for (const SsidRecord &record : records) {
        if (ssid.size() >= record.text.size()) return -1;  // all texts are of one length
        if (beginsIgnoringCase(record.text, ssid)) return static_cast<int32_t>(record.packageIndex);
    }
    return -1;
}

bool readSsidMap(ByteCursor &stream, MapHeader &header, SsidMap &map) {
    size_t budget = kLargestMapBytes;
    return readHeader(stream, header) && readBody(stream, budget, map);
}

bool readChidMap(ByteCursor &stream, ChidMap &map) {
    map = {};
    uint32_t count = 0;
    if (!readHeader(stream, map.header) || !stream.u32(count)) return false;
    size_t budget = kLargestMapBytes;
    for (; count > 0; --count) {
        ChidGroup group;
        if (budget < sizeof group) return false;
        budget -= sizeof group;
        if (!stream.u32(group.word) || !readBody(stream, budget, group.map)) return false;
        map.groups.push_back(std::move(group));
    }
    return true;
}

std::vector<uint8_t> writeSsidMap(const MapHeader &header, const SsidMap &map) {
    ByteWriter out;
    out.bytes(header);
    writeBody(out, map);
    return out.release();
}

std::vector<uint8_t> writeChidMap(const ChidMap &map) {
    ByteWriter out;
    out.bytes(map.header);
    out.u32(static_cast<uint32_t>(map.groups.size()));
    for (const ChidGroup &group : map.groups) {
        out.u32(group.word);
        writeBody(out, group.map);
    }
    return out.release();
}

}  // namespace vxcomn
