// SPDX-License-Identifier: MIT
#include "platform/text.h"

#include <doctest/doctest.h>

#include "platform/case_pairs.h"

using namespace vxcomn;

TEST_CASE("text goes from UTF-8 to 16-bit units and back unchanged") {
    const std::string utf8 = "a\xC3\xA9\xE2\x82\xAC\xF0\x9F\x8E\xB5z";  // one to four bytes a character
    const WideString wide = toWide(utf8);
    CHECK(wide == VX_TEXT("a\u00E9\u20AC\xD83C\xDFB5z"));
    CHECK(toUtf8(wide) == utf8);
    CHECK(toWide("").empty());
    CHECK(toUtf8({}).empty());
    CHECK(toWide(std::string_view("a\0b", 3)).size() == 3);
}

TEST_CASE("every single unit that is no surrogate survives the way there and back") {
    int wrong = 0;
    for (uint32_t unit = 0; unit < 0x10000; ++unit) {
        if (unit >= 0xD800 && unit < 0xE000) continue;
        const WideString text(1, static_cast<VXWCHAR>(unit));
        if (toWide(toUtf8(text)) != text) ++wrong;
    }
    CHECK(wrong == 0);
}

TEST_CASE("malformed UTF-8 becomes replacement characters and the rest is read in step") {
    const WideString one = VX_TEXT("\uFFFDx");
    CHECK(toWide("\x80x") == one);                           // a continuation with nothing to continue
    CHECK(toWide("\xC3x") == one);                           // cut off by a letter
    CHECK(toWide("\xF0\x9F\x8Ex") == one);                   // a long beginning is one replacement
    CHECK(toWide("\xFFx") == one);                           // no byte of UTF-8
    CHECK(toWide("\xC3") == VX_TEXT("\uFFFD"));              // cut off by the end
    CHECK(toWide("\xC0\xAFx") == VX_TEXT("\uFFFD\uFFFDx"));  // an overlong slash
    CHECK(toWide("\xE0\x80\xAFx") == VX_TEXT("\uFFFD\uFFFD\uFFFDx"));
    CHECK(toWide("\xED\xA0\x80x") == VX_TEXT("\uFFFD\uFFFD\uFFFDx"));            // a surrogate
    CHECK(toWide("\xF4\x90\x80\x80x") == VX_TEXT("\uFFFD\uFFFD\uFFFD\uFFFDx"));  // past the last character
}

TEST_CASE("a surrogate without its other half becomes a replacement character") {
    const auto text = [](std::initializer_list<unsigned> units) {
        WideString wide;
        for (const unsigned unit : units) wide.push_back(static_cast<VXWCHAR>(unit));
        return toUtf8(wide);
    };
    CHECK(text({0xD83C, 'x'}) == "\xEF\xBF\xBDx");
    CHECK(text({0xDFB5, 'x'}) == "\xEF\xBF\xBDx");
    CHECK(text({0xDFB5, 0xD83C}) == "\xEF\xBF\xBD\xEF\xBF\xBD");
}

TEST_CASE("letters of Latin, Greek and Cyrillic compare without regard to case") {
    CHECK(equalIgnoringCase(VX_TEXT("Software\\Mood_1"), VX_TEXT("SOFTWARE\\mOOD_1")));
    CHECK(equalIgnoringCase(VX_TEXT("\u00E4\u00FF\u0151"), VX_TEXT("\u00C4\u0178\u0150")));
    CHECK(equalIgnoringCase(VX_TEXT("\u03B1\u03C9\u03CE"), VX_TEXT("\u0391\u03A9\u038F")));
    CHECK(equalIgnoringCase(VX_TEXT("\u0434\u0451\u04CF"), VX_TEXT("\u0414\u0401\u04C0")));
    CHECK_FALSE(equalIgnoringCase(VX_TEXT("a"), VX_TEXT("ab")));
    CHECK_FALSE(equalIgnoringCase(VX_TEXT("a"), VX_TEXT("\u00E4")));
    CHECK_FALSE(equalIgnoringCase(VX_TEXT("@"), VX_TEXT("`")));  // neighbours of the letters
    CHECK_FALSE(equalIgnoringCase(VX_TEXT("["), VX_TEXT("{")));
    CHECK_FALSE(equalIgnoringCase(VX_TEXT("\u00D7"), VX_TEXT("\u00F7")));  // times and division signs
}

TEST_CASE("a letter without a one-to-one pair stays as it is") {
    for (const unsigned unit : {0x00DFu, 0x0131u, 0x017Fu, 0x03C2u, 0x212Au}) {
        const WideString text(1, static_cast<VXWCHAR>(unit));
        CHECK(foldCase(text) == text);
    }
}

TEST_CASE("folding twice is folding once, and the table of pairs is in order") {
    int wrong = 0;
    for (uint32_t unit = 0; unit < 0x10000; ++unit) {
        const WideString once = foldCase(WideString(1, static_cast<VXWCHAR>(unit)));
        if (foldCase(once) != once) ++wrong;
    }
    CHECK(wrong == 0);
    uint32_t last = 0;
    for (const CasePairs &pairs : kCasePairs) {
        CHECK(pairs.first > last);
        CHECK(pairs.last >= pairs.first);
        last = pairs.last;
    }
}
