// SPDX-License-Identifier: MIT
//
// The packed little-endian streams of the library's diagnostic commands.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>
#include <vector>

#include "tools/vx/failure.h"

namespace vx {

class DataWriter {
  public:
    DataWriter &u8(uint32_t value) { return put(value, 1); }
    DataWriter &u16(uint32_t value) { return put(value, 2); }
    DataWriter &u32(uint32_t value) { return put(value, 4); }

    const std::vector<uint8_t> &bytes() const { return bytes_; }

  private:
    DataWriter &put(uint32_t value, int count) {
        for (int i = 0; i < count; ++i) bytes_.push_back(static_cast<uint8_t>(value >> 8 * i));
        return *this;
    }

    std::vector<uint8_t> bytes_;
};

// Fails where the library wrote less than is read: it refused the command.
class DataReader {
  public:
    explicit DataReader(std::vector<uint8_t> bytes) : bytes_(std::move(bytes)) {}

    int32_t i32() { return static_cast<int32_t>(take(4)); }
    float f32() { return std::bit_cast<float>(static_cast<uint32_t>(take(4))); }
    // An address in this process.
    const float *floats() { return reinterpret_cast<const float *>(static_cast<uintptr_t>(take(8))); }

  private:
    uint64_t take(size_t count) {
        if (bytes_.size() - position_ < count)
            throw Failure(ExitStatus::input, "the library refused a measuring command; its memory may be short");
        uint64_t value = 0;
        for (size_t i = 0; i < count; ++i) value |= uint64_t{bytes_[position_ + i]} << 8 * i;
        position_ += count;
        return value;
    }

    std::vector<uint8_t> bytes_;
    size_t position_ = 0;
};

}  // namespace vx
