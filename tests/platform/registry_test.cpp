// SPDX-License-Identifier: MIT
#include "platform/registry.h"

#include <doctest/doctest.h>

#include <algorithm>

#include "tests/platform/registry_fixture.h"

using namespace vxcomn;
using test::RegistryFixture;

namespace {

using Bytes = std::vector<uint8_t>;
using Names = std::vector<WideString>;

Names sorted(Names names) {
    std::sort(names.begin(), names.end());
    return names;
}

Names keysOf(const RegistryKey &key) {
    Names names;
    CHECK(key.subkeys(names) == status::ok);
    return sorted(names);
}

Names valuesOf(const RegistryKey &key) {
    Names names;
    CHECK(key.values(names) == status::ok);
    return sorted(names);
}

Bytes numbered(size_t size) {
    Bytes bytes(size);
    for (size_t i = 0; i < size; ++i) bytes[i] = static_cast<uint8_t>(i * 7);
    return bytes;
}

}  // namespace

TEST_CASE_FIXTURE(RegistryFixture, "the four roots exist from the beginning") {
    for (const auto root :
         {RegistryRoot::localMachine, RegistryRoot::currentUser, RegistryRoot::users, RegistryRoot::classesRoot}) {
        RegistryKey opened;
        CHECK(RegistryKey::open(root, {}, RegistryAccess::read, opened) == status::ok);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "a key is made with all above it, once") {
    RegistryKey made, opened;
    bool created = false;
    CHECK(key.openBelow(VX_TEXT("A\\B"), RegistryAccess::read, opened) == status::fileNotFound);
    CHECK_FALSE(opened);
    CHECK(key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, made, &created) == status::ok);
    CHECK(created);
    CHECK(key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, made, &created) == status::ok);
    CHECK_FALSE(created);
    CHECK(key.createBelow(VX_TEXT("A"), RegistryAccess::readWrite, made, &created) == status::ok);
    CHECK_FALSE(created);
    CHECK(RegistryKey::open(kRoot, path + VX_TEXT("\\A\\B"), RegistryAccess::read, opened) == status::ok);
    CHECK(opened);
    CHECK(RegistryKey::create(kRoot, path + VX_TEXT("\\C"), RegistryAccess::read, opened, &created) == status::ok);
    CHECK(created);
}

