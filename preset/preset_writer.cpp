// SPDX-License-Identifier: MIT
#include "preset/preset_writer.h"

#include <algorithm>

#include "preset/byte_cursor.h"
#include "preset/sha256.h"

namespace vxcomn {
namespace {

constexpr uint32_t LongHeader::*kHeaderWords[kLongHeaderWords] = {
    &LongHeader::bypassAll,        &LongHeader::engineShortNamePos, &LongHeader::engineShortNameSize,
    &LongHeader::engineConfigPos,  &LongHeader::engineConfigSize,   &LongHeader::globalParamsPos,
    &LongHeader::globalParamsSize, &LongHeader::componentParamsPos, &LongHeader::componentParamsSize,
};

void writeBlock(ByteWriter &out, const PresetBlock &block) {
    out.i32(block.componentId);
    out.i32(block.paramIdMin);
    out.i32(block.paramIdMax);
    for (const std::vector<uint8_t> &value : block.values) {
        out.u32(static_cast<uint32_t>(value.size()));
        out.bytes(value);
    }
}

struct Stream {
    std::vector<uint8_t> bytes;
    uint32_t globalBytes = 0;  // those of the blocks before the first of another component
};

Stream writeStream(const std::vector<PresetBlock> &blocks) {
    ByteWriter out;
    Stream stream;
    bool global = true;
    for (const PresetBlock &block : blocks) {
        global = global && block.componentId == kGlobalComponent;
        writeBlock(out, block);
        if (global) stream.globalBytes = static_cast<uint32_t>(out.position());
    }
    stream.bytes = out.release();
    return stream;
}

// Header, name, record, stream, one behind the other.
LongHeader usualLayout(const PresetDocument &document, const Stream &stream) {
    LongHeader header;
    header.bypassAll = document.bypassAllWord;
    header.engineShortNamePos = kLongHeaderBytes;
    header.engineShortNameSize = static_cast<uint32_t>(document.engineName.size());
    header.engineConfigPos = header.engineShortNamePos + header.engineShortNameSize;
    header.engineConfigSize = static_cast<uint32_t>(document.engineConfig.size());
    header.globalParamsPos = header.engineConfigPos + header.engineConfigSize;
    header.globalParamsSize = stream.globalBytes;
    header.componentParamsPos = header.globalParamsPos + stream.globalBytes;
    header.componentParamsSize = static_cast<uint32_t>(stream.bytes.size()) - stream.globalBytes;
    return header;
}

// The bytes from `position` on, at most `size`, that lie in the image.
std::vector<uint8_t> slice(std::span<const uint8_t> image, uint32_t position, uint32_t size) {
    if (position >= image.size()) return {};
    const auto part = image.subspan(position, std::min<size_t>(size, image.size() - position));
    return {part.begin(), part.end()};
}

// Reads one block; false if it is not whole, or is one that a loader would stumble over.
bool readBlock(ByteCursor &in, PresetBlock &block) {
    if (!in.i32(block.componentId) || !in.i32(block.paramIdMin) || !in.i32(block.paramIdMax)) return false;
    for (int64_t paramId = block.paramIdMin; paramId <= block.paramIdMax; ++paramId) {
        uint32_t size = 0;
        if (!in.u32(size) || size > kLargestValueBytes) return false;
        const uint8_t *const value = in.take(size);
        if (value == nullptr) return false;
        block.values.emplace_back(value, value + size);
    }
    return true;
}

// What the fields do not account for: where the image written from them differs from the image, its hash aside.
std::vector<PresetGap> findGaps(std::span<const uint8_t> image, std::span<const uint8_t> written) {
    const auto accounted = [&](size_t at) {
        return (at >= kHashOffset && at < kShortHeaderBytes) || (at < written.size() && written[at] == image[at]);
    };
    std::vector<PresetGap> gaps;
    for (size_t at = 0; at < image.size(); ++at) {
        if (accounted(at)) continue;
        PresetGap gap{static_cast<uint32_t>(at), {}};
        for (; at < image.size() && !accounted(at); ++at) gap.bytes.push_back(image[at]);
        gaps.push_back(std::move(gap));
    }
    return gaps;
}

}  // namespace

PresetHash presetDigest(std::span<const uint8_t> image) {
    std::vector<uint8_t> copy(image.begin(), image.end());
    const size_t end = std::min<size_t>(copy.size(), kHashOffset + kHashBytes);
    for (size_t i = kHashOffset; i < end; ++i) copy[i] = 0;
    return sha256(copy);
}

std::vector<uint8_t> writePreset(const PresetDocument &document) {
    const Stream stream = writeStream(document.blocks);
    ByteWriter image;
    image.u32(document.version);
    image.zeros(kHashBytes);
    if (document.hasLongHeader()) {
        const LongHeader header = document.header.value_or(usualLayout(document, stream));
        for (const auto word : kHeaderWords) image.u32(header.*word);
        // Where pieces overlap, the later one stands.
        image.put(header.engineShortNamePos, document.engineName);
        image.put(header.engineConfigPos, document.engineConfig);
        image.put(header.globalParamsPos, stream.bytes);
    } else {
        image.bytes(stream.bytes);
    }
    for (const PresetGap &gap : document.gaps) image.put(gap.position, gap.bytes);
    const PresetHash hash = document.hash.value_or(presetDigest(image.view()));
    for (size_t i = 0; i < hash.size(); ++i) image.putU32(kHashOffset + 4 * i, hash[i]);
    return image.release();
}

PresetParse parsePreset(std::span<const uint8_t> image, PresetDocument &document) {
    document = {};
    ByteCursor in(image);
    if (!in.u32(document.version)) return PresetParse::versionMissing;
    if (document.version < kLowestPresetVersion) return PresetParse::versionTooLow;
    PresetHash hash{};
    for (uint32_t &word : hash) {
        if (!in.u32(word)) return PresetParse::headerCutOff;
    }
    if (hash != presetDigest(image)) document.hash = hash;

    uint32_t streamPosition = kShortHeaderBytes;
    LongHeader header;
    if (document.hasLongHeader()) {
        for (const auto word : kHeaderWords) {
            if (!in.u32(header.*word)) return PresetParse::headerCutOff;
        }
        document.bypassAllWord = header.bypassAll;
        document.engineName = slice(image, header.engineShortNamePos, header.engineShortNameSize);
        document.engineConfig = slice(image, header.engineConfigPos, header.engineConfigSize);
        streamPosition = header.globalParamsPos;
    }
    if (in.seek(streamPosition)) {
        while (in.position() < image.size()) {
            PresetBlock block;
            if (!readBlock(in, block)) break;
            document.blocks.push_back(std::move(block));
        }
    }
    if (document.hasLongHeader() && header != usualLayout(document, writeStream(document.blocks))) document.header = header;
    document.gaps = findGaps(image, writePreset(document));
    return PresetParse::parsed;
}

}  // namespace vxcomn
