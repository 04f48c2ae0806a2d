// SPDX-License-Identifier: MIT
//
// Files: reading at an offset, listing by pattern, writing a new file. Paths are Windows paths on both platforms; on Linux drive C
// is a folder of the machine folder, and a path that begins with `/` is taken as it is. Control threads; a handle may be shared by
// threads, since every read names its place.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "platform/status.h"
#include "platform/text.h"
#include "platform/unique.h"

namespace vxcomn {

// Raw is the system's handle. On Linux it is the descriptor plus one, so that null is none.
struct FileTraits {
    using Raw = void *;
    static constexpr Raw none = nullptr;
    static void close(Raw file) noexcept;
};
using FileHandle = Unique<FileTraits>;

// Opens an ordinary file for reading; others may read and write it meanwhile. Null if that fails, with the reason in `why` (if
// given). Folders and devices are refused with accessDenied, so opening never waits.
FileHandle openFileForReading(const WideString &path, Status *why = nullptr);

// Nothing if the system does not tell.
std::optional<uint64_t> fileSize(void *file) noexcept;

// Reads up to `count` bytes from `offset` on and returns how many arrived: fewer at the end of the file and after a failure.
size_t readFileAt(void *file, uint64_t offset, void *to, size_t count) noexcept;

struct FoundFile {
    WideString name;  // without the folder
    bool isFolder = false;
};

// What FindFirstFileW and FindNextFileW list for a path whose last component may hold `*` and `?`. Names match without regard to
// case on Windows and as they stand on Linux. "." and ".." are left out. Empty if nothing matches or the folder cannot be listed,
// with the reason in `why` (if given). The order is the file system's.
std::vector<FoundFile> findFiles(const WideString &pattern, Status *why = nullptr);

enum class FileWrite : uint8_t { fresh, replace };

// Writes a whole file. `fresh` refuses to touch one that exists (fileExists); `replace` swaps it for the new one in one step, so
// that a reader sees the old file or the new one. Folders on the way are not made. Nothing stays behind after a failure.
Status writeWholeFile(const WideString &path, std::span<const uint8_t> bytes, FileWrite how);

}  // namespace vxcomn
