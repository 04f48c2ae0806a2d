// SPDX-License-Identifier: MIT
//
// What the registry answers in one piece: lists of values, keys below with a value of each, and several writes as one.
#include <doctest/doctest.h>

#include <algorithm>

#include "tests/platform/registry_fixture.h"

using namespace vxcomn;
using test::RegistryFixture;
using Bytes = std::vector<uint8_t>;

namespace {

constexpr auto kRoot = RegistryFixture::kRoot;

const RegistryEntry *named(const std::vector<RegistryEntry> &entries, const VXWCHAR *name) {
    const auto found = std::find_if(entries.begin(), entries.end(), [name](const auto &entry) { return entry.name == name; });
    return found != entries.end() ? &*found : nullptr;
}

const RegistrySubkey *named(const std::vector<RegistrySubkey> &subkeys, const VXWCHAR *name) {
    const auto found = std::find_if(subkeys.begin(), subkeys.end(), [name](const auto &subkey) { return subkey.name == name; });
    return found != subkeys.end() ? &*found : nullptr;
}

}  // namespace

TEST_CASE_FIXTURE(RegistryFixture, "a value over the limit is told by its type and not read") {
    REQUIRE(key.setBytes(VX_TEXT("v"), Bytes(100, 1)) == status::ok);
    RegistryValue value;
    CHECK(key.query(VX_TEXT("v"), value, 100) == status::ok);
    CHECK(value.data.size() == 100);
    CHECK(key.query(VX_TEXT("v"), value, 99) == status::moreData);
    CHECK(value.type == RegistryType::binary);
    CHECK(value.data.empty());
    CHECK(key.query(VX_TEXT("v"), value, 0) == status::moreData);
    REQUIRE(key.setBytes(VX_TEXT("v"), Bytes(300, 2)) == status::ok);
    CHECK(key.query(VX_TEXT("v"), value, 280) == status::moreData);
    CHECK(key.query(VX_TEXT("v"), value, 300) == status::ok);
    CHECK(value.data == Bytes(300, 2));
    REQUIRE(key.setBytes(VX_TEXT("v"), {}) == status::ok);
    CHECK(key.query(VX_TEXT("v"), value, 0) == status::ok);
    CHECK(value.data.empty());
}

TEST_CASE_FIXTURE(RegistryFixture, "a value is read by its key's path, also when that goes and comes again") {
    RegistryValue value;
    const WideString below = path + VX_TEXT("\\a\\b");
    CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::fileNotFound);
    for (uint32_t round = 0; round < 3; ++round) {
        RegistryKey made;
        REQUIRE(RegistryKey::create(kRoot, below, RegistryAccess::all, made) == status::ok);
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::fileNotFound);
        REQUIRE(made.setU32(VX_TEXT("v"), round) == status::ok);
        REQUIRE(RegistryKey::queryAt(kRoot, below, VX_TEXT("V"), value, 4) == status::ok);
        CHECK(value.type == RegistryType::dword);
        CHECK(value.data == Bytes{static_cast<uint8_t>(round), 0, 0, 0});
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value, 3) == status::moreData);
        made.close();
        REQUIRE(key.deleteTreeBelow(VX_TEXT("a")) == status::ok);
        CHECK(RegistryKey::queryAt(kRoot, below, VX_TEXT("v"), value) == status::fileNotFound);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "all values of a key come with their data, what is over the limit without it") {
    std::vector<RegistryEntry> entries = {{VX_TEXT("old"), {}}};
    CHECK(key.entries(10, entries) == status::ok);
    CHECK(entries.empty());
    REQUIRE(key.setU32(VX_TEXT("Number"), 7) == status::ok);
    REQUIRE(key.setBytes(VX_TEXT("Long"), Bytes(11, 1)) == status::ok);
    REQUIRE(key.setBytes({}, Bytes(10, 2)) == status::ok);
    REQUIRE(key.setBytes(VX_TEXT("Nothing"), {}) == status::ok);
    REQUIRE(key.entries(10, entries) == status::ok);
    CHECK(entries.size() == 4);
    REQUIRE(named(entries, VX_TEXT("Number")));
    CHECK(named(entries, VX_TEXT("Number"))->value.type == RegistryType::dword);
    CHECK(named(entries, VX_TEXT("Number"))->value.data == Bytes{7, 0, 0, 0});
    REQUIRE(named(entries, VX_TEXT("Long")));
    CHECK(named(entries, VX_TEXT("Long"))->value.type == RegistryType::binary);
    CHECK(named(entries, VX_TEXT("Long"))->value.data.empty());
    REQUIRE(named(entries, VX_TEXT("")));
    CHECK(named(entries, VX_TEXT(""))->value.data == Bytes(10, 2));
    CHECK(named(entries, VX_TEXT("Nothing")));

    RegistryKey opened;
    CHECK(RegistryKey::openWithEntries(kRoot, path, RegistryAccess::readWrite, opened, 10, entries) == status::ok);
    CHECK(entries.size() == 4);
    CHECK(opened.setU32(VX_TEXT("Number"), 8) == status::ok);
    CHECK(RegistryKey::openWithEntries(kRoot, path + VX_TEXT("\\none"), RegistryAccess::read, opened, 10, entries) ==
          status::fileNotFound);
    CHECK(entries.size() == 4);
    RegistryKey gone;
    REQUIRE(key.createBelow(VX_TEXT("gone"), RegistryAccess::all, gone) == status::ok);
    REQUIRE(key.deleteBelow(VX_TEXT("gone")) == status::ok);
    CHECK(gone.entries(10, entries) == status::keyDeleted);
    CHECK(RegistryKey::openWithEntries(kRoot, path + VX_TEXT("\\gone"), RegistryAccess::read, opened, 10, entries) ==
          status::fileNotFound);
    CHECK(RegistryKey().entries(10, entries) == status::invalidHandle);
}

