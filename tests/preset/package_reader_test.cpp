// SPDX-License-Identifier: MIT
#include "preset/package_reader.h"

#include <doctest/doctest.h>

#include "preset/zip_directory.h"
#include "tests/preset/package_files.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE("a package opens the preset of the machine model that the subsystem id names") {
    OpenRun run(twoModels().archive(), VX_TEXT("SUBSYS_00000009"));
    REQUIRE(run.opened);
    CHECK(run.opened.packageIndex == 9);
    CHECK(run.opened.entryName == "9/0/EFX/Output/AnyContent/Preset.bin");
    CHECK(run.load() == std::vector<Delivered>{{2, 1, -1, {99}}, kNotBypassed});
    CHECK(run.log.lines ==
          std::vector<std::string>{"Opening preset zip archive 'C:\\Windows\\System32\\VXAPODATU.BUS.DEV.zip' ...\n",
                                   "Found preset package with index 9 for SSID SUBSYS_00000009.\n", "Package index = 9.\n",
                                   "Searching for preset package with path '9/0/EFX/Output/AnyContent/Preset.bin' ...\n",
                                   "Found preset binary '9/0/EFX/Output/AnyContent/Preset.bin', selecting it.\n", "Done.\n"});
}

TEST_CASE("a package whose first two entries are swapped fails with the first-entry message, whatever else it holds") {
    Package package = twoModels();
    std::swap(package.entries[0], package.entries[1]);
    const OpenRun run(package.archive());
    CHECK_FALSE(run.opened);
    CHECK(run.log.last() == "Invalid name of first zip entry, must be 'SSIDMAP.bin'.\n");
}

TEST_CASE("a package whose second entry is not the second map fails with the second-entry message") {
    Package package = twoModels();
    package.entries[1].name = "CHIDMAP.bin.old";
    CHECK(OpenRun(package.archive()).log.last() == "Invalid name of second zip entry, must be 'CHIDMAP.bin'.\n");
}

TEST_CASE("the names of the maps compare without regard to case") {
    Package package = twoModels();
    package.entries[0].name = "ssidmap.BIN";
    package.entries[1].name = "ChidMap.bin";
    CHECK(OpenRun(package.archive()).opened);
}

TEST_CASE("a package of exactly two entries, maps only, with a matching subsystem id holds no preset") {
    const OpenRun run(Package().archive());
    CHECK_FALSE(run.opened);
    CHECK(run.log.has("Found preset package with index 7 for SSID SUBSYS_1234ABCD.\n"));
    CHECK(run.log.last() == "The selected zip archive doesn't contain any preset.\n");
}

TEST_CASE("a record text in small letters matches the endpoint's capital ones") {
    const OpenRun run(Package(ssidMap({{7, "subsys_1234abcd"}})).add("7/0/EFX/Output/AnyContent/Preset.bin").archive());
    CHECK(run.opened.packageIndex == 7);
    CHECK(run.opened);
}

TEST_CASE("a record whose text goes on behind the subsystem id matches it") {
    const OpenRun run(Package(ssidMap({{7, "SUBSYS_1234ABCDEXTRA"}})).add("7/0/EFX/Output/AnyContent/Preset.bin").archive());
    CHECK(run.opened.packageIndex == 7);
}

TEST_CASE("a subsystem id as long as the text field or longer never matches") {
    const auto indexOf = [](uint32_t recordSize) {
        SsidMap map{recordSize, {{7, std::string("SUBSYS_1234ABCD123").substr(0, recordSize - 4)}}};
        return map.find("SUBSYS_1234ABCD");
    };
    CHECK(indexOf(4 + 14) == -1);
    CHECK(indexOf(4 + 15) == -1);
    CHECK(indexOf(4 + 16) == 7);
}

TEST_CASE("the first matching record in file order wins") {
    CHECK(ssidMap({{1, "SUBSYS_2"}, {2, "SUBSYS_1234"}, {3, "SUBSYS_12"}}).find("SUBSYS_12") == 2);
}

TEST_CASE("an empty subsystem id matches the first record, and nothing in an empty map") {
    CHECK(ssidMap({{4, "SUBSYS_2"}, {5, ""}}).find("") == 4);
    CHECK(SsidMap{}.find("") == -1);
    CHECK(OpenRun(twoModels().archive(), WideString()).opened.packageIndex == 7);
}

TEST_CASE(
    "with an unknown subsystem id the first entry of any package is found, and both lines about hardware ids stand in the log") {
    for (const char *package : {"7", "0", "4294967295", "anything"}) {
        OpenRun run(Package().add(std::string(package) + "/0/EFX/Output/AnyContent/Preset.bin").archive(),
                    VX_TEXT("SUBSYS_FFFFFFFF"));
        CAPTURE(package);
        REQUIRE(run.opened);
        CHECK(run.opened.packageIndex == -1);
        CHECK(run.log.has("Zip archive doesn't contain preset package for SSID = SUBSYS_FFFFFFFF.\n"));
        CHECK(run.log.has("CHIDs listed in zip archive don't match this unit.\n"));
        CHECK(run.log.has("Package index = -1.\n"));
        CHECK(run.load().size() == 6);
    }
}

TEST_CASE("with an unknown subsystem id the first entry in archive order wins") {
    OpenRun run(twoModels().archive(), VX_TEXT("SUBSYS_FFFFFFFF"));
    CHECK(run.opened.entryName == "7/0/EFX/Output/AnyContent/Preset.bin");
}

