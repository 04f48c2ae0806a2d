// SPDX-License-Identifier: MIT
#include "tools/vx/riff_reader.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr uint16_t kTagPcm = 1;
constexpr uint16_t kTagFloat = 3;
constexpr uint16_t kTagExtensible = 0xFFFE;
constexpr size_t kPlainFormat = 16;
constexpr size_t kExtensibleFormat = 40;
constexpr uint32_t kLongestFormat = 4096;
// A pipe's writer does not know its length and announces something huge; from here on it counts as "until the end".
constexpr uint32_t kHugeData = 0x7FFFF000;
constexpr size_t kFramesAtOnce = 4096;
// The last 14 bytes of the subformat; the first two are the tag.
constexpr std::array<uint8_t, 14> kSubformatTail = {0x00, 0x00, 0x00, 0x00, 0x10, 0x00, 0x80,
                                                    0x00, 0x00, 0xAA, 0x00, 0x38, 0x9B, 0x71};

uint16_t word16(const uint8_t *bytes) {
    return static_cast<uint16_t>(bytes[0] | bytes[1] << 8);
}

uint32_t word32(const uint8_t *bytes) {
    return word16(bytes) | static_cast<uint32_t>(word16(bytes + 2)) << 16;
}

uint64_t word64(const uint8_t *bytes) {
    return word32(bytes) | static_cast<uint64_t>(word32(bytes + 4)) << 32;
}

bool isId(const uint8_t *bytes, const char *id) {
    return std::memcmp(bytes, id, 4) == 0;
}

// Four letters for a message; what cannot be printed becomes a dot.
std::string idText(const uint8_t *bytes) {
    std::string text;
    for (int i = 0; i < 4; ++i) text += bytes[i] >= 0x20 && bytes[i] < 0x7F ? static_cast<char>(bytes[i]) : '.';
    return text;
}

}  // namespace

RiffReader::RiffReader(std::string path, std::FILE *stream, File owned)
    : path_(std::move(path)), owned_(std::move(owned)), stream_(stream) {
    parse();
}

void RiffReader::fail(const std::string &what) const {
    throw Failure(ExitStatus::input, path_ + ": offset " + std::to_string(offset_) + ": " + what);
}

void RiffReader::need(uint8_t *bytes, size_t count, const char *what) {
    const size_t got = std::fread(bytes, 1, count, stream_);
    offset_ += got;
    if (got != count) fail(std::string("the file ends inside ") + what + "; expected a complete WAV file");
}

void RiffReader::skip(uint64_t count, const char *what) {
    std::array<uint8_t, 4096> scratch;
    while (count > 0) {
        const size_t part = static_cast<size_t>(std::min<uint64_t>(count, scratch.size()));
        need(scratch.data(), part, what);
        count -= part;
    }
}

void RiffReader::parse() {
    uint8_t head[12];
    need(head, sizeof(head), "the RIFF header");
    if (!isId(head, "RIFF") || !isId(head + 8, "WAVE"))
        fail("found \"" + idText(head) + "\" and \"" + idText(head + 8) + "\", expected \"RIFF\" and \"WAVE\" of a WAV file");
    for (bool formatSeen = false;;) {
        uint8_t chunk[8];
        need(chunk, sizeof(chunk), formatSeen ? "the chunks ahead of \"data\"" : "the chunks ahead of \"fmt \"");
        const uint32_t size = word32(chunk + 4);
        if (isId(chunk, "data")) {
            if (!formatSeen) fail("the samples come before their format (\"data\" before \"fmt \")");
            beginData(size);
            return;
        }
        if (isId(chunk, "fmt ")) {
            if (formatSeen) fail("a second \"fmt \" chunk");
            readFormat(size);
            formatSeen = true;
        } else {
            skip(size, ("the chunk \"" + idText(chunk) + "\"").c_str());
        }
        if (size % 2 != 0) skip(1, "the padding of a chunk");
    }
}

