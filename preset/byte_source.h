// SPDX-License-Identifier: MIT
//
// Where a reader's bytes come from: an image in memory or an open file. Reads name their place, so a source keeps no position; who
// reads keeps one (byte_cursor.h). One thread at a time.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>
#include <span>

namespace vxcomn {

class ByteSource {
  public:
    virtual ~ByteSource() = default;

    // Nothing if the end cannot be found.
    virtual std::optional<uint64_t> size() = 0;

    // Whether reading can go on at `position`. A place behind the end is a place: reads there deliver nothing.
    virtual bool seek(uint64_t position) = 0;

    // Reads up to `count` bytes from `offset` on and returns how many arrived; fewer means the end, or a failure that reads like
    // one.
    virtual size_t readAt(uint64_t offset, void *to, size_t count) = 0;
};

// Bytes in memory, not owned.
class MemorySource final : public ByteSource {
  public:
    explicit MemorySource(std::span<const uint8_t> bytes) noexcept : bytes_(bytes) {}

    std::optional<uint64_t> size() override { return bytes_.size(); }
    bool seek(uint64_t) override { return true; }
    size_t readAt(uint64_t offset, void *to, size_t count) override {
        if (offset >= bytes_.size()) return 0;
        const size_t arrived = std::min(count, bytes_.size() - static_cast<size_t>(offset));
        if (arrived > 0) std::memcpy(to, bytes_.data() + offset, arrived);
        return arrived;
    }

  private:
    std::span<const uint8_t> bytes_;
};

}  // namespace vxcomn
