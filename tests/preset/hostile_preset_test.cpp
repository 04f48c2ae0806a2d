// SPDX-License-Identifier: MIT
//
// Presets that were cut, bent or made up. Each load ends, and as the format says; sanitizer builds watch the memory.
#include <doctest/doctest.h>

#include "tests/preset/recording.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

void setWord(Bytes &image, size_t at, uint32_t value) {
    for (size_t i = 0; i < 4; ++i) image[at + i] = static_cast<uint8_t>(value >> 8 * i);
}

// The result as the caller sees it agrees with what the walk found.
void checkConsistent(const LoadRun &load) {
    const bool damaged = load.log.has("Preset file is damaged!\n");
    CHECK(damaged == (load.result.outcome == PresetLoad::damaged));
    const bool bad = !load.log.lines.empty() && load.log.lines.front().starts_with("Invalid preset file version 0x");
    CHECK(bad == (load.result.outcome == PresetLoad::badVersion));
    CHECK(load.result.succeeded() == (!damaged && !bad));
    if (damaged || bad) CHECK(load.result.fault != PresetFault::none);
}

}  // namespace

TEST_CASE("a preset cut at each length loads what is whole, and damage is reported where a block is cut") {
    for (const PresetDocument &document : {longDocument(), shortDocument()}) {
        const Bytes image = writePreset(document);
        const std::vector<Delivered> all = LoadRun(image).receiver.values;
        for (size_t length = 0; length <= image.size(); ++length) {
            CAPTURE(length);
            const LoadRun load{std::span<const uint8_t>(image).first(length)};
            checkConsistent(load);
            if (length < 4) CHECK(load.result.fault == PresetFault::versionMissing);
            std::vector<Delivered> values = load.receiver.values;
            if (!values.empty() && values.back() == kNotBypassed) values.pop_back();
            REQUIRE(values.size() <= all.size());
            CHECK(std::equal(values.begin(), values.end(), all.begin()));
        }
    }
}

TEST_CASE("a preset with each byte flipped ends with a result") {
    for (const PresetDocument &document : {longDocument(), shortDocument()}) {
        const Bytes image = writePreset(document);
        for (size_t i = 0; i < image.size(); ++i) {
            for (const uint8_t mask : {0x01, 0x10, 0x80, 0xFF}) {
                Bytes other = image;
                other[i] ^= mask;
                CAPTURE(i);
                checkConsistent(LoadRun(other));
            }
        }
    }
}

TEST_CASE("a preset with each count and position at its limits ends with a result") {
    const Bytes image = writePreset(longDocument());
    const auto size = static_cast<uint32_t>(image.size());
    const uint32_t limits[] = {0,       1,        523,  524,      525,        0xFFFF,     0x10000,
                               0x10001, size - 1, size, size + 1, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF};
    for (size_t at = 36; at + 4 <= image.size(); ++at) {
        for (const uint32_t value : limits) {
            Bytes other = image;
            setWord(other, at, value);
            CAPTURE(at);
            CAPTURE(value);
            checkConsistent(LoadRun(other));
        }
    }
}

TEST_CASE("a stream position beyond the file delivers nothing, without damage") {
    Bytes image = writePreset(longDocument());
    setWord(image, 56, 0xFFFFFFFF);
    const LoadRun load(image);
    CHECK(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::cutOff);
    CHECK(load.receiver.values == std::vector<Delivered>{kNotBypassed});
}

TEST_CASE("a name and a record beyond the file are empty") {
    Bytes image = writePreset(longDocument());
    setWord(image, 40, 0x7FFFFFFF);
    setWord(image, 48, 0xFFFFFFF0);
    LoadRun load;
    load.owner.name = toWide("OLD");
    load.run(image);
    CHECK(load.owner.name.empty());
    CHECK(load.owner.config.Size == 0);
    CHECK(load.receiver.values.size() == 6);
}

TEST_CASE("name, record and stream may overlap each other and the header") {
    Bytes image = writePreset(longDocument());
    for (const size_t at : {40, 48, 56}) setWord(image, at, 36);
    for (const size_t at : {44, 52}) setWord(image, at, 500);
    checkConsistent(LoadRun(image));
}

TEST_CASE("a block over all ids ends with the file") {
    PresetDocument document;
    document.blocks = {{0, INT32_MIN, INT32_MAX, {{1}, {2}, {}}}};
    const LoadRun load(writePreset(document));
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.result.fault == PresetFault::sizeMissing);
    CHECK(load.receiver.values.size() == 2);
}

TEST_CASE("an image that is said to be longer or shorter than its file ends with a result") {
    const Bytes image = writePreset(shortDocument());
    for (const uint32_t size : {0u, 35u, 37u, 100u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
        MemorySource source(image);
        ByteCursor stream(source);
        LoadRun load;
        load.result = loadPreset(stream, size, 3, load.owner, &load.receiver, &load.log);
        CAPTURE(size);
        checkConsistent(load);
        CHECK(load.receiver.values.size() >= 6);  // the position never equals such an end, so the walk goes on to the file's
    }
}

TEST_CASE("a file that shrinks or fails at each operation ends the load with a result") {
    Bytes big = writePreset(shortDocument());
    for (int i = 0; i < 40; ++i) {  // more than one window
        PresetDocument document;
        document.blocks = {{i % 6, 1, 1, {Bytes(9000, static_cast<uint8_t>(i))}}};
        const Bytes image = writePreset(document);
        big.insert(big.end(), image.begin() + 36, image.end());
    }
    MemoryFiles files;
    bool survived = false;
    for (files.failAt = 1; !survived; ++files.failAt) {
        files.operations = 0;
        MemoryFiles::Source source(files, big);
        ByteCursor stream(source);
        LoadRun load;
        load.result = loadPreset(stream, static_cast<uint32_t>(big.size()), 3, load.owner, &load.receiver, &load.log);
        CAPTURE(files.failAt);
        checkConsistent(load);
        survived = files.operations < files.failAt;
        if (survived) CHECK(load.receiver.values.size() == 46);
    }
    CHECK(files.failAt > 4);
}