void RiffReader::readFormat(uint32_t size) {
    if (size < kPlainFormat || size > kLongestFormat) fail(textf("the format chunk has %u bytes, expected 16 to 4096", size));
    uint8_t bytes[kExtensibleFormat] = {};
    const size_t taken = std::min<size_t>(size, kExtensibleFormat);
    need(bytes, taken, "the format chunk");
    uint16_t tag = word16(bytes);
    format_.channels = word16(bytes + 2);
    format_.sampleRate = static_cast<int>(std::min<uint32_t>(word32(bytes + 4), INT32_MAX));
    const int bits = word16(bytes + 14);
    if (tag == kTagExtensible) {
        if (size < kExtensibleFormat) fail(textf("the extensible format chunk has %u bytes, expected 40", size));
        if (std::memcmp(bytes + 26, kSubformatTail.data(), kSubformatTail.size()) != 0)
            fail("an unknown subformat; vx reads PCM and float");
        tag = word16(bytes + 24);
        format_.mask = word32(bytes + 20);
    }
    chooseCoding(tag, bits);
    checkBounds(path_, format_);
    if (std::popcount(format_.mask) != format_.channels) format_.mask = 0;
    frameBytes_ = static_cast<size_t>(format_.channels) * static_cast<size_t>(bits / 8);
    if (word16(bytes + 12) != frameBytes_)
        fail(
            textf("a frame is said to have %d bytes, expected %d channels of %d bits", word16(bytes + 12), format_.channels, bits));
    skip(size - taken, "the format chunk");
}

void RiffReader::chooseCoding(uint16_t tag, int bits) {
    if (tag == kTagPcm && bits == 8)
        coding_ = Coding::unsigned8;
    else if (tag == kTagPcm && bits == 16)
        coding_ = Coding::pcm16;
    else if (tag == kTagPcm && bits == 24)
        coding_ = Coding::pcm24;
    else if (tag == kTagPcm && bits == 32)
        coding_ = Coding::pcm32;
    else if (tag == kTagFloat && bits == 32)
        coding_ = Coding::float32;
    else if (tag == kTagFloat && bits == 64)
        coding_ = Coding::float64;
    else
        fail(textf("format tag %u with %d bits; expected PCM (1) of 8, 16, 24 or 32 bits or float (3) of 32 or 64", tag, bits));
    format_.encoding = textf("WAV, %d-bit %s", bits, tag == kTagFloat ? "float" : "PCM");
}

void RiffReader::beginData(uint32_t size) {
    dataOffset_ = offset_;
    const std::optional<uint64_t> whole = fileSize(stream_);
    const bool endless = whole ? size == UINT32_MAX : size == 0 || size >= kHugeData;
    if (whole) present_ = (*whole - std::min(*whole, dataOffset_)) / frameBytes_;
    if (endless) {
        announced_ = present_;
        return;
    }
    announced_ = size / frameBytes_;
    if (present_) present_ = std::min(*present_, *announced_);
}

size_t RiffReader::read(float *interleaved, size_t count) {
    size_t done = 0;
    while (done < count) {
        size_t part = std::min(count - done, kFramesAtOnce);
        if (announced_) part = static_cast<size_t>(std::min<uint64_t>(part, *announced_ - std::min(*announced_, position_)));
        if (part == 0) break;
        bytes_.resize(part * frameBytes_);
        const size_t got = std::fread(bytes_.data(), 1, bytes_.size(), stream_) / frameBytes_;
        const size_t samples = static_cast<size_t>(format_.channels);
        convert(bytes_.data(), interleaved + done * samples, got * samples);
        position_ += got;
        done += got;
        if (got == part) continue;
        if (announced_) failTruncated(path_, *announced_, position_);
        break;
    }
    return done;
}

bool RiffReader::rewind() {
    std::clearerr(stream_);
    if (!fileSize(stream_) || !seekFile(stream_, dataOffset_)) return false;
    position_ = 0;
    return true;
}

void RiffReader::convert(const uint8_t *bytes, float *samples, size_t count) const {
    switch (coding_) {
        case Coding::unsigned8:
            for (size_t i = 0; i < count; ++i) samples[i] = static_cast<float>(bytes[i] - 128) * 0x1p-7F;
            break;
        case Coding::pcm16:
            for (size_t i = 0; i < count; ++i)
                samples[i] = static_cast<float>(static_cast<int16_t>(word16(bytes + 2 * i))) * 0x1p-15F;
            break;
        case Coding::pcm24:
            for (size_t i = 0; i < count; ++i) {
                const uint32_t word = static_cast<uint32_t>(word16(bytes + 3 * i)) << 8 | static_cast<uint32_t>(bytes[3 * i + 2])
                                                                                              << 24;
                samples[i] = static_cast<float>(static_cast<int32_t>(word)) * 0x1p-31F;
            }
            break;
        case Coding::pcm32:
            for (size_t i = 0; i < count; ++i)
                samples[i] = static_cast<float>(static_cast<int32_t>(word32(bytes + 4 * i))) * 0x1p-31F;
            break;
        case Coding::float32:
            for (size_t i = 0; i < count; ++i) samples[i] = std::bit_cast<float>(word32(bytes + 4 * i));
            break;
        case Coding::float64:
            for (size_t i = 0; i < count; ++i) samples[i] = static_cast<float>(std::bit_cast<double>(word64(bytes + 8 * i)));
            break;
    }
}

}  // namespace vx
