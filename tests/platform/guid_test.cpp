// SPDX-License-Identifier: MIT
#include "platform/guid.h"

#include <doctest/doctest.h>

#include <cstring>
#include <set>

using namespace vxcomn;

namespace {

constexpr GUID kSample = {0x1DA5D803, 0xD492, 0x4EDD, {0x8C, 0x23, 0xE0, 0xC0, 0xFF, 0xEE, 0x7F, 0x0E}};
constexpr auto kSampleText = VX_TEXT("{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E}");

}  // namespace

TEST_CASE("a GUID's text is in braces and capitals and reads back in either case") {
    CHECK(toUtf8(guidText(kSample)) == toUtf8(kSampleText));
    GUID read;
    CHECK(parseGuidText(kSampleText, read));
    CHECK(read == kSample);
    CHECK(parseGuidText(VX_TEXT("{1da5d803-d492-4edd-8c23-e0c0ffee7f0e}"), read));
    CHECK(read == kSample);
}

TEST_CASE("any other text is refused and leaves zeros: each length, and each unit replaced by one that does not belong") {
    const GUID zero = {};
    const WideString text = kSampleText;
    for (size_t length = 0; length < text.size(); ++length) {
        GUID read = kSample;
        CHECK_FALSE(parseGuidText(WideView(text).substr(0, length), read));
        CHECK(read == zero);
    }
    for (size_t at = 0; at < text.size(); ++at) {
        for (const VXWCHAR other : {VXWCHAR{'g'}, VXWCHAR{' '}, VXWCHAR{'/'}, VXWCHAR{':'}, VXWCHAR{0}, VXWCHAR{0x0661}}) {
            WideString wrong = text;
            wrong[at] = other;
            GUID read = kSample;
            CHECK_FALSE(parseGuidText(wrong, read));
            CHECK(read == zero);
        }
    }
    GUID read = kSample;
    CHECK_FALSE(parseGuidText(text + VX_TEXT(" "), read));
}

TEST_CASE("new GUIDs differ and are marked as random ones") {
    std::set<WideString> seen;
    for (int i = 0; i < 1000; ++i) {
        GUID made;
        REQUIRE(newGuid(made));
        CHECK((made.Data3 & 0xF000) == 0x4000);
        CHECK((made.Data4[0] & 0xC0) == 0x80);
        GUID read;
        CHECK(parseGuidText(guidText(made), read));
        CHECK(read == made);
        CHECK(seen.insert(guidText(made)).second);
    }
}
