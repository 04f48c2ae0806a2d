// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>

#include "tests/preset/store_fixture.h"

using namespace vxcomn;
using test::StoreFixture;

namespace {

constexpr auto kMachine = RegistryRoot::localMachine;

bool there(const WideString &path) {
    RegistryKey key;
    return RegistryKey::open(kMachine, path, RegistryAccess::read, key) == status::ok;
}

void make(const WideString &path) {
    RegistryKey key;
    REQUIRE(RegistryKey::create(kMachine, path, RegistryAccess::all, key) == status::ok);
    REQUIRE(key.setU32(VX_TEXT("v"), 1) == status::ok);
}

}  // namespace

TEST_CASE_FIXTURE(StoreFixture, "a tree is deleted with its top, or all but its top") {
    const WideString top = configuration;
    for (const VXWCHAR *below : {VX_TEXT("\\a\\b\\c"), VX_TEXT("\\a\\d"), VX_TEXT("\\e")}) make(top + below);
    make(configurationKey(device, VX_TEXT("MFX")));
    make(top);
    CHECK(DeleteRegKeyTree(top, true));
    CHECK(there(top));
    std::vector<WideString> names;
    RegistryKey key = open(top);
    CHECK(key.subkeys(names) == status::ok);
    CHECK(names.empty());
    uint32_t value = 0;
    CHECK(key.readU32(VX_TEXT("v"), value) == RegistryRead::value);
    key.close();

    make(top + VX_TEXT("\\a\\b"));
    CHECK(DeleteRegKeyTree(top, false));
    CHECK_FALSE(there(top));
    CHECK(there(configurationKey(device, VX_TEXT("MFX"))));
}

TEST_CASE_FIXTURE(StoreFixture, "a tree that isn't there counts as deleted") {
    CHECK(DeleteRegKeyTree(configuration, false));
    CHECK(DeleteRegKeyTree(configuration, true));
}

TEST_CASE_FIXTURE(StoreFixture, "a path over 520 characters is cut there") {
    // Levels of 100, so that the cut falls inside of one, and a key that is named as what is left of it.
    WideString path = configuration;
    while (path.size() + 101 <= 520) path += VX_TEXT("\\") + WideString(100, VXWCHAR{'k'});
    const WideString whole = path + VX_TEXT("\\") + WideString(100, VXWCHAR{'k'});
    const WideString cut = whole.substr(0, 520);
    REQUIRE(whole.size() > 520);
    REQUIRE(cut.size() > path.size() + 1);
    make(whole);
    CHECK(DeleteRegKeyTree(whole, false));  // the cut name leads nowhere, which counts as deleted
    CHECK(there(whole));
    make(cut);
    CHECK(DeleteRegKeyTree(whole, false));
    CHECK_FALSE(there(cut));
    CHECK(there(whole));
}

TEST_CASE_FIXTURE(StoreFixture, "a tree that is deeper than 520 characters ends in failure and not in a hang") {
    WideString path = configuration;
    for (int level = 0; level < 6; ++level) path += VX_TEXT("\\") + WideString(100, VXWCHAR{'k'});
    make(path);
    CHECK_FALSE(DeleteRegKeyTree(configuration, false));
    CHECK(there(path));
    CHECK(DeleteRegKeyTree(configuration, true));  // who keeps the top is told nothing of what stayed
    CHECK(there(path));
}

TEST_CASE_FIXTURE(StoreFixture, "a wide and deep tree goes to the last key") {
    for (int i = 0; i < 30; ++i) make(parameters + VX_TEXT("\\") + decimalName(i) + VX_TEXT("\\Data"));
    WideString deep = configuration + VX_TEXT("\\deep");
    for (int i = 0; i < 100; ++i) deep += VX_TEXT("\\d");
    make(deep);
    CHECK(DeleteRegKeyTree(configuration, false));
    CHECK_FALSE(there(configuration));
}
