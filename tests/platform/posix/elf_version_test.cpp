// SPDX-License-Identifier: MIT
//
// The reader of version records against files that are not what they seem.
#include <doctest/doctest.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <random>

#include <elf.h>
#include <sys/stat.h>

#include "platform/file_version.h"
#include "tests/support/process.h"
#include "vxcomn/version_record.h"

using namespace vxcomn;
namespace fs = std::filesystem;
using Bytes = std::vector<char>;

namespace {

constexpr uint64_t kVersion = 0x0003000400050006;

// The smallest file with a version: header, section names, record, three section headers.
struct Elf {
    Elf64_Ehdr header{};
    char names[24] = "\0.shstrtab\0.vxversion";
    VXVersionRecord record{};
    Elf64_Shdr sections[3]{};

    Elf() {
        std::memcpy(header.e_ident, ELFMAG, SELFMAG);
        header.e_ident[EI_CLASS] = ELFCLASS64;
        header.e_ident[EI_DATA] = ELFDATA2LSB;
        header.e_type = ET_DYN;
        header.e_shoff = offsetof(Elf, sections);
        header.e_shentsize = sizeof(Elf64_Shdr);
        header.e_shnum = 3;
        header.e_shstrndx = 1;
        sections[1].sh_type = SHT_STRTAB;
        sections[1].sh_name = 1;
        sections[1].sh_offset = offsetof(Elf, names);
        sections[1].sh_size = sizeof names;
        sections[2].sh_type = SHT_PROGBITS;
        sections[2].sh_name = 11;
        sections[2].sh_offset = offsetof(Elf, record);
        sections[2].sh_size = sizeof record;
        record.signature = VXCOMN_VERSION_SIGNATURE;
        record.fileVersionHigh = kVersion >> 32;
        record.fileVersionLow = kVersion & 0xFFFFFFFF;
    }
    Bytes bytes() const {
        Bytes all(sizeof *this);
        std::memcpy(all.data(), this, all.size());
        return all;
    }
};

struct ElfFixture {
    fs::path file = fs::temp_directory_path() / ("vxcomn-elf-" + std::to_string(test::processId()));
    ~ElfFixture() { fs::remove(file); }

    std::optional<uint64_t> read(const Bytes &bytes, Status *why = nullptr) const {
        std::ofstream(file, std::ios::binary).write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
        return fileVersion(toWide(file.string()), why);
    }
};

}  // namespace

TEST_CASE_FIXTURE(ElfFixture, "the version is that of the record in the section .vxversion") {
    CHECK(read(Elf().bytes()) == kVersion);
}

TEST_CASE_FIXTURE(ElfFixture, "a module cut at any length has no version, for as long as its last section header is cut") {
    const Bytes whole = Elf().bytes();
    for (size_t length = 0; length < whole.size(); ++length) {
        CAPTURE(length);
        Status why = 0;
        CHECK_FALSE(read(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)), &why));
        CHECK(why == (length < sizeof(Elf64_Ehdr) ? status::badExeFormat : status::resourceTypeNotFound));
    }
}

TEST_CASE_FIXTURE(ElfFixture, "each field at its extremes gives a version or a reason, nothing else") {
    const auto isReason = [](Status why) { return why == status::badExeFormat || why == status::resourceTypeNotFound; };
    const Bytes whole = Elf().bytes();
    int versions = 0;
    for (size_t at = 0; at < whole.size(); ++at) {
        for (const int value : {0x00, 0x01, 0x7F, 0x80, 0xFF}) {
            for (const size_t width : {size_t{1}, size_t{2}, size_t{4}, size_t{8}}) {
                if (at % width != 0) continue;
                Bytes changed = whole;
                std::memset(changed.data() + at, value, width);
                Status why = 99;
                const auto version = read(changed, &why);
                versions += version.has_value() ? 1 : 0;
                if (version ? why != status::ok : !isReason(why)) FAIL_CHECK("at ", at, " value ", value, " why ", why);
            }
        }
    }
    CHECK(versions > 0);
}

TEST_CASE_FIXTURE(ElfFixture, "offsets that wrap round, sizes beyond the file and a wrong signature are no version") {
    Elf elf;
    SUBCASE("section table past the end") {
        elf.header.e_shoff = sizeof elf;
    }
    SUBCASE("section table that wraps") {
        elf.header.e_shoff = UINT64_MAX - 100;
    }
    SUBCASE("section names that wrap") {
        elf.sections[1].sh_offset = UINT64_MAX - 5;
    }
    SUBCASE("record that wraps") {
        elf.sections[2].sh_offset = UINT64_MAX - 5;
    }
    SUBCASE("record too small") {
        elf.sections[2].sh_size = 51;
    }
    SUBCASE("record past the end") {
        elf.sections[2].sh_offset = sizeof elf - 51;
    }
    SUBCASE("name past the names") {
        elf.sections[2].sh_name = 20;
    }
    SUBCASE("no section of that name") {
        elf.names[12] = 'w';
    }
    SUBCASE("signature") {
        elf.record.signature ^= 1;
    }
    SUBCASE("names' index past the table") {
        elf.header.e_shstrndx = 3;
    }
    SUBCASE("section without bytes in the file") {
        elf.sections[2].sh_type = SHT_NOBITS;
    }
    SUBCASE("entry size") {
        elf.header.e_shentsize = 63;
    }
    Status why = 0;
    CHECK_FALSE(read(elf.bytes(), &why));
    CHECK(why == status::resourceTypeNotFound);
}

TEST_CASE_FIXTURE(ElfFixture, "a folder and a pipe nobody writes to have no version and nobody waits") {
    Status why = 0;
    CHECK_FALSE(fileVersion(VX_TEXT("/"), &why));
    CHECK(why == status::accessDenied);
    REQUIRE(mkfifo(file.c_str(), 0600) == 0);
    CHECK_FALSE(fileVersion(toWide(file.string()), &why));
    CHECK(why == status::badExeFormat);
    CHECK_FALSE(fileVersion(VX_TEXT("/dev/null/x"), &why));
    CHECK(why == status::pathNotFound);
}
