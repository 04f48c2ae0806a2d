// SPDX-License-Identifier: MIT
//
// A file as a source of bytes.
#pragma once

#include <memory>

#include "platform/file.h"
#include "preset/byte_source.h"

namespace vxcomn {

class FileSource final : public ByteSource {
  public:
    explicit FileSource(FileHandle file) noexcept : file_(std::move(file)) {}

    std::optional<uint64_t> size() override { return fileSize(file_.get()); }
    bool seek(uint64_t) override { return true; }
    size_t readAt(uint64_t offset, void *to, size_t count) override { return readFileAt(file_.get(), offset, to, count); }

  private:
    FileHandle file_;
};

// Opens a file; null if that fails, with the reason in `why`.
inline std::unique_ptr<ByteSource> openFileSource(const WideString &path, Status &why) {
    FileHandle file = openFileForReading(path, &why);
    if (!file) return nullptr;
    return std::make_unique<FileSource>(std::move(file));
}

}  // namespace vxcomn
