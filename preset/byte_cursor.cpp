// SPDX-License-Identifier: MIT
#include "preset/byte_cursor.h"

#include <algorithm>

namespace vxcomn {

bool ByteCursor::seek(uint64_t position) {
    const uint64_t windowEnd = this->position() + left_;
    const bool inWindow = position >= windowStart_ && position <= windowEnd;
    if (source_ == nullptr ? !inWindow : !source_->seek(position)) return false;
    if (inWindow) {
        next_ = begin_ + (position - windowStart_);
        left_ = static_cast<size_t>(windowEnd - position);
    } else {
        windowStart_ = position;
        begin_ = next_ = window_.get();
        left_ = 0;
    }
    return true;
}

void ByteCursor::refill(size_t count) {
    if (source_ == nullptr) return;
    const uint64_t here = position();
    // Up to the expected end in one go; behind it by whole windows, so that no input makes a file be read word by word.
    const uint64_t ahead = expected_ > here + left_ ? expected_ - here : kWindowBytes;
    const auto goal = static_cast<size_t>(std::min<uint64_t>(std::max<uint64_t>(count, ahead), kWindowBytes));
    // What is left moves to the window's front, and the source fills the rest. The window is no larger than what is read at once:
    // pages of a large one would cost more than reading a small preset does.
    if (capacity_ < goal) {
        auto larger = std::make_unique_for_overwrite<uint8_t[]>(goal);
        if (left_ > 0) std::memcpy(larger.get(), next_, left_);
        window_ = std::move(larger);
        capacity_ = goal;
    } else if (left_ > 0) {
        std::memmove(window_.get(), next_, left_);
    }
    windowStart_ = here;
    begin_ = next_ = window_.get();
    left_ += source_->readAt(here + left_, window_.get() + left_, goal - left_);
}

void ByteWriter::zeros(size_t count) {
    bytes_.resize(bytes_.size() + count);
}

void ByteWriter::put(size_t position, std::span<const uint8_t> bytes) {
    if (bytes.empty()) return;
    if (bytes_.size() < position + bytes.size()) bytes_.resize(position + bytes.size());
    std::memcpy(bytes_.data() + position, bytes.data(), bytes.size());
}

void ByteWriter::putU32(size_t position, uint32_t value) {
    ByteWriter word;
    word.u32(value);
    put(position, word.bytes_);
}

void ByteWriter::number(uint32_t value, size_t size) {
    for (size_t i = 0; i < size; ++i) bytes_.push_back(static_cast<uint8_t>(value >> 8 * i));
}

}  // namespace vxcomn
