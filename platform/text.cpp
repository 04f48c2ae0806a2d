// SPDX-License-Identifier: MIT
#include "platform/text.h"

#include <algorithm>
#include <cstdint>
#include <iterator>

#include "platform/case_pairs.h"

namespace vxcomn {
namespace {

constexpr uint32_t kReplacement = 0xFFFD;

constexpr bool isHighSurrogate(uint32_t unit) {
    return unit >= 0xD800 && unit < 0xDC00;
}
constexpr bool isLowSurrogate(uint32_t unit) {
    return unit >= 0xDC00 && unit < 0xE000;
}

// Takes one character off the front of `text`. A malformed sequence gives one replacement for its longest well-formed beginning, as
// Unicode recommends, so that what follows is read in step again.
uint32_t takeUtf8(std::string_view &text) {
    const auto lead = static_cast<uint8_t>(text.front());
    text.remove_prefix(1);
    if (lead < 0x80) return lead;

    int more = 0;
    uint32_t point = 0;
    uint8_t low = 0x80, high = 0xBF;  // bounds of the second byte: no overlong form, no surrogate, nothing past U+10FFFF
    if (lead >= 0xC2 && lead <= 0xDF) {
        more = 1, point = lead & 0x1Fu;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        more = 2, point = lead & 0x0Fu;
        if (lead == 0xE0) low = 0xA0;
        if (lead == 0xED) high = 0x9F;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        more = 3, point = lead & 0x07u;
        if (lead == 0xF0) low = 0x90;
        if (lead == 0xF4) high = 0x8F;
    } else {
        return kReplacement;
    }
    for (; more > 0; --more) {
        if (text.empty()) return kReplacement;
        const auto next = static_cast<uint8_t>(text.front());
        if (next < low || next > high) return kReplacement;
        text.remove_prefix(1);
        point = point << 6 | (next & 0x3Fu);
        low = 0x80, high = 0xBF;
    }
    return point;
}

void putUtf8(std::string &out, uint32_t point) {
    const auto put = [&out](uint32_t byte) { out.push_back(static_cast<char>(byte)); };
    if (point < 0x80) {
        put(point);
    } else if (point < 0x800) {
        put(0xC0 | point >> 6), put(0x80 | (point & 0x3F));
    } else if (point < 0x10000) {
        put(0xE0 | point >> 12), put(0x80 | (point >> 6 & 0x3F)), put(0x80 | (point & 0x3F));
    } else {
        put(0xF0 | point >> 18), put(0x80 | (point >> 12 & 0x3F)), put(0x80 | (point >> 6 & 0x3F)), put(0x80 | (point & 0x3F));
    }
}

VXWCHAR foldUnit(VXWCHAR unit) {
    if (unit < 0x80) return unit >= 'a' && unit <= 'z' ? static_cast<VXWCHAR>(unit - ('a' - 'A')) : unit;
    const auto *pairs = std::upper_bound(std::begin(kCasePairs), std::end(kCasePairs), unit,
                                         [](VXWCHAR value, const CasePairs &entry) { return value < entry.first; });
    if (pairs == std::begin(kCasePairs)) return unit;
    --pairs;
    if (unit > pairs->last || (unit - pairs->first) % pairs->step != 0) return unit;
    return static_cast<VXWCHAR>(unit + pairs->distance);
}

}  // namespace

WideString toWide(std::string_view utf8) {
    WideString wide;
    wide.reserve(utf8.size());
    while (!utf8.empty()) {
        const uint32_t point = takeUtf8(utf8);
        if (point < 0x10000) {
            wide.push_back(static_cast<VXWCHAR>(point));
        } else {
            wide.push_back(static_cast<VXWCHAR>(0xD800 + ((point - 0x10000) >> 10)));
            wide.push_back(static_cast<VXWCHAR>(0xDC00 + ((point - 0x10000) & 0x3FF)));
        }
    }
    return wide;
}

std::string toUtf8(WideView wide) {
    std::string utf8;
    utf8.reserve(wide.size());
    for (size_t i = 0; i < wide.size(); ++i) {
        const uint32_t unit = wide[i];
        if (isHighSurrogate(unit) && i + 1 < wide.size() && isLowSurrogate(wide[i + 1])) {
            putUtf8(utf8, 0x10000 + ((unit - 0xD800) << 10) + (wide[++i] - 0xDC00u));
        } else {
            putUtf8(utf8, isHighSurrogate(unit) || isLowSurrogate(unit) ? kReplacement : unit);
        }
    }
    return utf8;
}

bool equalIgnoringCase(WideView left, WideView right) {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [](VXWCHAR a, VXWCHAR b) { return a == b || foldUnit(a) == foldUnit(b); });
}

WideString foldCase(WideView text) {
    WideString folded(text);
    std::transform(folded.begin(), folded.end(), folded.begin(), foldUnit);
    return folded;
}

}  // namespace vxcomn
