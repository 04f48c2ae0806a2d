// SPDX-License-Identifier: MIT
#include "platform/environment.h"

#include <doctest/doctest.h>

#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;

namespace {

const test::Helper sayVariable("say-variable", [](const std::vector<std::string> &arguments) {
    test::sayLine(environmentVariable(arguments.at(0).c_str()).value_or("(unset)"));
    return 0;
});

std::string childSees(const test::Environment &environment) {
    test::Process child = test::startHelper("say-variable", {"VXCOMN_TEST_VARIABLE"}, environment);
    return child.readLine().value_or("(nothing)");
}

}  // namespace

TEST_CASE("an environment variable reads as UTF-8, whatever its length") {
    CHECK(childSees({{"VXCOMN_TEST_VARIABLE", "gr\xC3\xBC\xC3\x9F \xE2\x82\xAC"}}) == "gr\xC3\xBC\xC3\x9F \xE2\x82\xAC");
    const std::string longText(2000, 'x');
    CHECK(childSees({{"VXCOMN_TEST_VARIABLE", longText}}) == longText);
}

TEST_CASE("a variable that nobody has set is absent") {
    CHECK(childSees({}) == "(unset)");
}
