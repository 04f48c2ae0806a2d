// SPDX-License-Identifier: MIT
#include "tools/vx/riff_writer.h"

#include <algorithm>
#include <bit>

#include "tools/vx/failure.h"
#include "tools/vx/quantise.h"

namespace vx {

namespace {

constexpr uint64_t kUnknown = UINT32_MAX;
constexpr uint64_t kMostDataBytes = UINT32_MAX - 1024;  // the header and the padding must fit into the RIFF size as well
constexpr uint32_t kMono = 0x4;
constexpr uint32_t kStereo = 0x3;
constexpr uint8_t kSubformatTail[14] = {0x00, 0x00, 0x00, 0x00, 0x10, 0x00, 0x80, 0x00, 0x00, 0xAA, 0x00, 0x38, 0x9B, 0x71};

void put(std::vector<uint8_t> &bytes, uint64_t value, int count) {
    for (int i = 0; i < count; ++i) bytes.push_back(static_cast<uint8_t>(value >> 8 * i));
}

void putId(std::vector<uint8_t> &bytes, const char *id) {
    bytes.insert(bytes.end(), id, id + 4);
}

int bytesOf(SampleType type) {
    return type == SampleType::pcm16 ? 2 : type == SampleType::pcm24 ? 3 : 4;
}

bool isPlain(const AudioFormat &format, SampleType type) {
    const bool plainSpeakers =
        format.mask == 0 || (format.channels == 1 && format.mask == kMono) || (format.channels == 2 && format.mask == kStereo);
    return plainSpeakers && format.channels <= 2 && type != SampleType::pcm24;
}

}  // namespace

RiffWriter::RiffWriter(OutputFile &output, const AudioFormat &format, SampleType type, std::optional<uint64_t> frames)
    : output_(output), format_(format), type_(type) {
    const uint64_t frameBytes = static_cast<uint64_t>(format.channels) * static_cast<uint64_t>(bytesOf(type));
    announcedBytes_ = frames ? *frames * frameBytes : kUnknown;
    if (frames) checkLength(announcedBytes_);
    const std::vector<uint8_t> head = header(announcedBytes_);
    output_.write(head.data(), head.size());
}

void RiffWriter::checkLength(uint64_t dataBytes) const {
    if (dataBytes > kMostDataBytes)
        throw Failure(ExitStatus::system, output_.path() + ": a WAV file holds at most 4 GiB; use fewer --seconds or fewer --bits");
}

std::vector<uint8_t> RiffWriter::header(uint64_t dataBytes) const {
    const bool plain = isPlain(format_, type_);
    const bool isFloat = type_ == SampleType::float32;
    const int sampleBytes = bytesOf(type_);
    const auto frameBytes = static_cast<uint64_t>(format_.channels * sampleBytes);
    const auto rate = static_cast<uint64_t>(format_.sampleRate);
    const uint16_t tag = isFloat ? 3 : 1;
    std::vector<uint8_t> bytes;
    putId(bytes, "RIFF");
    const size_t riffSize = bytes.size();
    put(bytes, 0, 4);
    putId(bytes, "WAVE");
    putId(bytes, "fmt ");
    put(bytes, plain ? (isFloat ? 18 : 16) : 40, 4);
    put(bytes, plain ? tag : 0xFFFE, 2);
    put(bytes, static_cast<uint64_t>(format_.channels), 2);
    put(bytes, rate, 4);
    put(bytes, rate * frameBytes, 4);
    put(bytes, frameBytes, 2);
    put(bytes, static_cast<uint64_t>(8 * sampleBytes), 2);
    if (plain && isFloat) put(bytes, 0, 2);
    if (!plain) {
        put(bytes, 22, 2);
        put(bytes, static_cast<uint64_t>(8 * sampleBytes), 2);
        put(bytes, format_.mask, 4);
        put(bytes, tag, 2);
        bytes.insert(bytes.end(), std::begin(kSubformatTail), std::end(kSubformatTail));
    }
    if (isFloat) {
        putId(bytes, "fact");
        put(bytes, 4, 4);
        put(bytes, dataBytes == kUnknown ? kUnknown : dataBytes / frameBytes, 4);
    }
    putId(bytes, "data");
    put(bytes, dataBytes, 4);
    const uint64_t whole = dataBytes == kUnknown ? kUnknown : bytes.size() - 8 + dataBytes + dataBytes % 2;
    for (size_t i = 0; i < 4; ++i) bytes[riffSize + i] = static_cast<uint8_t>(whole >> 8 * i);
    return bytes;
}

void RiffWriter::write(const float *interleaved, size_t count) {
    const size_t samples = count * static_cast<size_t>(format_.channels);
    bytes_.clear();
    for (size_t i = 0; i < samples; ++i) {
        if (type_ == SampleType::float32)
            put(bytes_, std::bit_cast<uint32_t>(interleaved[i]), 4);
        else if (type_ == SampleType::pcm24)
            put(bytes_, static_cast<uint32_t>(quantise(interleaved[i], 24)), 3);
        else
            put(bytes_, static_cast<uint32_t>(quantise(interleaved[i], 16)), 2);
    }
    dataBytes_ += bytes_.size();
    checkLength(dataBytes_);
    output_.write(bytes_.data(), bytes_.size());
}

void RiffWriter::finish() {
    if (dataBytes_ % 2 != 0) output_.write("", 1);
    if (output_.isRegular() && dataBytes_ != announcedBytes_) {
        const std::vector<uint8_t> head = header(dataBytes_);
        output_.seek(0);
        output_.write(head.data(), head.size());
    }
    output_.closeStream();
}

}  // namespace vx
