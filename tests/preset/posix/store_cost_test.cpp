// SPDX-License-Identifier: MIT
//
// What the parameter store costs in statements and commits.
#include <doctest/doctest.h>

#include "platform/posix/registry_store.h"
#include "tests/preset/store_fixture.h"

using namespace vxcomn;
using test::StoreFixture;

TEST_CASE_FIXTURE(StoreFixture, "a parameter's write is one commit, the first one and those behind it") {
    for (const uint64_t most : {uint64_t{100}, uint64_t{8}}) {
        const StoreCounts before = storeCounts();
        const WideString id = VX_TEXT("{A}");
        const std::vector<uint8_t> data = {1};
        REQUIRE(WriteParameter(nullptr, parameters, 1, 2, -1, data, {{}, id}, false, nullptr));
        const StoreCounts after = storeCounts();
        CHECK(after.commits - before.commits == 1);
        CHECK(after.statements - before.statements <= most);  // five values, a beginning and an end
    }
}

TEST_CASE_FIXTURE(StoreFixture, "a read is one statement once the parameter's key is known") {
    REQUIRE(write(1, 2, {1, 2}));
    uint8_t buffer[4];
    uint32_t size = sizeof buffer;
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, nullptr) == status::ok);
    const StoreCounts before = storeCounts();
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, nullptr) == status::ok);
    CHECK(storeCounts().statements - before.statements == 1);
}

TEST_CASE_FIXTURE(StoreFixture, "a key's text is written, deleted, and a whole tree deleted, with one commit each") {
    const WideString text = VX_TEXT("x");
    StoreCounts before = storeCounts();
    const auto commits = [&before] {
        const uint64_t counted = storeCounts().commits - before.commits;
        before = storeCounts();
        return counted;
    };
    REQUIRE(SetRegString(configuration, VX_TEXT("v"), &text) == status::ok);
    CHECK(commits() == 1);
    REQUIRE(SetRegString(configuration, VX_TEXT("v"), nullptr) == status::ok);
    CHECK(commits() == 1);
    for (int i = 0; i < 10; ++i) REQUIRE(write(i, i, {1}));
    CHECK(commits() == 10);
    REQUIRE(DeleteRegKeyTree(configuration, false));
    CHECK(commits() == 1);
}
