// SPDX-License-Identifier: MIT
//
// The verbs of `vx preset`, run as the program runs them: command line in, files, texts and exit status out.
#include "tools/vx_preset/preset_verbs.h"

#include <doctest/doctest.h>

#include <CLI/CLI.hpp>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <nlohmann/json.hpp>
#include <random>
#include <sstream>

#include "tests/preset/package_files.h"

using namespace vxcomn;
using namespace vxcomn::testing;
namespace fs = std::filesystem;

namespace {

// Runs one command line in a folder of its own, with the standard streams caught.
struct Tool {
    Tool() {
        std::random_device random;
        folder = fs::temp_directory_path() / ("vxcomn-verbs-" + std::to_string(random()));
        fs::create_directories(folder);
    }
    ~Tool() {
        std::error_code ignored;
        fs::remove_all(folder, ignored);
    }

    int run(std::vector<std::string> arguments) {
        std::ostringstream outText, errText;
        std::streambuf *const oldOut = std::cout.rdbuf(outText.rdbuf());
        std::streambuf *const oldErr = std::cerr.rdbuf(errText.rdbuf());
        CLI::App app;
        int status = 0;
        vx::addPresetVerbs(app, status);
        std::reverse(arguments.begin(), arguments.end());  // as the parser takes lists
        arguments.push_back("preset");
        try {
            app.parse(arguments);
        } catch (const CLI::ParseError &error) {
            status = error.get_exit_code() == 0 ? 0 : 2;
        }
        std::cout.rdbuf(oldOut);
        std::cerr.rdbuf(oldErr);
        out = outText.str();
        err = errText.str();
        return status;
    }

    std::string of(const std::string &name) const { return (folder / name).string(); }
    void write(const std::string &name, const Bytes &bytes) const {
        std::ofstream(of(name), std::ios::binary)
            .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    }
    void write(const std::string &name, const std::string &text) const { write(name, Bytes(text.begin(), text.end())); }
    Bytes read(const std::string &name) const {
        std::ifstream in(of(name), std::ios::binary);
        REQUIRE(in);
        return Bytes(std::istreambuf_iterator<char>(in), {});
    }

    // compile(dump(image)) for presets, pack(dump(archive)) for packages.
    Bytes roundTrip(const Bytes &image, const char *verb) {
        write("in", image);
        REQUIRE(run({"dump", of("in"), "-o", of("json"), "--force"}) == 0);
        REQUIRE(run({verb, of("json"), "-o", of("out"), "--force"}) == 0);
        return read("out");
    }

    fs::path folder;
    std::string out, err;
};

// Where the first preset's bytes stand in the tests' packages: behind two maps with their headers and a header of its own.
size_t firstPresetOffset() {
    const Package package;
    return 41 + package.entries[0].bytes.size() + 41 + package.entries[1].bytes.size() + 30 +
           std::string_view("7/0/EFX/Output/AnyContent/Preset.bin").size();
}

const fs::path kSample = fs::path(VXCOMN_SOURCE_DIR) / "examples" / "sample_machine";

}  // namespace

TEST_CASE("dump and compile are the identity for presets of every version") {
    Tool tool;
    for (const uint32_t version : {0x100002u, 0x1000001u, 0x100000Fu, 0x1000010u, 0xFFFFFFFFu}) {
        PresetDocument document = version < kShortHeaderVersion ? longDocument() : shortDocument();
        document.version = version;
        CAPTURE(version);
        CHECK(tool.roundTrip(writePreset(document), "compile") == writePreset(document));
    }
}

TEST_CASE("dump and compile are the identity for damaged and unusual presets") {
    Tool tool;
    const Bytes image = writePreset(longDocument());
    for (size_t i = 4; i < image.size(); i += 3) {
        Bytes other = image;
        other[i] ^= 0x81;
        CAPTURE(i);
        CHECK(tool.roundTrip(other, "compile") == other);
    }
    for (size_t length = 72; length < image.size(); length += 5) {
        const Bytes part(image.begin(), image.begin() + static_cast<ptrdiff_t>(length));
        CAPTURE(length);
        CHECK(tool.roundTrip(part, "compile") == part);
    }
}

