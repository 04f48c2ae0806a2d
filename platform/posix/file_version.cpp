// SPDX-License-Identifier: MIT
//
// Reads the version record out of an ELF file. The file is a stranger's: every offset and size in it is checked against the file's
// length before it is used, nothing is allocated by its numbers, and at most 65,535 section headers are walked.
#include "platform/file_version.h"

#include <cerrno>
#include <cstring>
#include <type_traits>

#include <elf.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/posix/descriptor.h"
#include "platform/posix/machine_root.h"
#include "platform/posix/system_status.h"
#include "vxcomn/version_record.h"

namespace vxcomn {
namespace {

class ElfFile {
  public:
    ElfFile(int file, uint64_t size) : file_(file), size_(size) {}

    // Reads a record that lies whole inside the file.
    template <class Record>
    bool read(uint64_t offset, Record &record) const {
        static_assert(std::is_trivially_copyable_v<Record>);
        if (offset > size_ || sizeof record > size_ - offset) return false;
        return pread(file_, &record, sizeof record, static_cast<off_t>(offset)) == static_cast<ssize_t>(sizeof record);
    }

  private:
    int file_;
    uint64_t size_;
};

bool isModule(const Elf64_Ehdr &header) {
    return std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0 && header.e_ident[EI_CLASS] == ELFCLASS64 &&
           header.e_ident[EI_DATA] == ELFDATA2LSB && (header.e_type == ET_DYN || header.e_type == ET_EXEC);
}

// The header of section `index`. False if the table does not reach so far or leaves the file.
bool sectionHeader(const ElfFile &file, const Elf64_Ehdr &header, uint32_t index, Elf64_Shdr &section) {
    if (index >= header.e_shnum || header.e_shentsize != sizeof section) return false;
    const uint64_t distance = uint64_t{index} * sizeof section;
    if (header.e_shoff > UINT64_MAX - distance) return false;
    return file.read(header.e_shoff + distance, section);
}

bool hasVersionName(const ElfFile &file, const Elf64_Shdr &names, const Elf64_Shdr &section) {
    char name[sizeof VXCOMN_VERSION_SECTION];
    if (section.sh_name > names.sh_size || sizeof name > names.sh_size - section.sh_name) return false;
    if (names.sh_offset > UINT64_MAX - section.sh_name) return false;
    return file.read(names.sh_offset + section.sh_name, name) && std::memcmp(name, VXCOMN_VERSION_SECTION, sizeof name) == 0;
}

Status readVersion(const ElfFile &file, uint64_t &version) {
    Elf64_Ehdr header;
    if (!file.read(0, header) || !isModule(header)) return status::badExeFormat;
    Elf64_Shdr names;
    if (!sectionHeader(file, header, header.e_shstrndx, names)) return status::resourceTypeNotFound;
    for (uint32_t i = 0; i < header.e_shnum; ++i) {
        Elf64_Shdr section;
        if (!sectionHeader(file, header, i, section)) return status::resourceTypeNotFound;
        if (section.sh_type != SHT_PROGBITS || !hasVersionName(file, names, section)) continue;
        VXVersionRecord record;
        if (section.sh_size < sizeof record || !file.read(section.sh_offset, record)) return status::resourceTypeNotFound;
        if (record.signature != VXCOMN_VERSION_SIGNATURE) return status::resourceTypeNotFound;
        version = uint64_t{record.fileVersionHigh} << 32 | record.fileVersionLow;
        return status::ok;
    }
    return status::resourceTypeNotFound;
}

Status readVersion(const WideString &path, uint64_t &version) {
    const auto native = nativePath(path);
    if (!native) return status::pathNotFound;
    // Opening must not wait for the other end of a pipe.
    const Descriptor file(open(native->c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!file) return statusOfErrno(errno);
    struct stat info;
    if (fstat(file.get(), &info) != 0) return statusOfErrno(errno);
    if (S_ISDIR(info.st_mode)) return status::accessDenied;
    if (!S_ISREG(info.st_mode)) return status::badExeFormat;
    return readVersion(ElfFile(file.get(), static_cast<uint64_t>(info.st_size)), version);
}

}  // namespace

std::optional<uint64_t> fileVersion(const WideString &path, Status *why) {
    uint64_t version = 0;
    const Status status = readVersion(path, version);
    if (why != nullptr) *why = status;
    if (status != status::ok) return std::nullopt;
    return version;
}

}  // namespace vxcomn
