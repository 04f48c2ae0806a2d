// SPDX-License-Identifier: MIT
//
// vxreg import: reads a file whole, and only if all of it is well writes what it holds.
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>

#include "tools/vxreg/command.h"
#include "tools/vxreg/reg_file.h"

namespace vxreg {
namespace {

using vxcomn::RegistryAccess;
using vxcomn::RegistryKey;
using vxcomn::Status;

constexpr std::uintmax_t kMaxFileBytes = std::uintmax_t{256} << 20;

std::string load(const std::string &file) {
    const std::filesystem::path path(std::u8string(file.begin(), file.end()));
    std::error_code error;
    const bool isFile = std::filesystem::is_regular_file(path, error);
    std::ifstream in(path, std::ios::binary);
    if (!isFile || !in) throw Failure{"ERROR: The file can't be read: " + file};
    if (std::filesystem::file_size(path, error) > kMaxFileBytes) throw Failure{"ERROR: The file is larger than 256 MiB: " + file};
    return {std::istreambuf_iterator<char>(in), {}};
}

// Notes the line at which it went wrong.
Status write(const RegFileKey &from, int &line) {
    line = from.line;
    RegistryKey key;
    if (from.isDeleted) {
        Status status = RegistryKey::open(from.key.root, {}, RegistryAccess::read, key);
        if (status == vxcomn::status::ok) status = key.deleteTreeBelow(from.key.path);
        return status == vxcomn::status::fileNotFound ? vxcomn::status::ok : status;
    }
    // A root may be read and written in, but not made.
    Status status = from.key.path.empty() ? RegistryKey::open(from.key.root, {}, RegistryAccess::readWrite, key)
                                          : RegistryKey::create(from.key.root, from.key.path, RegistryAccess::readWrite, key);
    for (const RegFileValue &value : from.values) {
        if (status != vxcomn::status::ok) return status;
        line = value.line;
        status = value.value ? key.set(value.name, value.value->type, value.value->data) : key.deleteValue(value.name);
        if (!value.value && status == vxcomn::status::fileNotFound) status = vxcomn::status::ok;
    }
    return status;
}

}  // namespace

void importKeys(const std::vector<std::string> &arguments) {
    if (arguments.empty()) failSyntax("import", "the name of a file is missing");
    if (arguments.size() > 1) failSyntax("import", "unknown option '" + arguments[1] + "'");
    const std::string &file = arguments.front();
    std::vector<RegFileKey> keys;
    try {
        keys = parseRegFile(load(file));
    } catch (const RegFileError &error) {
        throw Failure{"ERROR: " + file + ", line " + std::to_string(error.line) + ": " + error.what};
    }
    int line = 0;
    const Status status = vxcomn::inOneWrite([&] {
        for (const RegFileKey &key : keys) {
            if (const Status failed = write(key, line)) return failed;
        }
        return vxcomn::status::ok;
    });
    if (status != vxcomn::status::ok) failStatus(status, file + ", line " + std::to_string(line));
    std::cout << "The operation completed successfully.\n";
}

}  // namespace vxreg
