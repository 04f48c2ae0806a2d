// SPDX-License-Identifier: MIT
#include "preset/preset_reader.h"

#include <doctest/doctest.h>

#include "preset/engine_identity.h"
#include "tests/preset/recording.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

Bytes imageOfVersion(uint32_t version) {
    PresetDocument document = version < kShortHeaderVersion ? longDocument() : shortDocument();
    document.version = version;
    return writePreset(document);
}

Bytes imageOfBlocks(std::vector<PresetBlock> blocks) {
    PresetDocument document;
    document.blocks = std::move(blocks);
    return writePreset(document);
}

std::string joined(const RecordingLog &log) {
    std::string all;
    for (const std::string &line : log.lines) all += line;
    return all;
}

}  // namespace

TEST_CASE("a preset of exactly 36 bytes with the short header delivers only a bypass of 0 and loads") {
    const Bytes image = imageOfBlocks({});
    REQUIRE(image.size() == 36);
    const LoadRun load(image);
    CHECK(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::complete);
    CHECK(load.receiver.values == std::vector<Delivered>{kNotBypassed});
    CHECK(load.log.last() == "Done\n");
}

TEST_CASE("version 0x100001 is rejected, and the owner's hash is not touched") {
    Bytes image = imageOfVersion(0x100002);
    image[0] = 1;
    LoadRun load;
    load.owner.hash.fill(0x77);
    load.run(image);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::badVersion);
    CHECK(load.result.fault == PresetFault::versionTooLow);
    CHECK(load.result.found == 0x100001);
    CHECK(load.log.lines == std::vector<std::string>{"Invalid preset file version 0x100001\n"});
    CHECK(load.owner.hash == PresetHash{0x77, 0x77, 0x77, 0x77, 0x77, 0x77, 0x77, 0x77});
    CHECK(load.owner.changes.empty());
    CHECK(load.receiver.values.empty());
}

TEST_CASE("version 0x100002 is accepted with the long header") {
    const LoadRun load(imageOfVersion(0x100002));
    CHECK(load.result.succeeded());
    CHECK(load.log.has("Preset file version = 0x100002\n"));
    CHECK(toUtf8(load.owner.name) == "KZNOVA");
}

TEST_CASE("version 0x100000F uses the long header and 0x1000010 the short one") {
    const LoadRun longHeader(imageOfVersion(0x100000F));
    CHECK(toUtf8(longHeader.owner.name) == "KZNOVA");
    CHECK(longHeader.log.has("EngineShortNamePos = 72, EngineShortNameSize = 7\n"));

    const LoadRun shortHeader(imageOfVersion(0x1000010));
    CHECK(toUtf8(shortHeader.owner.name) == "VXORLO");
    CHECK(sameEngineConfig(shortHeader.owner.config, kDefaultEngineConfig));
    CHECK(shortHeader.receiver.values == longHeader.receiver.values);
}

TEST_CASE("there is no upper limit to the version") {
    CHECK(LoadRun(imageOfVersion(0xFFFFFFFF)).result.succeeded());
}

TEST_CASE("the fixed engine record of a preset without identity is the one of six components") {
    const LoadRun load(imageOfVersion(0x1000010));
    CHECK(load.owner.config.Size == 60);
    CHECK(load.owner.config.ComponentCount == 6);
    const int32_t expected[6][2] = {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}};
    for (size_t i = 0; i < 6; ++i) {
        CHECK(load.owner.config.Components[i].ComponentId == expected[i][0]);
        CHECK(load.owner.config.Components[i].Position == expected[i][1]);
    }
}

TEST_CASE("a value of 0x10000 bytes is delivered") {
    Bytes value(0x10000);
    for (size_t i = 0; i < value.size(); ++i) value[i] = static_cast<uint8_t>(i * 7);
    const LoadRun load(imageOfBlocks({{0, 3, 5, {{1}, value, {2}}}}));
    CHECK(load.result.succeeded());
    REQUIRE(load.receiver.values.size() == 4);
    CHECK(load.receiver.values[1] == Delivered{0, 4, -1, value});
    CHECK(load.receiver.values[2] == Delivered{0, 5, -1, {2}});
}

