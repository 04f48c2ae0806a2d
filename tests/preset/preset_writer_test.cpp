// SPDX-License-Identifier: MIT
#include "preset/preset_writer.h"

#include <doctest/doctest.h>

#include <random>

#include "preset/sha256.h"
#include "tests/preset/recording.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

std::span<const uint8_t> text(std::string_view characters) {
    return {reinterpret_cast<const uint8_t *>(characters.data()), characters.size()};
}

void checkRoundTrip(const Bytes &image) {
    PresetDocument document;
    REQUIRE(parsePreset(image, document) == PresetParse::parsed);
    CHECK(writePreset(document) == image);
}

}  // namespace

TEST_CASE("the digest of the standard's examples comes out") {
    CHECK(sha256Text(text("abc")) == "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad");
    CHECK(sha256Text(text("")) == "e3b0c44298fc1c149afbf4c8996fb92427ae41e4649b934ca495991b7852b855");
    CHECK(sha256Text(text("abcdbcdecdefdefgefghfghighijhijkijkljklmklmnlmnomnopnopq")) ==
          "248d6a61d20638b8e5c026930c3e6039a33ce45964ff2167f6ecedd419db06c1");
    CHECK(sha256Text(text(std::string(1000000, 'a'))) == "cdc76e5c9914fb9281a1c7e284d73e67f1809a48a497200e046d39ccc7112cd0");
}

TEST_CASE("the digest's end block is right for every length around a block's") {
    CHECK(sha256Text(text(std::string(55, 'a'))) == "9f4390f8d30c2dd92ec9f095b65e2b9ae9b0a925a5258e241c9f1e910f734318");
    CHECK(sha256Text(text(std::string(56, 'a'))) == "b35439a4ac6f0948b6d6f9e3c6af0f5f590ce20f1bde7090ef7970686ec6738a");
    CHECK(sha256Text(text(std::string(64, 'a'))) == "ffe054fe7ae0cb6dc65c3af9b61d5209f439851db43d0ba5997337df154668eb");
}

TEST_CASE("an image carries its own digest, taken with zeros in its place") {
    Bytes image = writePreset(longDocument());
    const PresetHash stored = LoadRun(image).owner.hash;
    std::fill(image.begin() + 4, image.begin() + 36, uint8_t{0});
    CHECK(stored == sha256(image));
}

TEST_CASE("the digest depends on the version and on every byte behind it") {
    const Bytes image = writePreset(longDocument());
    const PresetHash digest = presetDigest(image);
    for (size_t i = 0; i < image.size(); ++i) {
        Bytes other = image;
        other[i] ^= 1;
        CAPTURE(i);
        CHECK((presetDigest(other) == digest) == (i >= 4 && i < 36));
    }
}

TEST_CASE("the long header points at name, record and stream in order") {
    const Bytes image = writePreset(longDocument());
    CHECK(image.size() == 72 + 7 + 20 + 17 + 83);
    CHECK(image[72] == 'K');
    PresetDocument document;
    REQUIRE(parsePreset(image, document) == PresetParse::parsed);
    CHECK_FALSE(document.header);
    CHECK_FALSE(document.hash);
    CHECK(document.gaps.empty());
    CHECK(document.blocks == longDocument().blocks);
}

TEST_CASE("an unusual layout is kept: another order, gaps, another hash") {
    ByteWriter image;
    image.u32(0x200000);
    image.bytes(Bytes(32, 0x5A));
    for (const uint32_t word : {1u, 90u, 4u, 80u, 8u, 100u, 77u, 0xFFFFFFFFu, 3u}) image.u32(word);
    image.bytes(Bytes(8, 0x11));  // belongs to nothing
    image.bytes(Bytes(8, 0x22));
    image.u16(0x3333);
    image.bytes(text(std::string_view("ENG\0", 4)));
    image.bytes(Bytes(6, 0x44));
    for (const int32_t word : {-1, 0, 0, 1}) image.i32(word);
    image.u8(9);
    const Bytes bytes = image.release();
    PresetDocument document;
    REQUIRE(parsePreset(bytes, document) == PresetParse::parsed);
    CHECK(document.header);
    CHECK(document.hash);
    CHECK(document.gaps.size() == 3);
    CHECK(document.blocks.size() == 1);
    CHECK(writePreset(document) == bytes);
}

TEST_CASE("taking apart and writing again is the identity for every truncation") {
    for (const PresetDocument &original : {longDocument(), shortDocument()}) {
        const Bytes image = writePreset(original);
        const size_t header = original.hasLongHeader() ? 72 : 36;
        for (size_t length = 0; length <= image.size(); ++length) {
            CAPTURE(length);
            const Bytes part(image.begin(), image.begin() + static_cast<ptrdiff_t>(length));
            PresetDocument document;
            const PresetParse parse = parsePreset(part, document);
            CHECK(parse == (length < 4        ? PresetParse::versionMissing
                            : length < header ? PresetParse::headerCutOff
                                              : PresetParse::parsed));
            if (parse == PresetParse::parsed) CHECK(writePreset(document) == part);
        }
    }
}

TEST_CASE("taking apart and writing again is the identity for every flipped byte") {
    for (const PresetDocument &original : {longDocument(), shortDocument()}) {
        const Bytes image = writePreset(original);
        for (size_t i = 4; i < image.size(); ++i) {
            for (const uint8_t mask : {0x01, 0x80, 0xFF}) {
                Bytes other = image;
                other[i] ^= mask;
                CAPTURE(i);
                checkRoundTrip(other);
            }
        }
    }
}

TEST_CASE("taking apart and writing again is the identity for random images") {
    std::mt19937 random(20240817);
    for (int round = 0; round < 2000; ++round) {
        CAPTURE(round);
        Bytes image(72 + random() % 200);
        for (uint8_t &byte : image) byte = random() % 3 == 0 ? static_cast<uint8_t>(random()) : static_cast<uint8_t>(random() % 3);
        image[0] |= 0x02;
        image[2] |= 0x10;  // a version that is read
        if (random() % 2 == 0) image[3] = 0;
        for (size_t word = 40; word < 72; word += 4) {  // positions that mostly lie in the image
            image[word + 1] = image[word + 2] = image[word + 3] = 0;
        }
        checkRoundTrip(image);
    }
}