TEST_CASE("values keep their bits: every form, not-a-number and infinities, and numbers that look alike") {
    Tool tool;
    PresetDocument document;
    std::mt19937 random(77);
    for (int round = 0; round < 300; ++round) {
        const auto bits = static_cast<uint32_t>(random());
        const Bytes real = {static_cast<uint8_t>(bits), static_cast<uint8_t>(bits >> 8), static_cast<uint8_t>(bits >> 16),
                            static_cast<uint8_t>(bits >> 24)};
        Bytes band = {static_cast<uint8_t>(bits)};
        for (int i = 0; i < 3; ++i) band.insert(band.end(), real.begin(), real.end());
        document.blocks.push_back({0, -12, -12, {real}});
        document.blocks.push_back({5, 117, 118, {band, {static_cast<uint8_t>(bits)}}});
        document.blocks.push_back({-1, -18, -18, {{static_cast<uint8_t>(bits % 3)}}});
    }
    document.blocks.push_back({0, -12, -12, {{0, 0, 0xC0, 0x7F}}});
    document.blocks.push_back({0, -12, -12, {{0, 0, 0x80, 0xFF}}});
    document.blocks.push_back({0, -12, -12, {{0, 0, 0, 0x80}}});
    document.blocks.push_back({0, -12, -12, {{1, 0, 0, 0}}});
    const Bytes image = writePreset(document);
    CHECK(tool.roundTrip(image, "compile") == image);
}

TEST_CASE("dump and pack are the identity for packages") {
    Tool tool;
    const Bytes archive = twoModels().add("9/0/SFX/Output/AnyContent/Preset.bin", {1, 2, 3}).add("notes.txt", {'h', 'i'}).archive();
    CHECK(tool.roundTrip(archive, "pack") == archive);
    Package odd;  // maps with bytes behind their records
    odd.entries[0].bytes.push_back(9);
    odd.entries[1].bytes = {1, 2};
    CHECK(tool.roundTrip(odd.archive(), "pack") == odd.archive());
}

TEST_CASE("the sample machine packs, is sound, and gives each endpoint and slot of both models its preset") {
    Tool tool;
    REQUIRE(tool.run({"pack", (kSample / "package.json").string(), "-o", tool.of("p.zip")}) == 0);
    CHECK(tool.run({"check", tool.of("p.zip")}) == 0);
    const Bytes archive = tool.read("p.zip");
    CHECK(tool.roundTrip(archive, "pack") == archive);
    for (const char *ssid : {"SUBSYS_5A170001", "SUBSYS_5A170002", "SUBSYS_FFFFFFFF"}) {
        for (const char *endpoint : {"0/%/AnyOutput", "1/%/Headphones", "3/%/Microphone"}) {
            for (const char *slot : {"EFX", "MFX", "SFX", "GFX", "LFX"}) {
                std::string path = std::string(endpoint) + "/AnyContent/Preset.bin";
                path.replace(path.find('%'), 1, slot);
                OpenRun run(archive, toWide(ssid), toWide(path));
                CAPTURE(path);
                REQUIRE(run.opened);
                CHECK(run.load().size() == 32);
                CHECK(run.result.outcome == PresetLoad::complete);
            }
        }
    }
}

TEST_CASE("an ordinary zip program reads a package that the tool made, and the reader one that it made") {
    if (std::system("python3 -c \"import zipfile\"") != 0) {
        MESSAGE("not run: there is no python3 to judge by");
        return;
    }
    Tool tool;
    REQUIRE(tool.run({"pack", (kSample / "package.json").string(), "-o", tool.of("p.zip")}) == 0);
    tool.write("judge.py", std::string("import sys, zipfile\n"
                                       "old, new = sys.argv[1:]\n"
                                       "with zipfile.ZipFile(old) as a, zipfile.ZipFile(new, 'w', zipfile.ZIP_STORED) as b:\n"
                                       "    assert a.testzip() is None and len(a.infolist()) == 32\n"
                                       "    assert all(i.compress_type == 0 for i in a.infolist())\n"
                                       "    b.comment = b'made elsewhere'\n"
                                       "    for i in a.infolist(): b.writestr(i.filename, a.read(i))\n"));
    REQUIRE(std::system(("python3 " + tool.of("judge.py") + " " + tool.of("p.zip") + " " + tool.of("q.zip")).c_str()) == 0);
    CHECK(tool.read("p.zip") != tool.read("q.zip"));
    CHECK(tool.run({"diff", tool.of("p.zip"), tool.of("q.zip")}) == 0);
    CHECK(tool.run({"check", tool.of("q.zip")}) == 0);
}

TEST_CASE("a folder packs with its presets in numeric order behind the maps") {
    Tool tool;
    tool.write(
        "package.json",
        std::string(R"({"format": "package", "device": "BUS\\DEV", "ssidMap": {"records": []}, "chidMap": {"groups": []}})"));
    for (const char *package : {"10", "9"}) {
        const std::string place = std::string(package) + "/0/EFX/Output/AnyContent";
        fs::create_directories(tool.folder / place);
        tool.write(place + "/Preset.json", std::string(R"({"format": "preset", "version": "0x1000010", "blocks": []})"));
    }
    REQUIRE(tool.run({"pack", tool.folder.string(), "-o", tool.of(".")}) == 0);
    OpenRun run(tool.read("VXAPODATU.BUS.DEV.zip"), VX_TEXT("SUBSYS_1"));
    CHECK(run.opened.entryName == "9/0/EFX/Output/AnyContent/Preset.bin");
}