TEST_CASE("a value of 0x10001 bytes makes the load false after the values before it were delivered") {
    const Bytes image = imageOfBlocks({{0, 3, 4, {{1}, Bytes(0x10001)}}});
    const LoadRun load(image);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::damaged);
    CHECK(load.result.fault == PresetFault::sizeTooLarge);
    CHECK(load.result.found == 0x10001);
    CHECK(load.result.faultOffset == 36 + 12 + 5);
    CHECK(load.receiver.values.front() == Delivered{0, 3, -1, {1}});
    CHECK(load.log.last() == "Preset file is damaged!\n");
}

TEST_CASE("behind a size that is too large the walk goes on and takes what stands there for a new block") {
    ByteWriter image;
    image.bytes(imageOfBlocks({{0, 3, 3, {{1}}}}));
    for (const int32_t word : {2, 8, 9}) image.i32(word);  // a block of two entries, the first of which is too large
    image.u32(0x10001);
    for (const int32_t word : {4, 11, 11, 1}) image.i32(word);  // read as a block
    image.u8(42);
    const LoadRun load(image.view());
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {1}}, {4, 11, -1, {42}}});
}

TEST_CASE("a damaged preset gets no made-up bypass") {
    const LoadRun load(imageOfBlocks({{0, 3, 3, {Bytes(0x10001)}}}));
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.receiver.values.empty());
}

