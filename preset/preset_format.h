// SPDX-License-Identifier: MIT
//
// The preset format, Preset.bin: the factory state of one combination of endpoint index, effect slot, I/O configuration and content
// type. The reader, the writer and the tools share these definitions.
//
//     preset  := version:u32 hash:u32[8] rest
//     rest    := long header, then name, engine record and stream where it says      (version below kShortHeaderVersion)
//              | stream                                                              (from kShortHeaderVersion on)
//     header  := bypassAll:u32 namePos:u32 nameSize:u32 configPos:u32 configSize:u32
//                globalPos:u32 globalSize:u32 componentPos:u32 componentSize:u32
//     stream  := block*                                                              up to the end of the image
//     block   := componentId:i32 paramIdMin:i32 paramIdMax:i32 entry*                one entry for each id, ascending
//     entry   := size:u32 byte[size]                                                 size 0: this id has no value
//
// All numbers are little-endian. Positions count bytes from the image's first byte. There is no magic number: the version word is
// the only identification. The stream begins at globalPos and holds global and component parameters alike: globalSize, componentPos
// and componentSize tell a reader nothing. A block whose last id lies below its first has no entries.
//
// The hash is the SHA-256 digest of the image with its 32 hash bytes taken as zeros, as eight words, so that it depends on
// everything else in the file. Readers take it for an opaque identity and never check it.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "vxcomn/engine.h"

namespace vxcomn {

inline constexpr uint32_t kLowestPresetVersion = 0x100002;  // below it nothing is read
inline constexpr uint32_t kShortHeaderVersion = 0x1000010;  // from it on no field stands behind the hash
inline constexpr uint32_t kHashOffset = 4;
inline constexpr uint32_t kHashBytes = 32;
inline constexpr uint32_t kShortHeaderBytes = 36;
inline constexpr uint32_t kLongHeaderBytes = 72;
inline constexpr uint32_t kLongHeaderWords = 9;
inline constexpr uint32_t kLargestValueBytes = 0x10000;
inline constexpr uint32_t kEngineConfigBytes = sizeof(EngineConfig);
inline constexpr uint32_t kEngineConfigHeadBytes = offsetof(EngineConfig, Components);
inline constexpr uint32_t kLongestEngineName = 512;  // characters of the wide name

// The eight words of the digest, in file order.
using PresetHash = std::array<uint32_t, 8>;

// The long header's words in file order.
struct LongHeader {
    uint32_t bypassAll = 0;  // for the log only; what counts is the parameter kBypassAllParam of the global component
    uint32_t engineShortNamePos = 0;
    uint32_t engineShortNameSize = 0;  // counts the terminating NUL
    uint32_t engineConfigPos = 0;
    uint32_t engineConfigSize = 0;
    uint32_t globalParamsPos = 0;
    uint32_t globalParamsSize = 0;
    uint32_t componentParamsPos = 0;
    uint32_t componentParamsSize = 0;

    friend bool operator==(const LongHeader &, const LongHeader &) = default;
};

// The identity that a preset without a long header stands for.
inline constexpr const char *kDefaultEngineName = "VXORLO";
inline constexpr EngineConfig kDefaultEngineConfig = {60, 0, 6, {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}}};

inline constexpr int32_t kGlobalComponent = -1;
inline constexpr int32_t kBypassAllParam = -18;     // one byte, nonzero: bypassed
inline constexpr int32_t kCleanBuffersParam = -33;  // a command to the engine, taken out of the store once delivered
inline constexpr int32_t kAllChannels = -1;

}  // namespace vxcomn
