// SPDX-License-Identifier: MIT
//
// A preset as a document, and the writer that makes images of it: what the tools and the tests compile, take apart and compare. The
// library itself never writes presets. parsePreset keeps everything that an image holds, so that writing what it gave back makes
// the same bytes again, for damaged images too. Control threads; allocates.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "preset/preset_format.h"

namespace vxcomn {

// A block's values for ascending ids from paramIdMin on; an empty one means that the id has no value.
struct PresetBlock {
    int32_t componentId = 0;
    int32_t paramIdMin = 0;
    int32_t paramIdMax = -1;
    std::vector<std::vector<uint8_t>> values;

    friend bool operator==(const PresetBlock &, const PresetBlock &) = default;
};

// Bytes at a place that no field accounts for.
struct PresetGap {
    uint32_t position = 0;
    std::vector<uint8_t> bytes;

    friend bool operator==(const PresetGap &, const PresetGap &) = default;
};

struct PresetDocument {
    uint32_t version = kShortHeaderVersion;
    std::optional<PresetHash> hash;     // computed if there is none
    uint32_t bypassAllWord = 0;         // long header only, like the next three
    std::vector<uint8_t> engineName;    // as stored, with its NUL
    std::vector<uint8_t> engineConfig;  // as stored
    std::optional<LongHeader> header;   // an unusual layout; laid out in order if there is none
    std::vector<PresetBlock> blocks;
    std::vector<PresetGap> gaps;

    bool hasLongHeader() const noexcept { return version < kShortHeaderVersion; }
};

// The digest of an image, as the format's hash field holds it.
PresetHash presetDigest(std::span<const uint8_t> image);

// The image of a document. Blocks are written as they are: what a damaged document says is what stands in the image.
std::vector<uint8_t> writePreset(const PresetDocument &document);

enum class PresetParse : uint8_t { parsed, versionMissing, versionTooLow, headerCutOff };

// Takes an image apart. Blocks up to the first that is not whole; the rest is a gap. The hash is left out where it is the digest,
// and the header where it is the usual layout.
PresetParse parsePreset(std::span<const uint8_t> image, PresetDocument &document);

}  // namespace vxcomn