TEST_CASE("an empty value makes no call and consumes four bytes") {
    const LoadRun load(imageOfBlocks({{0, 1, 3, {{5}, {}, {6}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 1, -1, {5}}, {0, 3, -1, {6}}, kNotBypassed});
}

TEST_CASE("a bypass in the stream is delivered once") {
    const LoadRun load(imageOfBlocks({{-1, -18, -18, {{1}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{{-1, -18, -1, {1}}});
    CHECK(load.log.has("BypassAll == 1\n"));
}

TEST_CASE("a stream without a bypass gets one zero byte at the end") {
    const LoadRun load(imageOfBlocks({{0, 1, 1, {{5}}}}));
    REQUIRE(load.receiver.values.size() == 2);
    CHECK(load.receiver.values.back() == kNotBypassed);
}

TEST_CASE("an empty bypass in the stream counts as none") {
    const LoadRun load(imageOfBlocks({{-1, -18, -18, {{}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{kNotBypassed});
}

TEST_CASE("a parameter -18 of another component is no bypass") {
    const LoadRun load(imageOfBlocks({{0, -18, -18, {{1}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{{0, -18, -1, {1}}, kNotBypassed});
}

TEST_CASE("a receiver that stops the walk still gets the made-up bypass, and the load is good") {
    LoadRun load;
    load.receiver.stopAfter = 1;
    load.run(imageOfBlocks({{0, 1, 3, {{5}, {6}, {7}}}, {1, 1, 1, {{8}}}}));
    CHECK(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::stopped);
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 1, -1, {5}}, kNotBypassed});
    CHECK(load.log.last() == "Done\n");
}

TEST_CASE("a walk that is stopped at a block's last value still reads the next block's header") {
    LoadRun load;
    load.receiver.stopAfter = 1;
    Bytes image = imageOfBlocks({{0, 1, 1, {{5}}}, {1, 1, 1, {{8}}}});
    load.run(image);
    CHECK(load.result.succeeded());
    CHECK(load.log.has("ComponentId = 1, ParamIdMin = 1, ParamIdMax = 1\n"));
    CHECK(load.receiver.values.size() == 2);

    image.resize(image.size() - 10);  // which is then missed, too
    LoadRun cut;
    cut.receiver.stopAfter = 1;
    cut.run(image);
    CHECK_FALSE(cut.result.succeeded());
}

TEST_CASE("a walk without a receiver reads everything and calls nobody") {
    const Bytes image = writePreset(longDocument());
    MemorySource source(image);
    ByteCursor stream(source);
    RecordingOwner owner;
    RecordingLog log;
    const PresetLoadResult result = loadPreset(stream, static_cast<uint32_t>(image.size()), 3, owner, nullptr, &log);
    CHECK(result.outcome == PresetLoad::complete);
    CHECK(result.delivered == 0);
    CHECK(log.has("BypassAll == 1\n"));
    CHECK(log.last() == "Done\n");
}

TEST_CASE("a block whose last id lies below its first has no entries, and the comparison is signed") {
    const LoadRun load(imageOfBlocks({{0, 5, 4, {}}, {0, 1, -1, {}}, {1, -1, 0, {{3}, {4}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{{1, -1, -1, {3}}, {1, 0, -1, {4}}, kNotBypassed});
}

TEST_CASE("a block up to the largest id ends there") {
    const LoadRun load(imageOfBlocks({{0, INT32_MAX, INT32_MAX, {{3}}}}));
    CHECK(load.receiver.values == std::vector<Delivered>{{0, INT32_MAX, -1, {3}}, kNotBypassed});
}

TEST_CASE("two presets that differ only in the engine record trigger the full four-step change") {
    PresetDocument document = longDocument();
    LoadRun load(writePreset(document));
    load.owner.changes.clear();
    document.engineConfig[12] = 9;
    load.run(writePreset(document));
    CHECK(load.owner.changes == std::vector<std::string>{"config 0", "name ", "config 20", "name KZNOVA"});
    CHECK(load.owner.config.Components[0].ComponentId == 9);
}

TEST_CASE("two presets that differ only in the case of the short name trigger the full four-step change") {
    PresetDocument document = longDocument();
    LoadRun load(writePreset(document));
    load.owner.changes.clear();
    document.engineName[0] = 'k';
    load.run(writePreset(document));
    CHECK(load.owner.changes == std::vector<std::string>{"config 0", "name ", "config 20", "name kZNOVA"});
}

TEST_CASE("a preset of the same engine changes nothing") {
    LoadRun load(writePreset(longDocument()));
    load.owner.changes.clear();
    load.run(writePreset(longDocument()));
    CHECK(load.owner.changes.empty());
}

TEST_CASE("bytes of the engine record behind its size don't count") {
    PresetDocument document = longDocument();
    LoadRun load(writePreset(document));
    load.owner.changes.clear();
    document.engineConfig.resize(40, 0xEE);
    load.run(writePreset(document));
    CHECK(load.owner.changes.empty());
}

TEST_CASE("an engine record larger than its capacity is read up to the capacity") {
    PresetDocument document = longDocument();
    document.engineConfig.assign(600, 0xEE);
    const LoadRun load(writePreset(document));
    CHECK(load.result.succeeded());
    CHECK(load.owner.config.Size == 0xEEEEEEEE);
    CHECK(load.owner.config.Components[63].Position == static_cast<int32_t>(0xEEEEEEEE));
    CHECK(load.receiver.values.size() == 6);
}

TEST_CASE("a preset of another engine is not loaded where the engine is locked") {
    LoadRun load;
    load.owner.locked = true;
    load.owner.name = toWide("VXORLO");
    load.run(writePreset(longDocument()));
    CHECK(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::engineLocked);
    CHECK(load.owner.changes.empty());
    CHECK(load.receiver.values.empty());
    CHECK(load.log.has("Couldn't change engine to 'KZNOVA' because it's locked to 'VXORLO'\n"));
    CHECK(load.log.last() == "Skipped loading of parameters\n");
    CHECK(load.owner.hash == presetDigest(writePreset(longDocument())));
}

TEST_CASE("a locked engine doesn't matter where only parameters are asked for") {
    LoadRun load;
    load.owner.locked = true;
    load.run(writePreset(longDocument()), LOAD_PRESET_PARAMETERS);
    CHECK(load.result.outcome == PresetLoad::complete);
    CHECK(load.owner.changes.empty());
    CHECK(load.receiver.values.size() == 6);
}

TEST_CASE("without the parameters flag the walk is skipped") {
    const LoadRun load(writePreset(longDocument()), LOAD_PRESET_ENGINE);
    CHECK(load.result.outcome == PresetLoad::parametersSkipped);
    CHECK(load.result.succeeded());
    CHECK(load.receiver.values.empty());
    CHECK(load.log.last() == "Skipped loading of parameters\n");
    CHECK(toUtf8(load.owner.name) == "KZNOVA");
}

TEST_CASE("the hash is kept in file order, also by a load that turns out damaged") {
    PresetDocument document = shortDocument();
    document.hash = PresetHash{0x1, 0xABCDEF, 3, 4, 5, 6, 7, 0x80000000};
    Bytes image = writePreset(document);
    image.resize(36 + 8);
    const LoadRun load(image);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.owner.hash == *document.hash);
    CHECK(load.log.has("Preset file hash = 1ABCDEF3456780000000\n"));
}

TEST_CASE("the long header is logged word by word") {
    PresetDocument document = longDocument();
    document.bypassAllWord = 0xFFFFFFFF;
    const LoadRun load(writePreset(document));
    const std::string all = joined(load.log);
    CHECK(all.find("BypassAll = -1\nEngineShortNamePos = 72, EngineShortNameSize = 7\nEngineConfigPos = 79, EngineConfigSize = 20\n"
                   "globalParamsPos = 99, globalParamsSize = 17\ncomponentParamsPos = 116, componentParamsSize = 83\n") !=
          std::string::npos);
    CHECK(load.receiver.values.front() == Delivered{-1, -18, -1, {1}});
}

TEST_CASE("a block header that is cut off ends the load at once, damaged") {
    const Bytes whole = imageOfBlocks({{0, 3, 3, {{1}}}, {1, 3, 3, {{2}}}});
    const size_t second = 36 + 17;
    for (const size_t length : {second + 4, second + 7, second + 8, second + 11}) {
        const LoadRun load{std::span<const uint8_t>(whole).first(length)};
        CAPTURE(length);
        CHECK(load.result.outcome == PresetLoad::damaged);
        CHECK(load.result.fault == PresetFault::blockHeaderCutOff);
        CHECK(load.result.faultOffset == second);
        CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {1}}});
        CHECK(load.log.last() == "Preset file is damaged!\n");
    }
}

TEST_CASE("a component id that is cut off ends the walk without damage") {
    const Bytes whole = imageOfBlocks({{0, 3, 3, {{1}}}, {1, 3, 3, {{2}}}});
    const LoadRun load{std::span<const uint8_t>(whole).first(36 + 17 + 3)};
    CHECK(load.result.succeeded());
    CHECK(load.result.outcome == PresetLoad::cutOff);
    CHECK(load.result.faultOffset == 36 + 17);
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {1}}, kNotBypassed});
}

TEST_CASE("a last value that is cut off is not delivered and is no damage in itself") {
    Bytes image = imageOfBlocks({{0, 3, 3, {{1, 2, 3, 4}}}});
    image.pop_back();
    const LoadRun load(image);
    CHECK(load.result.succeeded());
    CHECK(load.result.fault == PresetFault::valueCutOff);
    CHECK(load.receiver.values == std::vector<Delivered>{kNotBypassed});
}

TEST_CASE("a value that is cut off before the last entry makes the next size missing, which is damage") {
    Bytes image = imageOfBlocks({{0, 3, 4, {{1, 2, 3, 4}, {5}}}});
    image.resize(image.size() - 6);
    const LoadRun load(image);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.receiver.values.empty());
}

TEST_CASE("a bypass that is cut off counts as seen and shows the byte that the buffer holds") {
    Bytes image = imageOfBlocks({{0, 3, 3, {{77}}}, {-1, -18, -18, {{1, 2}}}});
    image.resize(image.size() - 2);
    const LoadRun load(image);
    CHECK(load.result.succeeded());
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {77}}});
    CHECK(load.log.has("BypassAll == 77\n"));
}

TEST_CASE("a missing size is damage, reported when the walk has ended") {
    Bytes image = imageOfBlocks({{0, 3, 4, {{1}, {2}}}});
    image.resize(image.size() - 5);
    const LoadRun load(image);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.result.fault == PresetFault::sizeMissing);
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {1}}});
}

