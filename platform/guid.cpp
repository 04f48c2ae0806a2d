// SPDX-License-Identifier: MIT
//
// The text form, which is the same on both platforms.
#include "platform/guid.h"

#include <cstring>

namespace vxcomn {
namespace {

constexpr size_t kTextUnits = 38;
// Where the sixteen bytes stand in memory, in the order in which the text shows them: the first three numbers are little-endian.
constexpr uint8_t kByteOrder[16] = {3, 2, 1, 0, 5, 4, 7, 6, 8, 9, 10, 11, 12, 13, 14, 15};

constexpr bool isDashBefore(size_t byte) {
    return byte == 4 || byte == 6 || byte == 8 || byte == 10;
}

int hexDigit(VXWCHAR unit) noexcept {
    if (unit >= '0' && unit <= '9') return unit - '0';
    if (unit >= 'A' && unit <= 'F') return unit - 'A' + 10;
    if (unit >= 'a' && unit <= 'f') return unit - 'a' + 10;
    return -1;
}

}  // namespace

WideString guidText(const GUID &guid) {
    constexpr char kDigits[] = "0123456789ABCDEF";
    uint8_t bytes[16];
    std::memcpy(bytes, &guid, sizeof bytes);
    WideString text = VX_TEXT("{");
    for (size_t i = 0; i < 16; ++i) {
        if (isDashBefore(i)) text.push_back('-');
        text.push_back(static_cast<VXWCHAR>(kDigits[bytes[kByteOrder[i]] >> 4]));
        text.push_back(static_cast<VXWCHAR>(kDigits[bytes[kByteOrder[i]] & 15]));
    }
    text.push_back('}');
    return text;
}

bool parseGuidText(WideView text, GUID &guid) noexcept {
    std::memset(&guid, 0, sizeof guid);
    if (text.size() != kTextUnits || text.front() != '{' || text.back() != '}') return false;
    uint8_t bytes[16] = {};
    size_t at = 1;
    for (size_t i = 0; i < 16; ++i) {
        if (isDashBefore(i) && text[at++] != '-') return false;
        const int high = hexDigit(text[at]), low = hexDigit(text[at + 1]);
        if (high < 0 || low < 0) return false;
        bytes[kByteOrder[i]] = static_cast<uint8_t>(high << 4 | low);
        at += 2;
    }
    std::memcpy(&guid, bytes, sizeof guid);
    return true;
}

}  // namespace vxcomn
