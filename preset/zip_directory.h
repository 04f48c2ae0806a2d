// SPDX-License-Identifier: MIT
//
// The zip structures of a package, read with checked bounds from one stream: the end record, the central headers in order, and the
// way to an entry's bytes. Nothing is decompressed and no method looked at. Names are data, never paths. Control threads.
#pragma once

#include <cstdint>
#include <string_view>

#include "preset/byte_cursor.h"
#include "preset/package_format.h"

namespace vxcomn {

struct ZipEndRecord {
    uint16_t disk = 0;
    uint16_t centralDirectoryDisk = 0;
    uint16_t entriesOnDisk = 0;
    uint16_t totalEntries = 0;
    uint32_t centralDirectoryOffset = 0;
    uint64_t position = 0;  // where the record was found
};

// Finds the end record: the last of its signatures in the file's last 65,536 bytes. Null for success, else the message for the
// standard error stream.
const char *ReadZipEndRecord(ByteSource &file, ZipEndRecord &record);

// A central header, called JZGlobalFileHeader in messages.
struct ZipHeader {
    std::string_view name;  // cut at the caller's limit and at a NUL; valid until the stream is read again
    uint32_t size = 0;      // uncompressed; the entry's, since entries are stored
    uint16_t method = 0;    // for the tools
    uint32_t crc = 0;       // for the tools
    uint32_t localOffset = 0;
    uint16_t nameLength = 0;  // as the header says
};

// Reads the header that the stream stands on, its name up to `nameLimit` bytes, and goes to the next. Null for success, else the
// reason; an empty name fails with an empty reason.
const char *readZipHeader(ByteCursor &stream, size_t nameLimit, ZipHeader &header);

// Goes to an entry's first byte, over its local header and whatever name and extra field stand there. Reads ahead up to the entry's
// end. False if the source refuses to seek.
bool seekZipEntry(ByteCursor &stream, const ZipHeader &header);

// Whether `text` begins with `start`, without regard to the case of ASCII letters.
bool beginsIgnoringCase(std::string_view text, std::string_view start) noexcept;

}  // namespace vxcomn