TEST_CASE_FIXTURE(RegistryFixture, "keys below are opened with a value of each") {
    std::vector<RegistrySubkey> subkeys;
    CHECK(key.openSubkeys(RegistryAccess::read, VX_TEXT("v"), 8, subkeys) == status::ok);
    CHECK(subkeys.empty());
    RegistryKey below;
    REQUIRE(key.createBelow(VX_TEXT("With"), RegistryAccess::all, below) == status::ok);
    REQUIRE(below.setU64(VX_TEXT("V"), 5) == status::ok);
    REQUIRE(key.createBelow(VX_TEXT("Long"), RegistryAccess::all, below) == status::ok);
    REQUIRE(below.setBytes(VX_TEXT("v"), Bytes(9, 1)) == status::ok);
    REQUIRE(key.createBelow(VX_TEXT("Without\\Deeper"), RegistryAccess::all, below) == status::ok);
    REQUIRE(key.openSubkeys(RegistryAccess::readWrite, VX_TEXT("v"), 8, subkeys) == status::ok);
    CHECK(subkeys.size() == 3);
    const RegistrySubkey *with = named(subkeys, VX_TEXT("With"));
    REQUIRE(with);
    REQUIRE(with->value);
    CHECK(with->value->type == RegistryType::qword);
    CHECK(with->value->data == Bytes{5, 0, 0, 0, 0, 0, 0, 0});
    uint64_t read = 0;
    CHECK(with->key.readU64(VX_TEXT("v"), read) == RegistryRead::value);
    for (const VXWCHAR *name : {VX_TEXT("Long"), VX_TEXT("Without")}) {
        REQUIRE(named(subkeys, name));
        CHECK_FALSE(named(subkeys, name)->value);
    }
    CHECK(named(subkeys, VX_TEXT("Without"))->key.openBelow(VX_TEXT("Deeper"), RegistryAccess::read, below) == status::ok);
}

TEST_CASE_FIXTURE(RegistryFixture, "several calls in one write find each other's keys and values") {
    CHECK(inOneWrite([&] {
              RegistryKey made, opened;
              if (key.createBelow(VX_TEXT("a\\b"), RegistryAccess::all, made) != status::ok) return Status{1};
              if (made.setU32(VX_TEXT("v"), 1) != status::ok) return Status{2};
              if (RegistryKey::open(kRoot, path + VX_TEXT("\\a\\b"), RegistryAccess::all, opened) != status::ok) return Status{3};
              uint32_t value = 0;
              if (opened.readU32(VX_TEXT("v"), value) != RegistryRead::value) return Status{4};
              if (key.deleteBelow(VX_TEXT("a")) != status::accessDenied) return Status{5};
              if (inOneWrite([&] { return made.setU32(VX_TEXT("v"), value + 1); }) != status::ok) return Status{6};
              return status::ok;
          }) == status::ok);
    RegistryKey opened;
    uint32_t value = 0;
    REQUIRE(key.openBelow(VX_TEXT("a\\b"), RegistryAccess::read, opened) == status::ok);
    CHECK(opened.readU32(VX_TEXT("v"), value) == RegistryRead::value);
    CHECK(value == 2);
}

TEST_CASE_FIXTURE(RegistryFixture, "what went well in one write stays when its work ends with an error, which is handed on") {
    CHECK(inOneWrite([&] {
              key.setU32(VX_TEXT("v"), 3);
              return status::noMoreItems;
          }) == status::noMoreItems);
    uint32_t value = 0;
    CHECK(key.readU32(VX_TEXT("v"), value) == RegistryRead::value);
    CHECK(value == 3);
}
