// SPDX-License-Identifier: MIT
#include "platform/file.h"

#include <algorithm>

#include "platform/windows/sdk.h"

namespace vxcomn {
namespace {

constexpr size_t kLargestTransfer = 0x40000000;

struct SearchTraits {
    using Raw = HANDLE;
    static constexpr Raw none = nullptr;
    static void close(Raw search) noexcept { FindClose(search); }
};

void tell(Status *why, Status reason) noexcept {
    if (why != nullptr) *why = reason;
}

Status writeAll(HANDLE file, std::span<const uint8_t> bytes) noexcept {
    while (!bytes.empty()) {
        DWORD written = 0;
        if (!WriteFile(file, bytes.data(), static_cast<DWORD>(std::min(bytes.size(), kLargestTransfer)), &written, nullptr)) {
            return GetLastError();
        }
        bytes = bytes.subspan(written);
    }
    return FlushFileBuffers(file) ? status::ok : GetLastError();
}

}  // namespace

void FileTraits::close(Raw file) noexcept {
    CloseHandle(file);
}

FileHandle openFileForReading(const WideString &path, Status *why) {
    tell(why, status::ok);
    const HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                    OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        tell(why, GetLastError());
        return {};
    }
    FileHandle owned(file);
    if (GetFileType(file) != FILE_TYPE_DISK) {
        tell(why, status::accessDenied);
        return {};
    }
    return owned;
}

std::optional<uint64_t> fileSize(void *file) noexcept {
    LARGE_INTEGER size;
    if (!GetFileSizeEx(file, &size)) return std::nullopt;
    return static_cast<uint64_t>(size.QuadPart);
}

size_t readFileAt(void *file, uint64_t offset, void *to, size_t count) noexcept {
    size_t done = 0;
    while (done < count) {
        OVERLAPPED place{};
        place.Offset = static_cast<DWORD>(offset + done);
        place.OffsetHigh = static_cast<DWORD>((offset + done) >> 32);
        DWORD arrived = 0;
        const auto wanted = static_cast<DWORD>(std::min(count - done, kLargestTransfer));
        if (!ReadFile(file, static_cast<uint8_t *>(to) + done, wanted, &arrived, &place) || arrived == 0) break;
        done += arrived;
    }
    return done;
}

std::vector<FoundFile> findFiles(const WideString &pattern, Status *why) {
    tell(why, status::ok);
    std::vector<FoundFile> found;
    WIN32_FIND_DATAW entry;
    const HANDLE first = FindFirstFileW(pattern.c_str(), &entry);
    if (first == INVALID_HANDLE_VALUE) {
        tell(why, GetLastError());
        return found;
    }
    const Unique<SearchTraits> search(first);
    do {
        const WideString name = entry.cFileName;
        if (name == L"." || name == L"..") continue;
        found.push_back({name, (entry.dwFileAttributes & FILE_ATTRIBUTE_DIRECTORY) != 0});
    } while (FindNextFileW(search.get(), &entry));
    if (found.empty()) tell(why, status::fileNotFound);
    return found;
}

Status writeWholeFile(const WideString &path, std::span<const uint8_t> bytes, FileWrite how) {
    // A name of its own in the same folder; the move puts the finished file in place in one step.
    const WideString temporary =
        path + L"." + std::to_wstring(GetCurrentProcessId()) + L"-" + std::to_wstring(GetCurrentThreadId());
    const HANDLE file = CreateFileW(temporary.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) return GetLastError();
    FileHandle owned(file);
    Status result = writeAll(file, bytes);
    owned.reset();
    if (result == status::ok) {
        const DWORD flags = how == FileWrite::replace ? MOVEFILE_REPLACE_EXISTING | MOVEFILE_WRITE_THROUGH : MOVEFILE_WRITE_THROUGH;
        if (MoveFileExW(temporary.c_str(), path.c_str(), flags)) return status::ok;
        result = GetLastError();
        if (result == ERROR_ALREADY_EXISTS) result = status::fileExists;
    }
    DeleteFileW(temporary.c_str());
    return result;
}

}  // namespace vxcomn
