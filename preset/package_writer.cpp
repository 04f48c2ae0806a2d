// SPDX-License-Identifier: MIT
#include "preset/package_writer.h"

#include <array>

#include "preset/byte_cursor.h"
#include "preset/package_format.h"

namespace vxcomn {
namespace {

constexpr uint16_t kVersionNeeded = 10;  // 1.0: stored entries
constexpr uint16_t kUtf8Names = 0x0800;  // general purpose flag
constexpr uint16_t kStored = 0;
constexpr uint16_t kNoTime = 0;
constexpr uint16_t kFirstDate = 0x0021;  // 1 January 1980, so that equal input gives equal archives
constexpr size_t kMostEntries = 65535;

constexpr std::array<uint32_t, 256> kChecksumTable = [] {
    std::array<uint32_t, 256> table{};
    for (uint32_t i = 0; i < table.size(); ++i) {
        uint32_t remainder = i;
        for (int bit = 0; bit < 8; ++bit) remainder = remainder >> 1 ^ ((remainder & 1) != 0 ? 0xEDB88320u : 0u);
        table[i] = remainder;
    }
    return table;
}();

// The fields that a local and a central header share.
void writeShared(ByteWriter &out, const PackageEntry &entry) {
    out.u16(kVersionNeeded);
    out.u16(kUtf8Names);
    out.u16(kStored);
    out.u16(kNoTime);
    out.u16(kFirstDate);
    out.u32(zipChecksum(entry.bytes));
    out.u32(static_cast<uint32_t>(entry.bytes.size()));  // compressed
    out.u32(static_cast<uint32_t>(entry.bytes.size()));
    out.u16(static_cast<uint16_t>(entry.name.size()));
    out.u16(0);  // no extra field
}

void writeName(ByteWriter &out, const PackageEntry &entry) {
    out.bytes({reinterpret_cast<const uint8_t *>(entry.name.data()), entry.name.size()});
}

bool fits(std::span<const PackageEntry> entries) {
    uint64_t total = kEndBytes;
    for (const PackageEntry &entry : entries) {
        if (entry.name.size() >= kNameLengthLimit) return false;
        total += kLocalBytes + kCentralBytes + 2 * entry.name.size() + entry.bytes.size();
    }
    return entries.size() <= kMostEntries && total <= kLargestPackageBytes;
}

}  // namespace

uint32_t zipChecksum(std::span<const uint8_t> bytes) {
    uint32_t remainder = 0xFFFFFFFF;
    for (const uint8_t byte : bytes) remainder = remainder >> 8 ^ kChecksumTable[(remainder ^ byte) & 0xFF];
    return ~remainder;
}

std::optional<std::vector<uint8_t>> writePackage(std::span<const PackageEntry> entries) {
    if (!fits(entries)) return std::nullopt;
    ByteWriter out;
    std::vector<uint32_t> places;
    for (const PackageEntry &entry : entries) {
        places.push_back(static_cast<uint32_t>(out.position()));
        out.u32(kLocalSignature);
        writeShared(out, entry);
        writeName(out, entry);
        out.bytes(entry.bytes);
    }
    const auto directory = static_cast<uint32_t>(out.position());
    for (size_t i = 0; i < entries.size(); ++i) {
        out.u32(kCentralSignature);
        out.u16(kVersionNeeded);
        writeShared(out, entries[i]);
        out.u16(0);  // no comment
        out.u16(0);  // disk
        out.u16(0);  // internal attributes
        out.u32(0);  // external attributes
        out.u32(places[i]);
        writeName(out, entries[i]);
    }
    const auto end = static_cast<uint32_t>(out.position());
    out.u32(kEndSignature);
    out.u16(0);  // this disk
    out.u16(0);  // the directory's
    out.u16(static_cast<uint16_t>(entries.size()));
    out.u16(static_cast<uint16_t>(entries.size()));
    out.u32(end - directory);
    out.u32(directory);
    out.u16(0);  // no comment
    return out.release();
}

}  // namespace vxcomn
