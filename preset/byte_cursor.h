// SPDX-License-Identifier: MIT
//
// The one way in which bytes of a file format are read and written. ByteCursor walks an image in memory or a source behind a window
// and checks every step; ByteWriter appends little-endian numbers and patches them. Presets, packages and maps are read with it, so
// there is no other place where a length could run past an end.
//
// A short read behaves as on a file stream: it delivers nothing, and the cursor then stands at the end. A window's memory is
// bounded whatever the input says: no single take is larger than kLargestTake. One thread at a time.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <span>
#include <vector>

#include "preset/byte_source.h"

namespace vxcomn {

class ByteCursor {
  public:
    // The largest piece that can be taken at once: the largest value of a preset.
    static constexpr size_t kLargestTake = 0x10000;

    // Over bytes in memory, which stay the caller's.
    explicit ByteCursor(std::span<const uint8_t> bytes) noexcept : next_(bytes.data()), left_(bytes.size()), begin_(bytes.data()) {}

    // Over a source, which stays the caller's, from its beginning on.
    explicit ByteCursor(ByteSource &source) noexcept : source_(&source) {}

    // Where the next byte stands, from the beginning of the bytes or of the source.
    uint64_t position() const noexcept { return windowStart_ + static_cast<uint64_t>(next_ - begin_); }

    // Goes to any position of a source, also one behind its end, or to any within bytes in memory. False, and nothing moves, if
    // there is no such place or the source refuses.
    bool seek(uint64_t position);

    // Says up to where the caller means to read: the window is filled up to there at once, and not beyond unless it is read.
    void expectUpTo(uint64_t position) noexcept { expected_ = position; }

    // The next `count` bytes, which stay valid until the next call; null if there are fewer, and the cursor then stands at the end.
    const uint8_t *take(size_t count) {
        const std::span<const uint8_t> taken = takeUpTo(count);
        return taken.size() == count ? taken.data() : nullptr;
    }

    // As take, but delivers what is there. At most kLargestTake bytes from a source.
    std::span<const uint8_t> takeUpTo(size_t count) {
        if (count > left_) refill(count);
        const size_t taken = count > left_ ? left_ : count;
        const uint8_t *const bytes = next_;
        next_ += taken;
        left_ -= taken;
        return {bytes, taken};
    }

    bool u8(uint8_t &value) { return number<uint8_t>(value); }
    bool u16(uint16_t &value) { return number<uint16_t>(value); }
    bool u32(uint32_t &value) { return number<uint32_t>(value); }
    bool i32(int32_t &value) {
        uint32_t bits = 0;
        if (!u32(bits)) return false;
        value = static_cast<int32_t>(bits);
        return true;
    }
    bool f32(float &value) {
        uint32_t bits = 0;
        if (!u32(bits)) return false;
        value = std::bit_cast<float>(bits);
        return true;
    }

  private:
    // Twice the largest take, so that one that begins in the window's second half still finds room behind it.
    static constexpr size_t kWindowBytes = 2 * kLargestTake;

    template <class T>
    bool number(T &value) {
        const uint8_t *const bytes = take(sizeof(T));
        if (bytes == nullptr) return false;
        T result = 0;
        for (size_t i = 0; i < sizeof(T); ++i) result = static_cast<T>(result | static_cast<T>(bytes[i]) << 8 * i);
        value = result;
        return true;
    }

    void refill(size_t count);

    const uint8_t *next_ = nullptr;   // in the window
    size_t left_ = 0;                 // bytes of the window from next_ on
    const uint8_t *begin_ = nullptr;  // the window's first byte
    uint64_t windowStart_ = 0;        // its position
    uint64_t expected_ = 0;
    ByteSource *source_ = nullptr;  // null over memory
    std::unique_ptr<uint8_t[]> window_;
    size_t capacity_ = 0;
};

// Appends to a growing image.
class ByteWriter {
  public:
    size_t position() const noexcept { return bytes_.size(); }

    void u8(uint8_t value) { number(value, 1); }
    void u16(uint16_t value) { number(value, 2); }
    void u32(uint32_t value) { number(value, 4); }
    void i32(int32_t value) { u32(static_cast<uint32_t>(value)); }
    void f32(float value) { u32(std::bit_cast<uint32_t>(value)); }
    void bytes(std::span<const uint8_t> bytes) { put(position(), bytes); }
    void zeros(size_t count);

    // Overwrites bytes from `position` on, and grows the image with zeros as far as that takes.
    void put(size_t position, std::span<const uint8_t> bytes);
    void putU32(size_t position, uint32_t value);

    std::span<const uint8_t> view() const noexcept { return bytes_; }
    std::vector<uint8_t> release() { return std::move(bytes_); }

  private:
    void number(uint32_t value, size_t size);

    std::vector<uint8_t> bytes_;
};

}  // namespace vxcomn