TEST_CASE("check says what a loader would say, with the byte offset") {
    Tool tool;
    PresetDocument document = shortDocument();
    document.blocks.push_back({0, 1, 1, {Bytes(0x10001)}});
    tool.write("p.bin", writePreset(document));
    CHECK(tool.run({"check", tool.of("p.bin")}) == 1);
    CHECK(tool.out.find(
              "offset 148: found a value of as many bytes as 65537, expected at most 65536. A loader: reports damage; 6 values") !=
          std::string::npos);

    CHECK(tool.run({"check", "--json", tool.of("p.bin")}) == 1);
    const auto json = nlohmann::json::parse(tool.out);
    CHECK(json["sound"] == false);
    CHECK(json["findings"][0]["offset"] == 148);
    CHECK(json["log"].back() == "Preset file is damaged!");

    tool.write("p.zip", Package().add("7/0/EFX/Output/AnyContent/Preset.bin", writePreset(document)).archive());
    CHECK(tool.run({"check", tool.of("p.zip")}) == 1);
    CHECK(tool.out.find("7/0/EFX/Output/AnyContent/Preset.bin: offset " + std::to_string(firstPresetOffset() + 148)) !=
          std::string::npos);
}

TEST_CASE("check finds a hash that is not the digest, a wrong checksum, a compressed entry and a missing map") {
    Tool tool;
    PresetDocument document = shortDocument();
    document.hash = PresetHash{};
    tool.write("p.bin", writePreset(document));
    CHECK(tool.run({"check", tool.of("p.bin")}) == 1);
    CHECK(tool.out.find("offset 4: found a hash that is not the image's digest") != std::string::npos);

    Bytes archive = twoModels().archive();
    archive[firstPresetOffset() + 50] ^= 1;
    tool.write("p.zip", archive);
    CHECK(tool.run({"check", tool.of("p.zip")}) == 1);
    CHECK(tool.out.find("a checksum that is not the entry's") != std::string::npos);

    Package package = twoModels();
    package.entries.erase(package.entries.begin());
    tool.write("q.zip", package.archive());
    CHECK(tool.run({"check", tool.of("q.zip")}) == 1);
    CHECK(tool.out.find("no sound map as entry #0, expected SSIDMAP.bin") != std::string::npos);
}

TEST_CASE("check with a path prints the loader's own lines for one unit") {
    Tool tool;
    tool.write("p.zip", twoModels().archive());
    CHECK(tool.run({"check", tool.of("p.zip"), "--log", "--ssid", "SUBSYS_00000009", "--path",
                    "0/EFX/Output/AnyContent/Preset.bin"}) == 0);
    CHECK(tool.out.find("log: Found preset package with index 9 for SSID SUBSYS_00000009.\n") != std::string::npos);
    CHECK(tool.run({"check", tool.of("p.zip"), "--path", "5/none"}) == 1);
    CHECK(tool.out.find("Couldn't find matching preset binary.") != std::string::npos);
}

TEST_CASE("diff tells parameters, identity and layout apart, and its status says whether there is any") {
    Tool tool;
    tool.write("a.bin", writePreset(longDocument()));
    CHECK(tool.run({"diff", tool.of("a.bin"), tool.of("a.bin")}) == 0);
    CHECK(tool.out.empty());

    PresetDocument other = longDocument();
    other.engineName[0] = 'k';
    other.blocks[1].values[0] = {0, 0, 0, 0x3F};
    other.blocks.pop_back();
    tool.write("b.bin", writePreset(other));
    CHECK(tool.run({"diff", tool.of("a.bin"), tool.of("b.bin")}) == 1);
    CHECK(tool.out.find("engine name: KZNOVA -> kZNOVA\n") != std::string::npos);
    CHECK(tool.out.find("component 0 parameter -21 (voice highest dB): 12.0 -> 0.5\n") != std::string::npos);
    CHECK(tool.out.find("component 5 parameter 115 (EQ on): on -> nothing\n") != std::string::npos);

    other = longDocument();
    other.bypassAllWord = 1;
    tool.write("c.bin", writePreset(other));
    CHECK(tool.run({"diff", tool.of("a.bin"), tool.of("c.bin"), "--json"}) == 1);
    CHECK(nlohmann::json::parse(tool.out)[0]["where"] == "layout");
}

