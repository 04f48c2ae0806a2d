// SPDX-License-Identifier: MIT
//
// Files and folders of the machine that everybody may read and write, whatever the file mode mask of the process that happens to
// make them. What exists already keeps the permissions that it has. Control threads.
#pragma once

#include <string>

#include <fcntl.h>
#include <sys/stat.h>

#include "platform/posix/descriptor.h"

namespace vxcomn {

inline constexpr mode_t kFileForAll = 0666;
inline constexpr mode_t kFolderForAll = 0777;

// Opens a file for reading and writing and makes it where it is missing. None, with the reason in errno, if that fails. A link in
// the place of the file is refused, since anybody may have put it there.
inline Descriptor openForAll(const std::string &path) noexcept {
    constexpr int kFlags = O_RDWR | O_CLOEXEC | O_NOFOLLOW;
    for (;;) {
        Descriptor file(::open(path.c_str(), kFlags | O_CREAT | O_EXCL, kFileForAll));
        if (file) {
            fchmod(file.get(), kFileForAll);
            return file;
        }
        if (errno != EEXIST) return file;
        file.reset(::open(path.c_str(), kFlags));
        if (file || errno != ENOENT) return file;  // else it went between the two
    }
}

// Makes a folder; true if it was made or was there.
inline bool makeFolderForAll(const std::string &path) noexcept {
    if (mkdir(path.c_str(), kFolderForAll) == 0) {
        chmod(path.c_str(), kFolderForAll);
        return true;
    }
    return errno == EEXIST;
}

}  // namespace vxcomn
