// SPDX-License-Identifier: MIT
#include "platform/log_file.h"

#include <ctime>

#include "platform/windows/sdk.h"

namespace vxcomn {

void LogFileTraits::close(Raw file) noexcept {
    CloseHandle(file);
}

LogFileHandle openLogFile(const WideString &path) {
    const HANDLE file = CreateFileW(path.c_str(), FILE_APPEND_DATA, FILE_SHARE_READ | FILE_SHARE_WRITE, nullptr, OPEN_ALWAYS,
                                    FILE_ATTRIBUTE_NORMAL, nullptr);
    return file == INVALID_HANDLE_VALUE ? LogFileHandle() : LogFileHandle(file);
}

void writeLogFile(void *file, std::string_view bytes) noexcept {
    DWORD written = 0;
    WriteFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr);
    FlushFileBuffers(file);
}

std::string localTimeText() {
    const std::time_t now = std::time(nullptr);
    std::tm local{};
    localtime_s(&local, &now);
    char text[80];
    return {text, std::strftime(text, sizeof text, "%d-%m-%Y %I:%M:%S", &local)};
}

}  // namespace vxcomn
