// SPDX-License-Identifier: MIT
//
// The log file is a descriptor. It travels as a pointer-sized value, one above the descriptor, so that none is null.
#include "platform/log_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <ctime>

#include "platform/posix/machine_root.h"

namespace vxcomn {

namespace {

int descriptorOf(void *file) noexcept {
    return static_cast<int>(reinterpret_cast<intptr_t>(file) - 1);
}

}  // namespace

void LogFileTraits::close(Raw file) noexcept {
    ::close(descriptorOf(file));
}

LogFileHandle openLogFile(const WideString &path) {
    const std::optional<std::string> native = nativePath(path);
    if (!native) return {};
    const int descriptor = ::open(native->c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
    if (descriptor < 0) return {};
    return LogFileHandle(reinterpret_cast<void *>(static_cast<intptr_t>(descriptor) + 1));
}

void writeLogFile(void *file, std::string_view bytes) noexcept {
    const int descriptor = descriptorOf(file);
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written <= 0) return;
        bytes.remove_prefix(static_cast<size_t>(written));
    }
    ::fsync(descriptor);
}

std::string localTimeText() {
    const std::time_t now = std::time(nullptr);
    std::tm local{};
    localtime_r(&now, &local);
    char text[80];
    return {text, std::strftime(text, sizeof text, "%d-%m-%Y %I:%M:%S", &local)};
}

}  // namespace vxcomn
