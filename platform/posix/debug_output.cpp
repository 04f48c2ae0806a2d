// SPDX-License-Identifier: MIT
#include "platform/debug_output.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>

#include <fcntl.h>
#include <unistd.h>

#include "platform/posix/descriptor.h"

namespace vxcomn {
namespace {

// One call of write for the whole line: with O_APPEND the kernel puts it behind all others in one piece.
void writeWhole(int file, const std::string &text) {
    size_t done = 0;
    while (done < text.size()) {
        const ssize_t count = write(file, text.data() + done, text.size() - done);
        if (count < 0 && errno == EINTR) continue;
        if (count <= 0) return;
        done += static_cast<size_t>(count);
    }
}

}  // namespace

void debugOutput(const WideString &line) noexcept {
    try {
        if (std::getenv("VXCOMN_DEBUG_OUTPUT") != nullptr) debugOutput(toUtf8(line));
    } catch (const std::exception &) {
        // Out of memory: whoever debugs misses a line, nobody else notices.
        return;
    }
}

void debugOutput(const std::string &utf8Line) noexcept {
    const char *target = std::getenv("VXCOMN_DEBUG_OUTPUT");
    if (target == nullptr || *target == '\0') return;
    const int savedError = errno;
    try {
        std::string text = utf8Line;
        if (text.empty() || text.back() != '\n') text.push_back('\n');
        if (std::strcmp(target, "stderr") == 0) {
            writeWhole(STDERR_FILENO, text);
        } else {
            const Descriptor file(open(target, O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, 0666));
            if (file) writeWhole(file.get(), text);
        }
    } catch (const std::exception &) {
        // Out of memory, as above.
        errno = savedError;
        return;
    }
    errno = savedError;
}

}  // namespace vxcomn
