// SPDX-License-Identifier: MIT
#include "platform/file.h"

#include <dirent.h>
#include <fcntl.h>
#include <fnmatch.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <limits>
#include <memory>
#include <string>

#include "platform/posix/descriptor.h"
#include "platform/posix/machine_root.h"
#include "platform/posix/system_status.h"

namespace vxcomn {
namespace {

struct FolderCloser {
    void operator()(DIR *folder) const noexcept { ::closedir(folder); }
};

int descriptorOf(void *file) noexcept {
    return static_cast<int>(reinterpret_cast<intptr_t>(file) - 1);
}

void tell(Status *why, Status reason) noexcept {
    if (why != nullptr) *why = reason;
}

// Only `*` and `?` mean something in a pattern.
std::string fnmatchPattern(const std::string &pattern) {
    std::string escaped;
    for (const char c : pattern) {
        if (c == '[' || c == '\\') escaped += '\\';
        escaped += c;
    }
    return escaped;
}

Status writeAll(int descriptor, std::span<const uint8_t> bytes) noexcept {
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR) continue;
        if (written < 0) return statusOfErrno(errno);
        bytes = bytes.subspan(static_cast<size_t>(written));
    }
    return ::fsync(descriptor) == 0 ? status::ok : statusOfErrno(errno);
}

}  // namespace

void FileTraits::close(Raw file) noexcept {
    ::close(descriptorOf(file));
}

FileHandle openFileForReading(const WideString &path, Status *why) {
    tell(why, status::ok);
    const std::optional<std::string> native = nativePath(path);
    if (!native) {
        tell(why, status::pathNotFound);
        return {};
    }
    // O_NONBLOCK: the opening of a pipe would wait for its writer.
    Descriptor descriptor(::open(native->c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    struct stat facts {};
    if (!descriptor || ::fstat(descriptor.get(), &facts) != 0) {
        tell(why, statusOfErrno(errno));
        return {};
    }
    if (!S_ISREG(facts.st_mode)) {
        tell(why, status::accessDenied);
        return {};
    }
    return FileHandle(reinterpret_cast<void *>(static_cast<intptr_t>(descriptor.release()) + 1));
}

std::optional<uint64_t> fileSize(void *file) noexcept {
    struct stat facts {};
    if (::fstat(descriptorOf(file), &facts) != 0) return std::nullopt;
    return static_cast<uint64_t>(facts.st_size);
}

size_t readFileAt(void *file, uint64_t offset, void *to, size_t count) noexcept {
    size_t done = 0;
    while (done < count && offset + done <= static_cast<uint64_t>(std::numeric_limits<off_t>::max())) {
        const ssize_t arrived =
            ::pread(descriptorOf(file), static_cast<uint8_t *>(to) + done, count - done, static_cast<off_t>(offset + done));
        if (arrived < 0 && errno == EINTR) continue;
        if (arrived <= 0) break;
        done += static_cast<size_t>(arrived);
    }
    return done;
}

std::vector<FoundFile> findFiles(const WideString &pattern, Status *why) {
    tell(why, status::ok);
    std::vector<FoundFile> found;
    const std::optional<std::string> native = nativePath(pattern);
    if (!native) {
        tell(why, status::pathNotFound);
        return found;
    }
    const size_t slash = native->rfind('/');
    const std::string folder = slash == std::string::npos ? "." : native->substr(0, slash + 1);
    const std::string names = fnmatchPattern(slash == std::string::npos ? *native : native->substr(slash + 1));
    const std::unique_ptr<DIR, FolderCloser> listing(::opendir(folder.c_str()));
    if (!listing) {
        tell(why, errno == ENOENT ? status::pathNotFound : statusOfErrno(errno));
        return found;
    }
    while (const dirent *entry = ::readdir(listing.get())) {
        const std::string name = entry->d_name;
        if (name == "." || name == ".." || ::fnmatch(names.c_str(), name.c_str(), 0) != 0) continue;
        struct stat facts {};
        const bool isFolder = ::fstatat(::dirfd(listing.get()), name.c_str(), &facts, 0) == 0 && S_ISDIR(facts.st_mode);
        found.push_back({toWide(name), isFolder});
    }
    if (found.empty()) tell(why, status::fileNotFound);
    return found;
}

Status writeWholeFile(const WideString &path, std::span<const uint8_t> bytes, FileWrite how) {
    const std::optional<std::string> native = nativePath(path);
    if (!native) return status::pathNotFound;
    // A name of its own in the same folder; link and rename both put the finished file in place in one step.
    std::string temporary = *native + ".XXXXXX";
    Descriptor descriptor(::mkostemp(temporary.data(), O_CLOEXEC));
    if (!descriptor) return errno == ENOENT ? status::pathNotFound : statusOfErrno(errno);
    Status result = writeAll(descriptor.get(), bytes);
    if (result == status::ok && ::fchmod(descriptor.get(), 0644) != 0) result = statusOfErrno(errno);
    descriptor.reset();
    if (result == status::ok) {
        const int placed =
            how == FileWrite::fresh ? ::link(temporary.c_str(), native->c_str()) : ::rename(temporary.c_str(), native->c_str());
        if (placed != 0) result = errno == EEXIST ? status::fileExists : statusOfErrno(errno);
        if (placed == 0 && how == FileWrite::replace) return result;
    }
    ::unlink(temporary.c_str());
    return result;
}

}  // namespace vxcomn
