// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include "tests/platform/posix/fork.h"
#include "tests/platform/registry_fixture.h"

using namespace vxcomn;

TEST_CASE_FIXTURE(test::RegistryFixture, "parent and child of a fork both go on with the registry, by the same key handle") {
    CHECK(key.setU32(VX_TEXT("before"), 1) == status::ok);
    for (uint32_t round = 0; round < 5; ++round) {
        const int result = test::inFork([&] {
            for (uint32_t i = 0; i < 50; ++i) {
                if (key.setU32(VX_TEXT("child"), round * 50 + i) != status::ok) return 1;
            }
            uint32_t number = 0;
            if (key.readU32(VX_TEXT("before"), number) != RegistryRead::value || number != 1) return 2;
            return 0;
        });
        CHECK(result == 0);
        CHECK(key.setU32(VX_TEXT("parent"), round) == status::ok);
        uint32_t number = 0;
        CHECK(key.readU32(VX_TEXT("child"), number) == RegistryRead::value);
        CHECK(number == round * 50 + 49);
    }
}

TEST_CASE_FIXTURE(test::RegistryFixture, "parent and child of a fork write at once and no write is lost") {
    CHECK(key.setU32(VX_TEXT("before"), 1) == status::ok);
    const pid_t child = test::forkFlushed();
    const WideString own = child == 0 ? VX_TEXT("child ") : VX_TEXT("parent ");
    int failures = 0;
    for (uint32_t i = 0; i < 200; ++i) failures += key.setU32(own + toWide(std::to_string(i)), i) != status::ok ? 1 : 0;
    if (child == 0) _exit(failures == 0 ? 0 : 1);
    int result = 0;
    waitpid(child, &result, 0);
    CHECK(result == 0);
    CHECK(failures == 0);
    std::vector<WideString> names;
    CHECK(key.values(names) == status::ok);
    CHECK(names.size() == 401);
}