TEST_CASE("list shows parameters by name, and a package's models and entries") {
    Tool tool;
    tool.write("a.bin", writePreset(longDocument()));
    CHECK(tool.run({"list", tool.of("a.bin"), "--json"}) == 0);
    const auto preset = nlohmann::json::parse(tool.out);
    CHECK(preset["engine"] == "KZNOVA");
    CHECK(preset["parameters"].size() == 6);
    CHECK(preset["parameters"][0]["name"] == "bypass all");

    tool.write("p.zip", twoModels().archive());
    CHECK(tool.run({"list", tool.of("p.zip")}) == 0);
    CHECK(tool.out.find("7        SUBSYS_1234ABCD\n") != std::string::npos);
    CHECK(tool.out.find("9/0/EFX/Output/AnyContent/Preset.bin") != std::string::npos);
}

TEST_CASE("nothing is written over unasked") {
    Tool tool;
    tool.write("a.json", std::string(R"({"format": "preset", "version": 16777232, "blocks": []})"));
    tool.write("out", std::string("precious"));
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", tool.of("out")}) == 2);
    CHECK(tool.err.find("exists already") != std::string::npos);
    CHECK(tool.read("out").size() == 8);
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", tool.of("out"), "--force"}) == 0);
    CHECK(tool.read("out").size() == 36);
}

TEST_CASE("a dash stands for standard output") {
    Tool tool;
    tool.write("a.json", std::string(R"({"format": "preset", "version": "0x1000010", "blocks": []})"));
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", "-"}) == 0);
    CHECK(tool.out.size() == 36);
}

TEST_CASE("documents with mistakes end with file, place, what was found and what was expected") {
    const std::pair<const char *, const char *> cases[] = {
        {"{", "line 1, byte 1: found what is no JSON"},
        {"[]", "found [], expected an object"},
        {R"({"version": 1})", "found no \"format\""},
        {R"({"format": "preset", "version": "0x100001", "blocks": []})",
         "version: found \"0x100001\", expected a whole number from 1048578"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [], "extra": 1})", "found \"extra\", expected one of"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 1, "values": [{"float": "x"}]}]})",
         "blocks[0].values[0].float: found \"x\", expected a number"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 1, "values": [{"id": 2, "byte": 1}]}]})",
         "blocks[0].values[0].id: found 2, expected 1"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 1, "values": [{"byte": 1, "on": true}]}]})",
         "expected one value"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 2147483647, "values": [{}, {}]}]})",
         "expected ids up to"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 1, "values": [{"bytes": "0g"}]}]})",
         "found 'g' at digit 1"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [{"component": 0, "first": 1, "last": 9, "values": []}]})",
         "expected an id below"},
        {R"({"format": "preset", "version": "0x1000001", "blocks": []})", "found no \"engine\""},
        {R"({"format": "preset", "version": "0x1000010", "engine": {}, "blocks": []})", "expected none from version 0x1000010 on"},
        {R"({"format": "preset", "version": "0x1000010", "blocks": [], "gaps": [{"position": 4294967295, "bytes": "00"}]})",
         "gaps[0].position"},
    };
    Tool tool;
    for (const auto &[text, message] : cases) {
        tool.write("a.json", std::string(text));
        CAPTURE(text);
        CHECK(tool.run({"compile", tool.of("a.json"), "-o", tool.of("out")}) == 3);
        CHECK(tool.err.starts_with("vx: " + tool.of("a.json") + ": "));
        CAPTURE(tool.err);
        CHECK(tool.err.find(message) != std::string::npos);
    }
    CHECK_FALSE(fs::exists(tool.of("out")));
}

TEST_CASE("a document nested very deep ends with a message") {
    Tool tool;
    tool.write("a.json", std::string(200000, '['));
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", "-"}) == 3);
    tool.write("a.json", std::string(200000, '[') + std::string(200000, ']'));
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", "-"}) == 3);
}

TEST_CASE("inputs that are no preset and outputs that cannot be written have statuses of their own") {
    Tool tool;
    CHECK(tool.run({"dump", tool.of("missing")}) == 3);
    CHECK(tool.run({"dump", tool.folder.string()}) == 3);
    tool.write("short", Bytes{1, 2});
    CHECK(tool.run({"dump", tool.of("short")}) == 3);
    CHECK(tool.run({"list", tool.of("short")}) == 3);
    CHECK(tool.run({"check", tool.of("short")}) == 1);
    tool.write("a.json", std::string(R"({"format": "preset", "version": "0x1000010", "blocks": []})"));
    CHECK(tool.run({"compile", tool.of("a.json"), "-o", tool.of("no/such/folder")}) == 4);
    CHECK(tool.run({"compile", tool.of("a.json")}) == 2);
    CHECK(tool.run({"compile", "--nonsense"}) == 2);
    CHECK(tool.run({"pack", tool.of("a.json")}) == 3);
}
