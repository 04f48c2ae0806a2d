// SPDX-License-Identifier: MIT
//
// What the registry's calls cost in statements and commits, and what happens to paths that are known from before when somebody else
// takes the keys away.
#include <doctest/doctest.h>

#include "platform/change_signal.h"
#include "platform/posix/registry_store.h"
#include "tests/platform/registry_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using test::RegistryFixture;

namespace {

constexpr auto kRoot = RegistryFixture::kRoot;

// Deletes a tree below a key, or deletes it and makes it anew with a value.
const test::Helper replaceTree("replace-tree", [](const std::vector<std::string> &arguments) {
    RegistryKey key, made;
    if (RegistryKey::open(kRoot, toWide(arguments.at(0)), RegistryAccess::all, key) != status::ok) return 1;
    if (key.deleteTreeBelow(VX_TEXT("a")) != status::ok) return 2;
    if (arguments.at(1) == "delete") return 0;
    if (key.createBelow(VX_TEXT("a\\b"), RegistryAccess::all, made) != status::ok) return 3;
    return made.setU32(VX_TEXT("other"), 1) == status::ok ? 0 : 4;
});

struct Cost {
    StoreCounts before = storeCounts();
    uint64_t statements() const { return storeCounts().statements - before.statements; }
    uint64_t commits() const { return storeCounts().commits - before.commits; }
};

}  // namespace

TEST_CASE_FIXTURE(RegistryFixture, "paths known from before cost one statement, with the value or the values in it") {
    RegistryKey made;
    const WideString below = path + VX_TEXT("\\a\\b\\c");
    REQUIRE(RegistryKey::create(kRoot, below, RegistryAccess::all, made) == status::ok);
    REQUIRE(made.setU32(VX_TEXT("v"), 1) == status::ok);
    RegistryValue value;
    std::vector<RegistryEntry> entries;
    std::vector<RegistrySubkey> subkeys;
    {
        const Cost cost;
        REQUIRE(RegistryKey::open(kRoot, below, RegistryAccess::read, made) == status::ok);
        CHECK(cost.statements() == 1);
    }
    {
        const Cost cost;
        REQUIRE(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::ok);
        CHECK(cost.statements() == 1);
    }
    {
        const Cost cost;
        REQUIRE(RegistryKey::openWithEntries(kRoot, below, RegistryAccess::read, made, 100, entries) == status::ok);
        CHECK(cost.statements() == 1);
    }
    {
        const Cost cost;
        REQUIRE(key.openSubkeys(RegistryAccess::read, VX_TEXT("v"), 8, subkeys) == status::ok);
        CHECK(cost.statements() == 1);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "several calls in one write are one commit, and signal once") {
    ChangeSignal signal;
    REQUIRE(ChangeSignal::open(key, ChangeFilter::keysAndValues, signal) == status::ok);
    REQUIRE(signal.arm() == status::ok);
    const Cost cost;
    REQUIRE(inOneWrite([&] {
                RegistryKey made;
                key.createBelow(VX_TEXT("a\\b"), RegistryAccess::all, made);
                made.setU32(VX_TEXT("v"), 1);
                CHECK(waitForOne(signal, 0) == WaitOutcome::timedOut);
                return key.setU32(VX_TEXT("w"), 1);
            }) == status::ok);
    CHECK(cost.commits() == 1);
    CHECK(waitForOne(signal, 0) == WaitOutcome::signalled);
}

TEST_CASE_FIXTURE(RegistryFixture, "one write whose known keys another process took away is done again on new ones") {
    for (const char *what : {"delete", "anew"}) {
        const auto writeBoth = [&](uint32_t number) {
            int times = 0;
            CHECK(inOneWrite([&] {
                      ++times;
                      RegistryKey made;
                      const Status status = RegistryKey::create(kRoot, path + VX_TEXT("\\a\\b"), RegistryAccess::all, made);
                      if (status != status::ok) return status;
                      made.setU32(VX_TEXT("v"), number);
                      return key.setU32(VX_TEXT("w"), number);
                  }) == status::ok);
            return times;
        };
        writeBoth(1);
        CHECK(writeBoth(2) == 1);
        CHECK(test::startHelper("replace-tree", {toUtf8(path), what}).wait() == 0);
        CHECK(writeBoth(3) == 2);
        RegistryKey opened;
        uint32_t value = 0;
        REQUIRE(key.openBelow(VX_TEXT("a\\b"), RegistryAccess::read, opened) == status::ok);
        CHECK(opened.readU32(VX_TEXT("v"), value) == RegistryRead::value);
        CHECK(value == 3);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "reads by a known path follow what another process did to it") {
    const WideString below = path + VX_TEXT("\\a\\b");
    RegistryKey made;
    RegistryValue value;
    std::vector<RegistryEntry> entries;
    for (int round = 0; round < 2; ++round) {
        REQUIRE(RegistryKey::create(kRoot, below, RegistryAccess::all, made) == status::ok);
        REQUIRE(made.setU32(VX_TEXT("v"), 1) == status::ok);
        REQUIRE(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::ok);
        CHECK(test::startHelper("replace-tree", {toUtf8(path), "anew"}).wait() == 0);
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("other"), value) == status::ok);
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::fileNotFound);
        CHECK(RegistryKey::openWithEntries(kRoot, below, RegistryAccess::read, made, 10, entries) == status::ok);
        CHECK(entries.size() == 1);
        CHECK(test::startHelper("replace-tree", {toUtf8(path), "delete"}).wait() == 0);
        CHECK(RegistryKey::open(kRoot, below, RegistryAccess::read, made) == status::fileNotFound);
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::fileNotFound);
        CHECK(RegistryKey::openWithEntries(kRoot, below, RegistryAccess::read, made, 10, entries) == status::fileNotFound);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "a handle of a key that is gone says so inside of one write, too") {
    RegistryKey gone;
    REQUIRE(key.createBelow(VX_TEXT("gone"), RegistryAccess::all, gone) == status::ok);
    REQUIRE(key.deleteBelow(VX_TEXT("gone")) == status::ok);
    Status inside = status::ok;
    CHECK(inOneWrite([&] {
              inside = gone.setU32(VX_TEXT("v"), 1);
              return key.setU32(VX_TEXT("w"), 5);
          }) == status::ok);
    CHECK(inside == status::keyDeleted);
    uint32_t value = 0;
    CHECK(key.readU32(VX_TEXT("w"), value) == RegistryRead::value);
}

TEST_CASE_FIXTURE(RegistryFixture, "work that throws leaves the store as it was, and keys of its making are forgotten") {
    CHECK(inOneWrite([&]() -> Status {
              RegistryKey made;
              key.createBelow(VX_TEXT("short"), RegistryAccess::all, made);
              made.setU32(VX_TEXT("v"), 1);
              throw std::bad_alloc();
          }) == status::notEnoughMemory);
    RegistryKey opened;
    CHECK(key.openBelow(VX_TEXT("short"), RegistryAccess::read, opened) == status::fileNotFound);
    REQUIRE(key.createBelow(VX_TEXT("another"), RegistryAccess::all, opened) == status::ok);
    CHECK(key.openBelow(VX_TEXT("short"), RegistryAccess::read, opened) == status::fileNotFound);
}
