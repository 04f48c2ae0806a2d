// SPDX-License-Identifier: MIT
#include "preset/zip_directory.h"

#include <algorithm>
#include <vector>

namespace vxcomn {
namespace {

// What a local header is read ahead for, beyond the name's length: the extra fields that ordinary zip programs write there.
constexpr uint64_t kUsualExtraBytes = 64;

uint32_t wordAt(const uint8_t *bytes) {
    return bytes[0] | uint32_t{bytes[1]} << 8 | uint32_t{bytes[2]} << 16 | uint32_t{bytes[3]} << 24;
}

char foldAscii(char c) noexcept {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - ('a' - 'A')) : c;
}

// The record that `tail`, the file's last bytes, holds last; its place in the tail, or the tail's size if there is none.
size_t findEndRecord(std::span<const uint8_t> tail) {
    for (size_t at = tail.size() - kEndBytes + 1; at-- > 0;) {
        if (wordAt(tail.data() + at) == kEndSignature) return at;
    }
    return tail.size();
}

}  // namespace

const char *ReadZipEndRecord(ByteSource &file, ZipEndRecord &record) {
    const std::optional<uint64_t> size = file.size();
    if (!size) return "Couldn't go to end of zip file!";
    if (*size < kSmallestZip) return "Too small file to be a zip!";
    // An archive without a comment ends with its record, so that one small read finds it; the longer search is for the others.
    std::vector<uint8_t> tail(kEndBytes);
    size_t at = 0;
    for (const size_t reach : {kEndBytes, static_cast<size_t>(std::min<uint64_t>(*size, kEndSearchBytes))}) {
        tail.resize(reach);
        if (!file.seek(*size - reach)) return "Cannot seek in zip file!";
        if (file.readAt(*size - reach, tail.data(), reach) != reach) return "Couldn't read end of zip file!";
        at = findEndRecord(tail);
        if (at < tail.size()) break;
    }
    if (at == tail.size()) return "End record signature not found in zip!";
    record.position = *size - tail.size() + at;
    ByteCursor fields(std::span<const uint8_t>(tail).subspan(at + kEndDiskOffset));
    uint32_t directoryBytes = 0;
    fields.u16(record.disk);
    fields.u16(record.centralDirectoryDisk);
    fields.u16(record.entriesOnDisk);
    fields.u16(record.totalEntries);
    fields.u32(directoryBytes);
    fields.u32(record.centralDirectoryOffset);
    if (record.disk != 0 || record.centralDirectoryDisk != 0 || record.entriesOnDisk != record.totalEntries) {
        return "Multifile zips not supported!";
    }
    return nullptr;
}

const char *readZipHeader(ByteCursor &stream, size_t nameLimit, ZipHeader &header) {
    header.name = {};  // the one before may lie in a window that the next take gives up
    const uint8_t *const bytes = stream.take(kCentralBytes);
    if (bytes == nullptr) return "Couldn't read enough bytes for JZGlobalFileHeader.";
    if (wordAt(bytes) != kCentralSignature) return "Zip file signature is not valid.";
    const std::span<const uint8_t> fields(bytes, kCentralBytes);
    uint16_t extraLength = 0, commentLength = 0;
    ByteCursor lengths(fields.subspan(kCentralNameLengthOffset));
    lengths.u16(header.nameLength);
    lengths.u16(extraLength);
    lengths.u16(commentLength);
    ByteCursor(fields.subspan(kCentralMethodOffset)).u16(header.method);
    ByteCursor(fields.subspan(kCentralCrcOffset)).u32(header.crc);
    ByteCursor(fields.subspan(kCentralSizeOffset)).u32(header.size);
    ByteCursor(fields.subspan(kCentralLocalOffset)).u32(header.localOffset);
    if (header.nameLength >= kNameLengthLimit) return "Zip file name length is greate that 65536.";

    const size_t wanted = std::min<size_t>(header.nameLength, nameLimit);
    const std::span<const uint8_t> name = stream.takeUpTo(wanted);
    header.name = {reinterpret_cast<const char *>(name.data()), name.size()};
    header.name = header.name.substr(0, header.name.find('\0'));
    if (name.size() < wanted) return "Failed to read zip file name.";
    const uint64_t next = stream.position() + (header.nameLength - wanted) + extraLength + commentLength;
    if (!stream.seek(next)) return "Failed to read zip file name.";
    return header.name.empty() ? "" : nullptr;
}

bool seekZipEntry(ByteCursor &stream, const ZipHeader &header) {
    if (!stream.seek(header.localOffset)) return false;
    stream.expectUpTo(uint64_t{header.localOffset} + kLocalBytes + header.nameLength + kUsualExtraBytes + header.size);
    uint16_t nameLength = 0, extraLength = 0;
    // Kept: the local header's signature is not looked at, and one that is cut off counts as one without a name.
    if (const uint8_t *const bytes = stream.take(kLocalBytes)) {
        ByteCursor lengths(std::span<const uint8_t>(bytes, kLocalBytes).subspan(kLocalNameLengthOffset));
        lengths.u16(nameLength);
        lengths.u16(extraLength);
    }
    return stream.seek(stream.position() + nameLength + extraLength);
}

bool beginsIgnoringCase(std::string_view text, std::string_view start) noexcept {
    if (text.size() < start.size()) return false;
    for (size_t i = 0; i < start.size(); ++i) {
        if (foldAscii(text[i]) != foldAscii(start[i])) return false;
    }
    return true;
}

}  // namespace vxcomn
