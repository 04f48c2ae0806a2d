// SPDX-License-Identifier: MIT
#include "platform/file_version.h"

#include <vector>

#include "platform/unique.h"
#include "platform/windows/sdk.h"

namespace vxcomn {
namespace {

struct FileTraits {
    using Raw = HANDLE;
    static inline const Raw none = INVALID_HANDLE_VALUE;
    static void close(Raw file) noexcept { CloseHandle(file); }
};

// The version calls answer differently from system to system for what is no module, so the file is looked at first.
Status looksLikeModule(const WideString &path) {
    const Unique<FileTraits> file(CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE,
                                              nullptr, OPEN_EXISTING, 0, nullptr));
    if (!file) return GetLastError();
    char magic[2] = {};
    DWORD count = 0;
    if (ReadFile(file.get(), magic, sizeof magic, &count, nullptr) == 0) return GetLastError();
    return count == sizeof magic && magic[0] == 'M' && magic[1] == 'Z' ? status::ok : status::badExeFormat;
}

Status readVersion(const WideString &path, uint64_t &version) {
    if (const Status status = looksLikeModule(path); status != status::ok) return status;
    DWORD ignored = 0;
    const DWORD size = GetFileVersionInfoSizeW(path.c_str(), &ignored);
    if (size == 0) return status::resourceTypeNotFound;
    std::vector<uint8_t> block(size);
    if (GetFileVersionInfoW(path.c_str(), 0, size, block.data()) == 0) return GetLastError();
    void *found = nullptr;
    UINT length = 0;
    if (VerQueryValueW(block.data(), L"\\", &found, &length) == 0 || length < sizeof(VS_FIXEDFILEINFO)) {
        return status::resourceTypeNotFound;
    }
    const auto *info = static_cast<const VS_FIXEDFILEINFO *>(found);
    version = static_cast<uint64_t>(info->dwFileVersionMS) << 32 | info->dwFileVersionLS;
    return status::ok;
}

}  // namespace

std::optional<uint64_t> fileVersion(const WideString &path, Status *why) {
    uint64_t version = 0;
    const Status status = readVersion(path, version);
    if (why != nullptr) *why = status;
    if (status != status::ok) return std::nullopt;
    return version;
}

}  // namespace vxcomn
