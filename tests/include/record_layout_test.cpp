// SPDX-License-Identifier: MIT
//
// The records that cross the interface have one layout: the same in C and C++, on both platforms, in this release and the next.
#include "tests/include/record_layout.h"

#include <doctest/doctest.h>

#include <iterator>
#include <string>

#include "VXDSPAPI.h"
#include "vxcomn/version_record.h"

namespace {

const LayoutLine kLayout[] = {
#include "tests/include/record_fields.inc"
};

std::string nameOf(const LayoutLine &line) {
    return line.field == nullptr ? std::string(line.record) : std::string(line.record) + "." + line.field;
}

void checkLines(const LayoutLine *lines, size_t count) {
    for (size_t i = 0; i < count; ++i) {
        CAPTURE(nameOf(lines[i]));
        CHECK(lines[i].found == lines[i].pinned);
    }
}

}  // namespace

TEST_CASE("a C++ compiler finds every field of every record at its pinned offset") {
    checkLines(kLayout, std::size(kLayout));
}

TEST_CASE("a C compiler finds every field of every record at its pinned offset") {
    REQUIRE(recordLayoutLinesInC == std::size(kLayout));
    checkLines(recordLayoutInC, recordLayoutLinesInC);
}
