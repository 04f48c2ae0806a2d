// SPDX-License-Identifier: MIT
//
// Packages that were cut, bent or made up. Each open ends with its own line in the log and nothing opened, or with a stream that a
// load can be let loose on; sanitizer builds watch the memory.
#include <doctest/doctest.h>

#include "preset/zip_directory.h"
#include "tests/preset/package_files.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr size_t kEnd = 22;

void setShort(Bytes &bytes, size_t at, uint16_t value) {
    bytes[at] = static_cast<uint8_t>(value);
    bytes[at + 1] = static_cast<uint8_t>(value >> 8);
}

void setWord(Bytes &bytes, size_t at, uint32_t value) {
    setShort(bytes, at, static_cast<uint16_t>(value));
    setShort(bytes, at + 2, static_cast<uint16_t>(value >> 16));
}

uint32_t wordAt(const Bytes &bytes, size_t at) {
    uint32_t value = 0;
    ByteCursor(std::span<const uint8_t>(bytes).subspan(at)).u32(value);
    return value;
}

size_t directoryOf(const Bytes &archive) {
    return wordAt(archive, archive.size() - kEnd + 16);
}

// Where the n-th central header stands.
size_t headerOf(const Bytes &archive, int n) {
    size_t at = directoryOf(archive);
    for (; n > 0; --n) at += 46 + (wordAt(archive, at + 28) & 0xFFFF);
    return at;
}

// Opens, and loads what opened; the last line tells how it ended.
std::string outcome(const Bytes &archive, const WideString &ssid = VX_TEXT("SUBSYS_1234ABCD")) {
    OpenRun run(archive, ssid);
    CHECK_FALSE(run.log.lines.empty());
    CHECK(static_cast<bool>(run.opened) == (run.log.last() == "Done.\n"));
    CHECK(static_cast<bool>(run.opened) == static_cast<bool>(run.opened.source));
    if (run.opened) run.load();
    return run.log.last();
}

}  // namespace

TEST_CASE("a package cut at each length opens nothing") {
    const Bytes archive = twoModels().archive();
    for (size_t length = 0; length < archive.size(); ++length) {
        OpenRun run(Bytes(archive.begin(), archive.begin() + static_cast<ptrdiff_t>(length)));
        CAPTURE(length);
        CHECK_FALSE(run.opened);
        CHECK(run.log.last() == "Failed to read the end record.\n");
        REQUIRE(run.log.errors.size() == 1);
        CHECK(run.log.errors[0] == (length < 23 ? "Too small file to be a zip!" : "End record signature not found in zip!"));
    }
}

TEST_CASE("a package with each byte flipped ends with a line of its own") {
    const Bytes archive = twoModels().archive();
    for (size_t i = 0; i < archive.size(); ++i) {
        for (const uint8_t mask : {0x01, 0x80, 0xFF}) {
            Bytes other = archive;
            other[i] ^= mask;
            CAPTURE(i);
            CHECK_FALSE(outcome(other).empty());
        }
    }
}

TEST_CASE("each count, length and offset of the directory at its limits ends with a line of its own") {
    const Bytes archive = twoModels().archive();
    const auto size = static_cast<uint32_t>(archive.size());
    const uint32_t limits[] = {0,     1,     2,        3,    127,      128,        2047,       2048,      65534,
                               65535, 65536, size - 1, size, size + 1, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF};
    for (size_t at = directoryOf(archive); at + 4 <= archive.size(); ++at) {
        for (const uint32_t value : limits) {
            Bytes other = archive;
            setWord(other, at, value);
            CAPTURE(at);
            CAPTURE(value);
            CHECK_FALSE(outcome(other).empty());
            CHECK_FALSE(outcome(other, VX_TEXT("unknown")).empty());
        }
    }
}

