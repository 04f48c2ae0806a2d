// SPDX-License-Identifier: MIT
//
// The preset package, "VXAPODATU.<device id>.zip": an ordinary zip archive on one disk that holds presets for one device and, it
// may be, for several machine models. The reader, the writer and the tools share these definitions.
//
//     first entry    "SSIDMAP.bin": which package index a subsystem id takes
//     second entry   "CHIDMAP.bin": the same by computer hardware id; read, and compared with nothing
//     further ones   <packageIndex>/<endpointIndex>/<APOType>/<IOConfig>/<ContentType>/Preset.bin, slashes forward
//
// Entries are stored, without compression. Names compare without regard to the case of ASCII letters.
//
//     SSIDMAP.bin := header:byte[8] body
//     CHIDMAP.bin := header:byte[8] groups:u32 { word:u32 body } * groups
//     body        := count:u32 [ recordSize:u32 record * count ]                     no record size where count is 0
//     record      := packageIndex:u32 text:byte[recordSize - 4]                      not necessarily NUL-terminated
//
// All numbers are little-endian. Offsets below are those of the zip application note.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace vxcomn {

inline constexpr std::string_view kSsidMapName = "SSIDMAP.bin";
inline constexpr std::string_view kChidMapName = "CHIDMAP.bin";
inline constexpr std::string_view kPresetFileName = "Preset.bin";

inline constexpr uint32_t kEndSignature = 0x06054b50;
inline constexpr size_t kEndBytes = 22;
inline constexpr size_t kEndDiskOffset = 4;
inline constexpr size_t kEndSearchBytes = 65536;  // the record, with the longest comment that is looked behind
inline constexpr size_t kSmallestZip = 23;        // below it a file is no zip

inline constexpr uint32_t kCentralSignature = 0x02014b50;
inline constexpr size_t kCentralBytes = 46;
inline constexpr size_t kCentralMethodOffset = 10;
inline constexpr size_t kCentralCrcOffset = 16;
inline constexpr size_t kCentralSizeOffset = 24;
inline constexpr size_t kCentralNameLengthOffset = 28;
inline constexpr size_t kCentralLocalOffset = 42;

inline constexpr uint32_t kLocalSignature = 0x04034b50;
inline constexpr size_t kLocalBytes = 30;
inline constexpr size_t kLocalNameLengthOffset = 26;

inline constexpr uint16_t kNameLengthLimit = 65535;  // a header with this name length is refused
inline constexpr size_t kMapNameBytes = 127;         // read of the first two names
inline constexpr size_t kEntryNameBytes = 2047;      // read of the others
inline constexpr uint32_t kFewestEntries = 3;        // fewer hold no preset

inline constexpr size_t kMapHeaderBytes = 8;
inline constexpr uint32_t kRecordIndexBytes = 4;
// The most bytes that a map may take; a map of a machine model each would name some hundred thousand.
inline constexpr size_t kLargestMapBytes = 4 << 20;

}  // namespace vxcomn
