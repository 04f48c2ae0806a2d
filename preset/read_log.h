// SPDX-License-Identifier: MIT
//
// What the readers have to say while they work, as lines of text. The readers know no logger: who calls them hands in a ReadLog
// that passes the lines on, or null where nobody listens, and then no line is put together. A line's end belongs to it.
#pragma once

#include <concepts>
#include <cstdint>
#include <string>
#include <string_view>

#include "platform/text.h"

namespace vxcomn {

class ReadLog {
  public:
    virtual ~ReadLog() = default;

    // Whether anybody reads the lines. Where nobody does, none is put together; standardError still counts.
    virtual bool listens() const { return true; }

    // A line for the log.
    virtual void line(WideView text) = 0;

    // A message that goes to the standard error stream of the process, not to the log.
    virtual void standardError(std::string_view text) = 0;
};

// A number that prints as upper-case hexadecimal digits without leading zeros.
struct Hexadecimal {
    uint32_t value;
};

namespace read_log {

inline void append(WideString &line, const VXWCHAR *text) {
    line += text;
}
inline void append(WideString &line, const WideString &text) {
    line += text;
}
inline void append(WideString &line, std::string_view utf8) {
    line += toWide(utf8);
}
inline void append(WideString &line, std::integral auto number) {
    for (const char digit : std::to_string(number)) line += static_cast<VXWCHAR>(digit);
}
inline void append(WideString &line, Hexadecimal number) {
    int shift = 28;
    while (shift > 0 && number.value >> shift == 0) shift -= 4;
    for (; shift >= 0; shift -= 4) line += static_cast<VXWCHAR>("0123456789ABCDEF"[number.value >> shift & 0xF]);
}

}  // namespace read_log

// Puts a line together from its pieces and logs it.
template <class... Pieces>
void say(ReadLog *log, const Pieces &...pieces) {
    if (log == nullptr || !log->listens()) return;
    WideString line;
    (read_log::append(line, pieces), ...);
    log->line(line);
}

}  // namespace vxcomn