TEST_CASE("an engine name longer than 512 characters is cut there") {
    PresetDocument document = longDocument();
    document.engineName.assign(5000, 'x');
    CHECK(LoadRun(writePreset(document)).owner.name.size() == 512);
}

TEST_CASE("an engine name ends at its NUL, and needs none") {
    PresetDocument document = longDocument();
    document.engineName = {'A', 'B', 0, 'C'};
    CHECK(toUtf8(LoadRun(writePreset(document)).owner.name) == "AB");
    document.engineName = {'A', 'B'};
    CHECK(toUtf8(LoadRun(writePreset(document)).owner.name) == "AB");
    document.engineName.clear();
    CHECK(LoadRun(writePreset(document)).owner.name.empty());
}

TEST_CASE("the image may begin anywhere in the stream, and the walk stops exactly at its end") {
    const Bytes image = writePreset(longDocument());
    Bytes file(1000, 0xAA);
    file.insert(file.end(), image.begin(), image.end());
    file.insert(file.end(), 500, 0x00);
    MemorySource source(file);
    ByteCursor stream(source);
    REQUIRE(stream.seek(1000));
    LoadRun load;
    load.result = loadPreset(stream, static_cast<uint32_t>(image.size()), 3, load.owner, &load.receiver, &load.log);
    CHECK(load.result.outcome == PresetLoad::complete);
    CHECK(load.receiver.values == LoadRun(image).receiver.values);
    CHECK(stream.position() == 1000 + image.size());
    CHECK(toUtf8(load.owner.name) == "KZNOVA");
}

