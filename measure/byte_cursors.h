// SPDX-License-Identifier: MIT
//
// The two cursors over the byte streams of parameters and diagnostic commands: packed, little-endian, without header or alignment.
// Control threads.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace vxcomn {

// Reads off the front. Nothing is read past the end: a read that does not fit fails and leaves the cursor where it was.
class ByteReader {
  public:
    ByteReader(const uint8_t *data, size_t size) : data_(data), size_(data == nullptr ? 0 : size) {}

    template <class T>
    [[nodiscard]] bool read(T &value) {
        return readAll(&value, 1);
    }
    // Several in a row, until one does not fit.
    template <class T, class... Rest>
    [[nodiscard]] bool read(T &value, Rest &...rest) {
        return read(value) && read(rest...);
    }
    template <class T>
    bool readAll(T *values, size_t count) {
        static_assert(std::is_trivially_copyable_v<T>);
        if (count > (size_ - position_) / sizeof(T)) return false;
        std::memcpy(values, data_ + position_, count * sizeof(T));
        position_ += count * sizeof(T);
        return true;
    }

    bool holds(size_t bytes) const { return bytes <= size_ - position_; }
    size_t size() const { return size_; }
    size_t position() const { return position_; }

  private:
    const uint8_t *data_;
    size_t size_;
    size_t position_ = 0;
};

// Writes to the front of room that the caller has promised to be enough.
class ByteWriter {
  public:
    explicit ByteWriter(uint8_t *to) : to_(to) {}

    template <class T>
    void write(T value) {
        static_assert(std::is_trivially_copyable_v<T>);
        std::memcpy(to_ + position_, &value, sizeof value);
        position_ += sizeof value;
    }

    size_t position() const { return position_; }

  private:
    uint8_t *to_;
    size_t position_ = 0;
};

}  // namespace vxcomn
