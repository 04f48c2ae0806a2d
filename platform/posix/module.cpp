// SPDX-License-Identifier: MIT
//
// Modules by the dynamic linker, looked up as the header tells. A file that is there ends the search, also if it turns out to be no
// module, as on Windows.
#include "platform/module.h"

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <mutex>
#include <string>
#include <vector>

#include <dlfcn.h>
#include <elf.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/posix/descriptor.h"
#include "platform/posix/machine_root.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxPathUnits = 1023;  // and an end, in 1024
constexpr std::string_view kForeignExtension = ".dll";

std::mutex directoryMutex;
std::string &moduleDirectory() {
    static std::string folder;
    return folder;
}

std::string executableFolder() {
    std::string path(4096, '\0');
    const ssize_t length = readlink("/proc/self/exe", path.data(), path.size());
    if (length <= 0) return {};
    path.resize(static_cast<size_t>(length));
    path.resize(path.find_last_of('/') + 1);
    return path;
}

bool isFile(const std::string &path) {
    struct stat found;
    return stat(path.c_str(), &found) == 0 && S_ISREG(found.st_mode);
}

// The name itself, and with the foreign extension replaced by ours.
std::vector<std::string> spellings(const std::string &name) {
    std::vector<std::string> all{name};
    if (name.size() > kForeignExtension.size() &&
        equalIgnoringCase(toWide(std::string_view(name).substr(name.size() - kForeignExtension.size())), VX_TEXT(".dll"))) {
        all.push_back(name.substr(0, name.size() - kForeignExtension.size()) + toUtf8(moduleExtension()));
    }
    return all;
}

// What a file that the linker declined is: no module of this machine, or a module that something is missing for.
Status whyDeclined(const std::string &path) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    if (!file) return status::accessDenied;
    Elf64_Ehdr header;
    const bool whole = pread(file.get(), &header, sizeof header, 0) == static_cast<ssize_t>(sizeof header);
    const bool ours = whole && std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0 && header.e_ident[EI_CLASS] == ELFCLASS64 &&
                      header.e_ident[EI_DATA] == ELFDATA2LSB && header.e_machine == EM_X86_64 && header.e_type == ET_DYN;
    return ours ? status::modNotFound : status::badExeFormat;
}

void *openModule(const std::string &path) {
    return dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
}

// Looks for a name without a separator in one folder, whose path ends with a slash. True if a file of that name ended the search.
bool tryFolder(const std::string &folder, const std::string &name, void *&module, Status &status) {
    if (folder.empty()) return false;
    for (const std::string &spelling : spellings(name)) {
        const std::string path = folder + spelling;
        if (!isFile(path)) continue;
        module = openModule(path);
        status = module != nullptr ? status::ok : whyDeclined(path);
        return true;
    }
    return false;
}

Status search(const std::string &name, void *&module) {
    Status status = status::modNotFound;
    if (const size_t end = name.find_last_of("/\\"); end != std::string::npos) {
        const auto folder = nativePath(toWide(name.substr(0, end + 1)));
        if (folder) tryFolder(folder->ends_with('/') ? *folder : *folder + "/", name.substr(end + 1), module, status);
        return status;
    }
    std::string directory;
    {
        const std::lock_guard lock(directoryMutex);
        directory = moduleDirectory();
    }
    if (tryFolder(directory, name, module, status) || tryFolder(executableFolder(), name, module, status)) return status;
    if (const auto system = nativePath(VX_TEXT("C:\\Windows\\System32"))) {
        if (tryFolder(*system + "/", name, module, status)) return status;
    }
    for (const std::string &spelling : spellings(name)) {
        module = openModule(spelling);
        if (module != nullptr) return status::ok;
    }
    return status;
}

}  // namespace

void ModuleTraits::close(Raw module) noexcept {
    freeModule(module);
}

Module loadModule(const char *name, Status *why) {
    void *module = nullptr;
    Status status = status::modNotFound;
    if (name != nullptr && *name != '\0') status = search(name, module);
    if (why != nullptr) *why = status;
    return Module(module);
}

int freeModule(void *module) noexcept {
    return module != nullptr && dlclose(module) == 0 ? 1 : 0;
}

void *findExport(void *module, const char *name) noexcept {
    if (module == nullptr || name == nullptr) return nullptr;
    return dlsym(module, name);
}

// By the kernel's map of the process: the linker only knows the path as it was asked for, which may be relative to a folder that
// the process has left since.
WideString thisModulePath() {
    const auto address = reinterpret_cast<uintptr_t>(&thisModulePath);
    std::ifstream maps("/proc/self/maps");
    for (std::string line; std::getline(maps, line);) {
        unsigned long first = 0, last = 0;
        if (std::sscanf(line.c_str(), "%lx-%lx", &first, &last) != 2 || address < first || address >= last) continue;
        const size_t path = line.find('/');
        if (path == std::string::npos) return {};
        return toWide(std::string_view(line).substr(path)).substr(0, kMaxPathUnits);
    }
    return {};
}

void setModuleDirectory(const WideString &folder) {
    std::string native = nativePath(folder).value_or(std::string());
    if (!native.empty() && !native.ends_with('/')) native.push_back('/');
    const std::lock_guard lock(directoryMutex);
    moduleDirectory() = native;
}

WideView moduleExtension() noexcept {
    return VX_TEXT(".so");
}

}  // namespace vxcomn