TEST_CASE("with a known subsystem id another model's entry is not taken") {
    const OpenRun run(Package().add("9/0/EFX/Output/AnyContent/Preset.bin").archive());
    CHECK_FALSE(run.opened);
    CHECK(run.log.last() == "Couldn't find matching preset binary.\n");
}

TEST_CASE("an entry name that merely begins with the path matches") {
    CHECK(OpenRun(Package().add("7/0/EFX/Output/AnyContent/Preset.bin.old").archive()).opened);
}

TEST_CASE("folder matching ignores case in a package") {
    CHECK(OpenRun(Package().add("7/0/efx/OUTPUT/anycontent/PRESET.BIN").archive()).opened);
}

TEST_CASE("the image size from a package is the central header's uncompressed size") {
    Bytes archive = twoModels().archive();
    const OpenRun run(archive);
    CHECK(run.opened.size == writePreset(shortDocument()).size());
    CHECK(run.opened.stream->position() ==
          11 + 30 + writeSsidMap({}, ssidMap({{7, ""}, {9, ""}})).size() + 11 + 30 + writeChidMap(chidMap()).size() + 30 + 36);
}

TEST_CASE("a loose file's image size is its length, and its package index 0") {
    MemoryFiles files;
    files.files[VX_TEXT("C:\\p.bin")] = writePreset(shortDocument());
    RecordingLog log;
    OpenedPreset opened = OpenPresetFile({{}, VX_TEXT("C:\\p.bin"), {}}, files.opener(), &log);
    REQUIRE(opened);
    CHECK(opened.size == writePreset(shortDocument()).size());
    CHECK(opened.packageIndex == 0);
    CHECK(opened.stream->position() == 0);
    CHECK(log.lines == std::vector<std::string>{"Opening preset binary file 'C:\\p.bin' ...\n", "Done.\n"});
}

TEST_CASE("a loose file that isn't there is logged as failed, and an empty path opens nothing") {
    MemoryFiles files;
    RecordingLog log;
    CHECK_FALSE(OpenPresetFile({{}, VX_TEXT("C:\\p.bin"), {}}, files.opener(), &log));
    CHECK(log.lines ==
          std::vector<std::string>{"Opening preset binary file 'C:\\p.bin' ...\n", "Done.\n", "Failed to open preset file.\n"});
    log = {};
    CHECK_FALSE(OpenPresetFile({}, files.opener(), &log));
    CHECK(log.lines == std::vector<std::string>{"Failed to open preset file.\n"});
}

TEST_CASE("a package that can't be opened is logged with the system's status") {
    MemoryFiles files;
    RecordingLog log;
    CHECK_FALSE(OpenPresetFile({kZipPath, kEfxPath, {}}, files.opener(), &log));
    CHECK(log.last() ==
          "Failed to open zip archive with file name 'C:\\Windows\\System32\\VXAPODATU.BUS.DEV.zip' with error code 2.\n");
}

TEST_CASE("a package of a thousand entries is opened with one read each for end record, directory, map and entry") {
    Package package;
    for (int i = 0; i < 1000; ++i) package.add("7/" + std::to_string(i) + "/EFX/Output/AnyContent/Preset.bin", Bytes(64, 1));
    PresetDocument large;
    large.blocks = {{0, 1, 1, {Bytes(0x10000, 3)}}};
    package.add("7/5000/EFX/Output/AnyContent/Preset.bin", writePreset(large));
    OpenRun run(package.archive(), VX_TEXT("SUBSYS_1234ABCD"), VX_TEXT("5000/EFX/Output/AnyContent/Preset.bin"));
    REQUIRE(run.opened);
    CHECK(run.load().front().value == Bytes(0x10000, 3));
    CHECK(run.files.reads == 4);
}

TEST_CASE("nothing listens: a reader without a log does the same") {
    MemoryFiles files;
    files.files[kZipPath] = twoModels().archive();
    CHECK(OpenPresetFile({kZipPath, kEfxPath, VX_TEXT("SUBSYS_1234ABCD")}, files.opener(), nullptr));
    files.files[kZipPath].resize(40);
    CHECK_FALSE(OpenPresetFile({kZipPath, kEfxPath, VX_TEXT("SUBSYS_1234ABCD")}, files.opener(), nullptr));
}

TEST_CASE("both maps come back from their bytes") {
    const MapHeader header = {1, 2, 3, 4, 5, 6, 7, 8};
    const SsidMap ssids = ssidMap({{1, "SUBSYS_1"}, {0xFFFFFFFF, ""}}, 20);
    const Bytes ssidBytes = writeSsidMap(header, ssids);
    ByteCursor ssidStream(ssidBytes);
    MapHeader headerBack{};
    SsidMap ssidsBack;
    CHECK(readSsidMap(ssidStream, headerBack, ssidsBack));
    CHECK(headerBack == header);
    CHECK(ssidsBack == ssids);

    const Bytes chidBytes = writeChidMap(chidMap());
    ByteCursor chidStream(chidBytes);
    ChidMap chidsBack;
    CHECK(readChidMap(chidStream, chidsBack));
    CHECK(chidsBack.groups == chidMap().groups);
}

TEST_CASE("a map of no records ends behind its count") {
    const Bytes bytes = writeSsidMap({}, {});
    CHECK(bytes.size() == 12);
    ByteCursor stream(bytes);
    MapHeader header;
    SsidMap map;
    CHECK(readSsidMap(stream, header, map));
    CHECK(map.records.empty());
}