TEST_CASE("each word of both maps at its limits ends with a line of its own") {
    const Bytes archive = twoModels().archive();
    const Package package;
    const size_t end = 41 + package.entries[0].bytes.size() + 41 + package.entries[1].bytes.size();
    for (size_t at = 0; at < end; ++at) {
        for (const uint32_t value : {0u, 1u, 3u, 4u, 5u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
            Bytes other = archive;
            setWord(other, at, value);
            CAPTURE(at);
            CHECK_FALSE(outcome(other).empty());
            CHECK_FALSE(outcome(other, VX_TEXT("unknown")).empty());
        }
    }
}

TEST_CASE("a file of zeros has no end record") {
    CHECK(outcome(Bytes(200000)) == "Failed to read the end record.\n");
    CHECK(OpenRun(Bytes(200000)).log.errors == std::vector<std::string>{"End record signature not found in zip!"});
}

TEST_CASE("a file of 22 bytes is too small, whatever it holds") {
    Bytes record(22);
    setWord(record, 0, 0x06054b50);
    CHECK(OpenRun(record).log.errors == std::vector<std::string>{"Too small file to be a zip!"});
    record.push_back(0);
    OpenRun run(record);
    CHECK(run.log.errors.empty());
    CHECK(run.log.last().starts_with("Failed to access 'SSIDMAP.bin'file, reason: "));
}

TEST_CASE("of two end records the last one wins") {
    const Bytes first = Package().add("7/0/EFX/Output/AnyContent/Preset.bin").archive();
    Bytes both = first;
    const Bytes second = Package().archive();
    Bytes moved = second;  // its offsets count from its own beginning: only the directory's is looked at first
    setWord(moved, moved.size() - kEnd + 16, static_cast<uint32_t>(first.size() + directoryOf(second)));
    both.insert(both.end(), moved.begin(), moved.end());
    CHECK(outcome(both) == "The selected zip archive doesn't contain any preset.\n");
}

TEST_CASE("an end record in the comment wins over the true one") {
    Bytes archive = twoModels().archive();
    setShort(archive, archive.size() - 2, 22);
    Bytes fake(archive.end() - 22, archive.end());
    setShort(fake, 8, 2);  // says that there are two entries
    setShort(fake, 10, 2);
    archive.insert(archive.end(), fake.begin(), fake.end());
    CHECK(outcome(archive) == "The selected zip archive doesn't contain any preset.\n");
}

TEST_CASE("an archive with a comment opens") {
    for (const size_t length : {size_t{1}, size_t{30}, size_t{65535 - 22}, size_t{65514}}) {
        Bytes archive = twoModels().archive();
        setShort(archive, archive.size() - 2, static_cast<uint16_t>(length));
        archive.resize(archive.size() + length, 'c');
        CAPTURE(length);
        CHECK(outcome(archive) == "Done.\n");
    }
}

TEST_CASE("an end record more than 65,536 bytes from the end is not found") {
    Bytes archive = twoModels().archive();
    archive.resize(archive.size() + 65515, 'c');
    CHECK(outcome(archive) == "Failed to read the end record.\n");
}

TEST_CASE("an archive on several disks is refused") {
    for (const size_t field : {4, 6, 8, 10}) {
        Bytes archive = twoModels().archive();
        setShort(archive, archive.size() - kEnd + field, 77);
        CAPTURE(field);
        CHECK(OpenRun(archive).log.errors == std::vector<std::string>{"Multifile zips not supported!"});
    }
}

TEST_CASE("a count that is too low hides entries, and one that is too high runs into the end record") {
    Bytes archive = twoModels().archive();
    for (const size_t field : {8, 10}) setShort(archive, archive.size() - kEnd + field, 3);
    CHECK(outcome(archive, VX_TEXT("SUBSYS_00000009")) == "Couldn't find matching preset binary.\n");
    for (const size_t field : {8, 10}) setShort(archive, archive.size() - kEnd + field, 5);
    CHECK(outcome(archive, VX_TEXT("SUBSYS_00000009")) == "Done.\n");
    archive = Package().archive();
    for (const size_t field : {8, 10}) setShort(archive, archive.size() - kEnd + field, 65535);
    CHECK(outcome(archive) == "Failed to read zip entry #2, reason: 'Couldn't read enough bytes for JZGlobalFileHeader.'.\n");
}

TEST_CASE("a directory offset past the end finds no first header") {
    for (const uint32_t offset : {0x10000u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
        Bytes archive = twoModels().archive();
        setWord(archive, archive.size() - kEnd + 16, offset);
        CHECK(outcome(archive) ==
              "Failed to access 'SSIDMAP.bin'file, reason: Couldn't read enough bytes for JZGlobalFileHeader..\n");
    }
}

TEST_CASE("a directory offset into the middle of something finds no signature") {
    Bytes archive = twoModels().archive();
    setWord(archive, archive.size() - kEnd + 16, 3);
    CHECK(outcome(archive) == "Failed to access 'SSIDMAP.bin'file, reason: Zip file signature is not valid..\n");
}

TEST_CASE("an empty name fails with an empty reason, and so does one that begins with a NUL") {
    Bytes archive = twoModels().archive();
    const size_t first = headerOf(archive, 0);
    archive[first + 46] = 0;
    CHECK(outcome(archive) == "Failed to access 'SSIDMAP.bin'file, reason: .\n");
    archive = twoModels().archive();
    archive[headerOf(archive, 1) + 46] = 0;
    CHECK(outcome(archive) == "Failed to access 'CHIDMAP.bin'file, reason: .\n");
    archive = twoModels().archive();
    archive[headerOf(archive, 2) + 46] = 0;
    CHECK(outcome(archive) == "Failed to read zip entry #2, reason: ''.\n");
}

TEST_CASE("a name length of 65,535 is refused, and one beyond the file is cut off") {
    Bytes archive = twoModels().archive();
    setShort(archive, headerOf(archive, 0) + 28, 65535);
    CHECK(outcome(archive) == "Failed to access 'SSIDMAP.bin'file, reason: Zip file name length is greate that 65536..\n");
    archive = twoModels().archive();
    setShort(archive, headerOf(archive, 3) + 28, 65534);
    CHECK(outcome(archive, VX_TEXT("SUBSYS_00000009")) ==
          "Failed to read zip entry #3, reason: 'Failed to read zip file name.'.\n");
}

TEST_CASE("a header that cannot be read leaves no name of the entry before it") {
    Bytes archive = twoModels().archive();
    archive[headerOf(archive, 3)] ^= 1;
    OpenRun broken(archive, VX_TEXT("SUBSYS_00000009"), VX_TEXT("no such entry"));
    CHECK(broken.log.last() == "Failed to read zip entry #3, reason: 'Zip file signature is not valid.'.\n");
    CHECK(broken.opened.entryName.empty());
}

TEST_CASE("a long entry name is read up to 2,047 bytes and the walk goes on behind it") {
    Package package;
    package.add("7/" + std::string(5000, 'x')).add("7/0/EFX/Output/AnyContent/Preset.bin");
    CHECK(outcome(package.archive()) == "Done.\n");
    OpenRun run(package.archive(), VX_TEXT("SUBSYS_1234ABCD"), WideString(4000, VX_TEXT('x')));
    CHECK(run.log.last() == "Couldn't find matching preset binary.\n");
    OpenRun cut(package.archive(), VX_TEXT("SUBSYS_1234ABCD"), WideString(2000, VX_TEXT('x')));
    CHECK(cut.opened.entryName.size() == 2047);
}

TEST_CASE("a local name that differs from the central one doesn't matter") {
    Bytes archive = twoModels().archive();
    const size_t local = wordAt(archive, headerOf(archive, 2) + 42);
    archive[local + 30] = 'X';
    CHECK(outcome(archive) == "Done.\n");
}

TEST_CASE("a local header with lengths of its own moves the image") {
    Package package = twoModels();
    Bytes archive = package.archive();
    const size_t local = wordAt(archive, headerOf(archive, 2) + 42);
    setShort(archive, local + 26, 40);  // four bytes more than the name has
    OpenRun run(archive);
    REQUIRE(run.opened);
    CHECK(run.opened.stream->position() == local + 30 + 40);
    run.load();
    CHECK_FALSE(run.result.succeeded());
}

TEST_CASE("a local offset past the end opens a stream that no preset is read from") {
    Bytes archive = twoModels().archive();
    setWord(archive, headerOf(archive, 2) + 42, 0xFFFFFFF0);
    OpenRun run(archive);
    REQUIRE(run.opened);
    CHECK(run.load().empty());
    CHECK(run.result.fault == PresetFault::versionMissing);
}

TEST_CASE("entries may overlap") {
    Bytes archive = twoModels().archive();
    setWord(archive, headerOf(archive, 3) + 42, wordAt(archive, headerOf(archive, 2) + 42));
    OpenRun run(archive, VX_TEXT("SUBSYS_00000009"));
    REQUIRE(run.opened);
    CHECK(run.load() == std::vector<Delivered>{{-1, -18, -1, {1}}});  // as many bytes of the other image as this entry has
}

TEST_CASE("a compressed entry is handed out raw and fails as a preset") {
    const Bytes notStored = {0x03, 0x00, 0x21, 0x10, 0x00, 0x00, 0x00};
    OpenRun run(Package().add("7/0/EFX/Output/AnyContent/Preset.bin", notStored).archive());
    REQUIRE(run.opened);
    run.load();
    CHECK(run.result.succeeded() == false);
}

TEST_CASE("names with dots, drive letters and NULs are data and never paths") {
    const std::string nul("7/0/EFX\0/Output", 15);
    for (const std::string &name : {std::string("../../etc/passwd"), std::string("C:\\Windows\\x"), std::string("/abs"), nul}) {
        const OpenRun run(Package().add(name).archive());
        CHECK(run.log.last() == "Couldn't find matching preset binary.\n");
        const OpenRun found(Package().add("7/../../x").archive(), VX_TEXT("SUBSYS_1234ABCD"), VX_TEXT("../../x"));
        CHECK(found.opened.entryName == "7/../../x");
        CHECK(found.opened.size == writePreset(shortDocument()).size());
    }
    const OpenRun cut(Package().add(nul).archive(), VX_TEXT("SUBSYS_1234ABCD"), VX_TEXT("0/EFX"));
    CHECK(cut.opened.entryName == "7/0/EFX");
}

TEST_CASE("an entry that grows or shrinks while it is read ends the load with a result") {
    const Bytes archive = twoModels().archive();
    for (size_t length = 0; length < archive.size() + 100; ++length) {
        OpenRun run(archive);
        REQUIRE(run.opened);
        run.files.files[kZipPath].resize(length);
        run.load();
        CHECK(run.result.delivered <= 6);
    }
}

TEST_CASE("map records shorter than their own index are refused") {
    for (const uint32_t recordSize : {0u, 1u, 2u, 3u}) {
        Bytes archive = twoModels().archive();
        setWord(archive, 30 + 11 + 12, recordSize);
        CHECK(outcome(archive) == "Failed to init SSIDMap from zip archive.\n");
    }
}

TEST_CASE("map records of four bytes have no text and match nothing") {
    Bytes archive = twoModels().archive();
    setWord(archive, 30 + 11 + 12, 4);
    const OpenRun run(archive);
    CHECK(run.opened.packageIndex == -1);
    CHECK(run.log.has("CHIDs listed in zip archive don't match this unit.\n"));
}

TEST_CASE("a map whose count or record size passes the file is refused without taking memory for it") {
    for (const auto &[count, recordSize] :
         {std::pair{0xFFFFFFFFu, 36u}, {2u, 0xFFFFFFFFu}, {0xFFFFFFFFu, 0xFFFFFFFFu}, {0x10000u, 0x10000u}}) {
        Bytes archive = twoModels().archive();
        setWord(archive, 30 + 11 + 8, count);
        setWord(archive, 30 + 11 + 12, recordSize);
        CHECK(outcome(archive) == "Failed to init SSIDMap from zip archive.\n");
    }
}

TEST_CASE("a second map that is damaged matters only where the first one knows nothing") {
    Bytes archive = twoModels().archive();
    const size_t chids = wordAt(archive, headerOf(archive, 1) + 42) + 30 + 11;
    setWord(archive, chids + 8, 0xFFFFFFFF);
    CHECK(outcome(archive) == "Done.\n");
    CHECK(outcome(archive, VX_TEXT("unknown")) == "Failed to init CHIDMap from zip archive.\n");
}

TEST_CASE("a package index of all ones counts as not found") {
    const OpenRun run(Package(ssidMap({{0xFFFFFFFF, "SUBSYS_1234ABCD"}})).add("3/0/EFX/Output/AnyContent/Preset.bin").archive());
    CHECK(run.opened);
    CHECK(run.log.has("CHIDs listed in zip archive don't match this unit.\n"));
}

TEST_CASE("every failing operation has its line, and a file that fails later reads short") {
    const Bytes archive = twoModels().archive();
    std::vector<std::string> seen;
    bool survived = false;
    for (size_t n = 1; !survived; ++n) {
        MemoryFiles files;
        files.files[kZipPath] = archive;
        files.failAt = n;
        RecordingLog log;
        OpenedPreset opened = OpenPresetFile({kZipPath, kEfxPath, VX_TEXT("SUBSYS_1234ABCD")}, files.opener(), &log);
        survived = files.operations < n;
        CAPTURE(n);
        CHECK((static_cast<bool>(opened) || !log.lines.empty()));
        seen.insert(seen.end(), log.lines.begin(), log.lines.end());
        seen.insert(seen.end(), log.errors.begin(), log.errors.end());
        if (survived) CHECK(opened);
    }
    const auto has = [&](const char *line) { return std::find(seen.begin(), seen.end(), line) != seen.end(); };
    CHECK(has("Couldn't go to end of zip file!"));
    CHECK(has("Cannot seek in zip file!"));
    CHECK(has("Couldn't read end of zip file!"));
    CHECK(has("Failed to read the end record.\n"));
    CHECK(has("Failed to position to the central directory.\n"));
    CHECK(has("Failed to access 'SSIDMAP.bin'file, reason: Failed to read zip file name..\n"));
    CHECK(has("Failed to access 'CHIDMAP.bin'file, reason: Failed to read zip file name..\n"));
    CHECK(has("Failed to init SSIDMap from zip archive.\n"));
    CHECK(has("Failed to read zip entry #2, reason: 'Failed to read zip file name.'.\n"));
}