TEST_CASE("a block that crosses the image's end runs on to the first failed read") {
    const Bytes image = imageOfBlocks({{0, 3, 3, {{1, 2, 3, 4}}}});
    Bytes file = image;
    file.insert(file.end(), {1, 0, 0, 0, 2, 0, 0, 0});  // what follows in the file: a block without its last word
    MemorySource source(file);
    ByteCursor stream(source);
    LoadRun load;
    load.result = loadPreset(stream, static_cast<uint32_t>(image.size() - 1), 3, load.owner, &load.receiver, &load.log);
    CHECK_FALSE(load.result.succeeded());
    CHECK(load.result.fault == PresetFault::runsPastEnd);
    CHECK(load.receiver.values == std::vector<Delivered>{{0, 3, -1, {1, 2, 3, 4}}});
}

TEST_CASE("a load from inside the engine's change doesn't disturb the outer one") {
    struct Nesting final : PresetOwner {
        PresetHash &presetHash() override { return hash; }
        const WideString &engineShortName() const override { return name; }
        const EngineConfig &engineConfig() const override { return config; }
        bool engineLocked() const override { return false; }
        void setEngineConfig(const EngineConfig &value) override { config = value; }
        void setEngineShortName(const WideString &value) override {
            name = value;
            if (value.empty()) return;
            MemorySource source(image);
            ByteCursor stream(source);
            RecordingReceiver seeded;
            loadPreset(stream, static_cast<uint32_t>(image.size()), LOAD_PRESET_PARAMETERS, *this, &seeded, nullptr);
            nested = seeded.values.size();
        }
        Bytes image = writePreset(longDocument());
        PresetHash hash{};
        WideString name;
        EngineConfig config{};
        size_t nested = 0;
    } owner;
    MemorySource source(owner.image);
    ByteCursor stream(source);
    RecordingReceiver outer;
    CHECK(loadPreset(stream, static_cast<uint32_t>(owner.image.size()), 3, owner, &outer, nullptr).succeeded());
    CHECK(owner.nested == 6);
    CHECK(outer.values.size() == 6);
}
