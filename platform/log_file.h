// SPDX-License-Identifier: MIT
//
// What the logger's file sink needs of the system: a file to append to, and the local time as text. Control threads.
#pragma once

#include <string>
#include <string_view>

#include "platform/text.h"
#include "platform/unique.h"

namespace vxcomn {

struct LogFileTraits {
    using Raw = void *;
    static constexpr Raw none = nullptr;
    static void close(Raw file) noexcept;
};
using LogFileHandle = Unique<LogFileTraits>;

// Opens a file for appending and makes it if it is missing. On Linux the path is a Windows path of the machine folder or begins
// with a slash. Null if the system refuses.
LogFileHandle openLogFile(const WideString &path);

// Appends the bytes and has the system write them out. Failures are ignored.
void writeLogFile(void *file, std::string_view bytes) noexcept;

// The local time as "dd-mm-yyyy hh:mm:ss" on a twelve-hour clock.
std::string localTimeText();

}  // namespace vxcomn