TEST_CASE_FIXTURE(RegistryFixture, "values of every type come back byte for byte, also empty and large ones") {
    for (const auto type : {RegistryType::none, RegistryType::sz, RegistryType::expandSz, RegistryType::binary, RegistryType::dword,
                            RegistryType::multiSz, RegistryType::qword}) {
        for (const size_t size : {size_t{0}, size_t{1}, size_t{3}, size_t{4}, size_t{8}, size_t{256}, size_t{65537}}) {
            const Bytes data = numbered(size);
            REQUIRE(key.set(VX_TEXT("v"), RegistryType::binary, numbered(5)) == status::ok);
            REQUIRE(key.set(VX_TEXT("v"), type, data) == status::ok);
            RegistryValue value;
            REQUIRE(key.query(VX_TEXT("v"), value) == status::ok);
            CHECK(value.type == type);
            // The system may complete text by an end or cut an odd byte; what was given comes first.
            if (type == RegistryType::binary || type == RegistryType::none) {
                CHECK(value.data == data);
            } else {
                const size_t common = std::min(data.size() & ~size_t{1}, value.data.size() & ~size_t{1});
                CHECK(std::equal(data.begin(), data.begin() + static_cast<std::ptrdiff_t>(common), value.data.begin()));
                CHECK(value.data.size() + 1 >= data.size());
            }
        }
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "names compare without regard to case and keep the spelling of their first writer") {
    RegistryKey made;
    bool created = true;
    CHECK(key.createBelow(VX_TEXT("M\u00F6rder"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(key.createBelow(VX_TEXT("m\u00D6RDER"), RegistryAccess::readWrite, made, &created) == status::ok);
    CHECK_FALSE(created);
    CHECK(keysOf(key) == Names{VX_TEXT("M\u00F6rder")});
    CHECK(key.setU32(VX_TEXT("Level"), 1) == status::ok);
    CHECK(key.setU32(VX_TEXT("LEVEL"), 2) == status::ok);
    CHECK(valuesOf(key) == Names{VX_TEXT("Level")});
    uint32_t number = 0;
    CHECK(key.readU32(VX_TEXT("level"), number) == RegistryRead::value);
    CHECK(number == 2);
}

TEST_CASE_FIXTURE(RegistryFixture, "the empty name is the key's own value") {
    CHECK(key.setText({}, VX_TEXT("own")) == status::ok);
    WideString text;
    CHECK(key.readText({}, text) == RegistryRead::value);
    CHECK(text == VX_TEXT("own"));
    CHECK(valuesOf(key) == Names{WideString()});
    CHECK(key.deleteValue({}) == status::ok);
    CHECK(key.readText({}, text) == RegistryRead::absent);
}

TEST_CASE_FIXTURE(RegistryFixture,
                  "a typed read tells value, absent and wrong type apart, and leaves its output alone but for a value") {
    uint32_t number = 7;
    uint64_t wide = 8;
    WideString text = VX_TEXT("old");
    Bytes bytes = {9};

    CHECK(key.readU32(VX_TEXT("x"), number) == RegistryRead::absent);
    CHECK(key.readU64(VX_TEXT("x"), wide) == RegistryRead::absent);
    CHECK(key.readText(VX_TEXT("x"), text) == RegistryRead::absent);
    CHECK(key.readBytes(VX_TEXT("x"), bytes, 100) == RegistryRead::absent);

    for (const auto type : {RegistryType::none, RegistryType::sz, RegistryType::expandSz, RegistryType::binary, RegistryType::dword,
                            RegistryType::multiSz, RegistryType::qword}) {
        for (const size_t size : {size_t{0}, size_t{3}, size_t{4}, size_t{5}, size_t{8}, size_t{101}}) {
            REQUIRE(key.set(VX_TEXT("x"), type, numbered(size)) == status::ok);
            const bool isBinary = type == RegistryType::binary;
            const bool isU32 = (type == RegistryType::dword || isBinary) && size == 4;
            const bool isU64 = (type == RegistryType::qword || isBinary) && size == 8;
            number = 7, wide = 8, text = VX_TEXT("old"), bytes = {9};
            CHECK(key.readU32(VX_TEXT("x"), number) == (isU32 ? RegistryRead::value : RegistryRead::wrongType));
            CHECK(key.readU64(VX_TEXT("x"), wide) == (isU64 ? RegistryRead::value : RegistryRead::wrongType));
            CHECK((key.readText(VX_TEXT("x"), text) == RegistryRead::value) == (type == RegistryType::sz));
            CHECK((key.readBytes(VX_TEXT("x"), bytes, 100) == RegistryRead::value) == (isBinary && size <= 100));
            CHECK(number == (isU32 ? 0x150E0700u : 7u));
            CHECK(wide == (isU64 ? 0x312A231C150E0700u : 8u));
            if (type != RegistryType::sz) CHECK(text == VX_TEXT("old"));
            CHECK(bytes == (isBinary && size <= 100 ? numbered(size) : Bytes{9}));
        }
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "text reads up to its first end, or to that of its data if it has none") {
    const auto put = [this](WideView units) {
        return key.set(VX_TEXT("t"), RegistryType::sz, {reinterpret_cast<const uint8_t *>(units.data()), units.size() * 2});
    };
    WideString text;
    CHECK(put(WideView(VX_TEXT("ab\0cd"), 5)) == status::ok);
    CHECK(key.readText(VX_TEXT("t"), text) == RegistryRead::value);
    CHECK(text == VX_TEXT("ab"));
    CHECK(put(VX_TEXT("xyz")) == status::ok);
    CHECK(key.readText(VX_TEXT("t"), text) == RegistryRead::value);
    CHECK(text == VX_TEXT("xyz"));
    CHECK(key.setText(VX_TEXT("t"), {}) == status::ok);
    CHECK(key.readText(VX_TEXT("t"), text) == RegistryRead::value);
    CHECK(text.empty());
}

TEST_CASE_FIXTURE(RegistryFixture, "numbers, text and bytes that were set read back") {
    CHECK(key.setU32(VX_TEXT("d"), 0xFFFFFFFE) == status::ok);
    CHECK(key.setU64(VX_TEXT("q"), 0x8000000000000001) == status::ok);
    CHECK(key.setText(VX_TEXT("t"), VX_TEXT("\u20AC\xD83C\xDFB5")) == status::ok);
    CHECK(key.setBytes(VX_TEXT("b"), numbered(77)) == status::ok);
    uint32_t number = 0;
    uint64_t wide = 0;
    WideString text;
    Bytes bytes;
    CHECK(key.readU32(VX_TEXT("d"), number) == RegistryRead::value);
    CHECK(key.readU64(VX_TEXT("q"), wide) == RegistryRead::value);
    CHECK(key.readText(VX_TEXT("t"), text) == RegistryRead::value);
    CHECK(key.readBytes(VX_TEXT("b"), bytes, 77) == RegistryRead::value);
    CHECK(number == 0xFFFFFFFE);
    CHECK(wide == 0x8000000000000001);
    CHECK(text == VX_TEXT("\u20AC\xD83C\xDFB5"));
    CHECK(bytes == numbered(77));
}

TEST_CASE_FIXTURE(RegistryFixture, "a deleted value is gone, and deleting it again answers 2") {
    CHECK(key.setU32(VX_TEXT("v"), 1) == status::ok);
    CHECK(key.deleteValue(VX_TEXT("V")) == status::ok);
    RegistryValue value;
    CHECK(key.query(VX_TEXT("v"), value) == status::fileNotFound);
    CHECK(key.deleteValue(VX_TEXT("v")) == status::fileNotFound);
}

TEST_CASE_FIXTURE(RegistryFixture, "a key with keys below it is deleted only as a tree") {
    RegistryKey made;
    CHECK(key.createBelow(VX_TEXT("A\\B\\C"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(made.setU32(VX_TEXT("v"), 1) == status::ok);
    CHECK(key.deleteBelow(VX_TEXT("A")) == status::accessDenied);
    CHECK(key.deleteBelow(VX_TEXT("A\\B")) == status::accessDenied);
    CHECK(key.deleteBelow(VX_TEXT("X")) == status::fileNotFound);
    CHECK(key.deleteBelow({}) == status::invalidParameter);
    CHECK(key.deleteBelow(VX_TEXT("A\\B\\C")) == status::ok);
    CHECK(key.createBelow(VX_TEXT("A\\B\\D"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(key.deleteTreeBelow(VX_TEXT("A")) == status::ok);
    CHECK(keysOf(key).empty());
    CHECK(key.deleteTreeBelow(VX_TEXT("A")) == status::fileNotFound);
}

TEST_CASE_FIXTURE(RegistryFixture, "a key made anew has nothing of the deleted one's") {
    RegistryKey made;
    CHECK(key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(made.setU32(VX_TEXT("v"), 1) == status::ok);
    made.close();
    CHECK(key.deleteTreeBelow(VX_TEXT("A")) == status::ok);
    CHECK(key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(valuesOf(made).empty());
}

TEST_CASE_FIXTURE(RegistryFixture, "deleting the tree of an empty path empties the key and keeps it") {
    RegistryKey made;
    CHECK(key.createBelow(VX_TEXT("A\\B"), RegistryAccess::readWrite, made) == status::ok);
    CHECK(key.setU32(VX_TEXT("v"), 1) == status::ok);
    made.close();
    CHECK(key.deleteTreeBelow({}) == status::ok);
    CHECK(keysOf(key).empty());
    CHECK(valuesOf(key).empty());
    CHECK(key.setU32(VX_TEXT("v"), 1) == status::ok);
}

TEST_CASE_FIXTURE(RegistryFixture, "a handle to a deleted key answers 1018, also when a key of that name was made again") {
    RegistryKey old, made;
    CHECK(key.createBelow(VX_TEXT("A"), RegistryAccess::all, old) == status::ok);
    CHECK(old.setU32(VX_TEXT("v"), 1) == status::ok);
    CHECK(key.deleteBelow(VX_TEXT("A")) == status::ok);
    for (int round = 0; round < 2; ++round) {
        RegistryValue value;
        Names names;
        uint32_t number = 0;
        CHECK(old.query(VX_TEXT("v"), value) == status::keyDeleted);
        CHECK(old.readU32(VX_TEXT("v"), number) == RegistryRead::absent);
        CHECK(old.setU32(VX_TEXT("v"), 2) == status::keyDeleted);
        CHECK(old.deleteValue(VX_TEXT("v")) == status::keyDeleted);
        CHECK(old.subkeys(names) == status::keyDeleted);
        CHECK(old.values(names) == status::keyDeleted);
        CHECK(old.openBelow(VX_TEXT("B"), RegistryAccess::read, made) == status::keyDeleted);
        CHECK(old.createBelow(VX_TEXT("B"), RegistryAccess::read, made) == status::keyDeleted);
        CHECK(old.deleteBelow(VX_TEXT("B")) == status::keyDeleted);
        CHECK(key.createBelow(VX_TEXT("A"), RegistryAccess::all, made) == status::ok);
    }
}

TEST_CASE_FIXTURE(RegistryFixture, "a key opened without the right answers 5") {
    CHECK(key.setU32(VX_TEXT("v"), 1) == status::ok);
    RegistryKey reader, writer;
    RegistryValue value;
    Names names;
    CHECK(RegistryKey::open(kRoot, path, RegistryAccess::read, reader) == status::ok);
    CHECK(RegistryKey::open(kRoot, path, RegistryAccess::write, writer) == status::ok);
    CHECK(reader.query(VX_TEXT("v"), value) == status::ok);
    CHECK(reader.setU32(VX_TEXT("v"), 2) == status::accessDenied);
    CHECK(reader.deleteValue(VX_TEXT("v")) == status::accessDenied);
    CHECK(writer.setU32(VX_TEXT("v"), 3) == status::ok);
    CHECK(writer.query(VX_TEXT("v"), value) == status::accessDenied);
    CHECK(writer.values(names) == status::accessDenied);
    CHECK(writer.subkeys(names) == status::accessDenied);
}

TEST_CASE_FIXTURE(RegistryFixture, "a name with a NUL in it is declined, not cut") {
    const WideString name(VX_TEXT("a\0b"), 3);
    RegistryKey made;
    RegistryValue value;
    CHECK(key.setU32(VX_TEXT("a"), 1) == status::ok);
    CHECK(key.setU32(name, 2) == status::invalidParameter);
    CHECK(key.query(name, value) == status::invalidParameter);
    CHECK(key.deleteValue(name) == status::invalidParameter);
    CHECK(key.createBelow(name, RegistryAccess::read, made) == status::invalidParameter);
    CHECK(key.openBelow(name, RegistryAccess::read, made) == status::invalidParameter);
    CHECK(key.deleteTreeBelow(name) == status::invalidParameter);
    CHECK(valuesOf(key) == Names{VX_TEXT("a")});
}

TEST_CASE("a key object that holds no key answers 6") {
    RegistryKey key, other;
    RegistryValue value;
    Names names;
    CHECK_FALSE(key);
    CHECK(key.query(VX_TEXT("v"), value) == status::invalidHandle);
    CHECK(key.setU32(VX_TEXT("v"), 2) == status::invalidHandle);
    CHECK(key.deleteValue(VX_TEXT("v")) == status::invalidHandle);
    CHECK(key.openBelow(VX_TEXT("B"), RegistryAccess::read, other) == status::invalidHandle);
    CHECK(key.createBelow(VX_TEXT("B"), RegistryAccess::read, other) == status::invalidHandle);
    CHECK(key.deleteBelow(VX_TEXT("B")) == status::invalidHandle);
    CHECK(key.deleteTreeBelow(VX_TEXT("B")) == status::invalidHandle);
    CHECK(key.subkeys(names) == status::invalidHandle);
    CHECK(key.values(names) == status::invalidHandle);
}
