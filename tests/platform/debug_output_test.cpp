// SPDX-License-Identifier: MIT
#include "platform/debug_output.h"

#include <doctest/doctest.h>

#include "tests/platform/debug_capture.h"

using namespace vxcomn;
using Lines = std::vector<std::string>;

TEST_CASE("each call gives whoever debugs one line, wide or narrow, its line feed not doubled") {
    const Lines lines = test::captureDebugOutput([] {
        debugOutput(std::string("first"));
        debugOutput(std::string("second\n"));
        debugOutput(WideString(VX_TEXT("third\n")));
        debugOutput(WideString(VX_TEXT("a percent sign %s stays\n")));
    });
    CHECK(lines == Lines{"first", "second", "third", "a percent sign %s stays"});
}

TEST_CASE("wide letters reach whoever debugs") {
    const Lines lines = test::captureDebugOutput([] { debugOutput(WideString(VX_TEXT("gr\u00FC\u00DFe\n"))); });
    CHECK(lines == Lines{"gr\xC3\xBC\xC3\x9F"
                         "e"});
}
