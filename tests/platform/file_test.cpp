// SPDX-License-Identifier: MIT
//
// The contract of platform/file.h and platform/system_folder.h, the same on both platforms.
#include "platform/file.h"

#include <doctest/doctest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>

#include "platform/system_folder.h"

using namespace vxcomn;

namespace {

using Bytes = std::vector<uint8_t>;

// A folder of its own for each test, named as the library names folders: an absolute path of this platform.
struct Folder {
    Folder() {
        std::random_device random;
        path = std::filesystem::temp_directory_path() / ("vxcomn-file-" + std::to_string(random()));
        std::filesystem::create_directories(path);
    }
    ~Folder() {
        std::error_code ignored;
        std::filesystem::remove_all(path, ignored);
    }
    WideString of(const char *name) const { return toWide((path / name).string()); }
    std::filesystem::path path;
};

Bytes contentOf(const WideString &path) {
    const FileHandle file = openFileForReading(path);
    REQUIRE(file);
    Bytes bytes(fileSize(file.get()).value());
    REQUIRE(readFileAt(file.get(), 0, bytes.data(), bytes.size()) == bytes.size());
    return bytes;
}

std::vector<std::string> names(const std::vector<FoundFile> &found) {
    std::vector<std::string> list;
    for (const FoundFile &file : found) list.push_back(toUtf8(file.name) + (file.isFolder ? "/" : ""));
    std::sort(list.begin(), list.end());
    return list;
}

}  // namespace

TEST_CASE("a written file reads back, at any offset and up to its end") {
    const Folder folder;
    const Bytes bytes = {1, 2, 3, 4, 5};
    REQUIRE(writeWholeFile(folder.of("a.bin"), bytes, FileWrite::fresh) == status::ok);
    CHECK(contentOf(folder.of("a.bin")) == bytes);
    const FileHandle file = openFileForReading(folder.of("a.bin"));
    uint8_t part[4] = {};
    CHECK(readFileAt(file.get(), 3, part, 4) == 2);
    CHECK(part[1] == 5);
    CHECK(readFileAt(file.get(), 5, part, 4) == 0);
    CHECK(readFileAt(file.get(), 0xFFFFFFFFFF, part, 4) == 0);
    CHECK(readFileAt(file.get(), UINT64_MAX, part, 4) == 0);
}

TEST_CASE("a fresh write refuses to touch a file, and a replacing one swaps it") {
    const Folder folder;
    const Bytes first = {1}, second = {2, 2};
    REQUIRE(writeWholeFile(folder.of("a.bin"), first, FileWrite::fresh) == status::ok);
    CHECK(writeWholeFile(folder.of("a.bin"), second, FileWrite::fresh) == status::fileExists);
    CHECK(contentOf(folder.of("a.bin")) == first);
    CHECK(writeWholeFile(folder.of("a.bin"), second, FileWrite::replace) == status::ok);
    CHECK(contentOf(folder.of("a.bin")) == second);
    CHECK(names(findFiles(folder.of("*"))) == std::vector<std::string>{"a.bin"});  // nothing else stayed behind
}

TEST_CASE("an empty file is written and read") {
    const Folder folder;
    REQUIRE(writeWholeFile(folder.of("e"), {}, FileWrite::fresh) == status::ok);
    CHECK(contentOf(folder.of("e")).empty());
}

TEST_CASE("opening tells why it failed") {
    const Folder folder;
    Status why = status::ok;
    CHECK_FALSE(openFileForReading(folder.of("missing"), &why));
    CHECK(why == status::fileNotFound);
    CHECK_FALSE(openFileForReading(folder.of("no/such"), &why));
    CHECK((why == status::pathNotFound || why == status::fileNotFound));  // Linux has one reason for both
    CHECK_FALSE(openFileForReading(toWide(folder.path.string()), &why));
    CHECK(why == status::accessDenied);
}

TEST_CASE("writing into a folder that isn't there fails and makes nothing") {
    const Folder folder;
    CHECK(writeWholeFile(folder.of("no/such"), {}, FileWrite::fresh) == status::pathNotFound);
    CHECK(findFiles(folder.of("*")).empty());
}

TEST_CASE("a reader keeps the old file while it is replaced") {
    const Folder folder;
    const Bytes first = {1}, second = {2};
    REQUIRE(writeWholeFile(folder.of("a.bin"), first, FileWrite::fresh) == status::ok);
    const FileHandle file = openFileForReading(folder.of("a.bin"));
    const Status replaced = writeWholeFile(folder.of("a.bin"), second, FileWrite::replace);
    uint8_t byte = 0;
    CHECK(readFileAt(file.get(), 0, &byte, 1) == 1);
    CHECK(byte == 1);
    CHECK((replaced == status::ok || replaced == status::accessDenied));  // Windows may refuse while the file is open
}

TEST_CASE("listing finds names by pattern and tells folders from files") {
    const Folder folder;
    for (const char *name : {"a.bin", "ab.bin", "c.txt", "[x].bin"})
        REQUIRE(writeWholeFile(folder.of(name), {}, FileWrite::fresh) == 0);
    std::filesystem::create_directory(folder.path / "d.bin");
    CHECK(names(findFiles(folder.of("*.bin"))) == std::vector<std::string>{"[x].bin", "a.bin", "ab.bin", "d.bin/"});
    CHECK(names(findFiles(folder.of("a?.bin"))) == std::vector<std::string>{"ab.bin"});
    CHECK(names(findFiles(folder.of("c.txt"))) == std::vector<std::string>{"c.txt"});
    CHECK(names(findFiles(folder.of("[x].bin"))) == std::vector<std::string>{"[x].bin"});
    Status why = status::ok;
    CHECK(findFiles(folder.of("x*"), &why).empty());
    CHECK(why == status::fileNotFound);
    CHECK(findFiles(folder.of("no/*"), &why).empty());
    CHECK(why == status::pathNotFound);
}

TEST_CASE("names beyond ASCII are kept") {
    const Folder folder;
    const WideString path = toWide(folder.path.string()) + VX_TEXT("/gr\u00FC\u00DFe \u4E2D.bin");
    const Bytes bytes = {9};
    REQUIRE(writeWholeFile(path, bytes, FileWrite::fresh) == status::ok);
    CHECK(contentOf(path) == bytes);
    CHECK(names(findFiles(folder.of("gr*"))) == std::vector<std::string>{toUtf8(VX_TEXT("gr\u00FC\u00DFe \u4E2D.bin"))});
}

TEST_CASE("the system folder is a Windows path without a backslash at its end") {
    const WideString folder = windowsFolder();
    REQUIRE(folder.size() >= 4);
    CHECK(folder.substr(1, 2) == VX_TEXT(":\\"));
    CHECK(folder.back() != VX_TEXT('\\'));
    CHECK(nativeArchitecture() == kArchitectureAmd64);
    CHECK_FALSE(runsUnderWow64());
}
