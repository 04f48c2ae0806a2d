// SPDX-License-Identifier: MIT
//
// vxreg export: writes a key with all below it into a file.
#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iostream>

#include "tools/vxreg/command.h"
#include "tools/vxreg/reg_file.h"

namespace vxreg {
namespace {

using vxcomn::RegistryKey;
using vxcomn::WideString;

void exportKey(const KeyName &name, const RegistryKey &key, WideString &text) {
    if (std::any_of(name.path.begin(), name.path.end(), [](VXWCHAR unit) { return unit == '\r' || unit == '\n' || unit == 0; })) {
        throw Failure{"ERROR: A key's name has a line end in it, which a file cannot hold: " + name.full};
    }
    std::vector<vxcomn::RegistryEntry> values;
    if (const auto status = key.entries(SIZE_MAX, values)) failStatus(status, name.full);
    text += regFileText(name, values);
    std::vector<WideString> subkeys;
    if (const auto status = key.subkeys(subkeys)) failStatus(status, name.full);
    for (const WideString &subkey : subkeys) {
        const KeyName next = below(name, subkey);
        RegistryKey opened;
        const auto status = key.openBelow(subkey, vxcomn::RegistryAccess::read, opened);
        if (status == vxcomn::status::fileNotFound) continue;  // deleted meanwhile
        if (status != vxcomn::status::ok) failStatus(status, next.full);
        exportKey(next, opened, text);
    }
}

}  // namespace

void exportKeys(std::vector<std::string> arguments) {
    if (arguments.size() < 2) failSyntax("export", "the name of a key or of a file is missing");
    const std::string file = arguments[1];
    arguments.erase(arguments.begin() + 1);
    const Command command = parseCommand("export", arguments, " /y");
    const std::filesystem::path path(std::u8string(file.begin(), file.end()));
    RegistryKey key;
    const auto access = vxcomn::RegistryAccess::read;
    if (const auto status = RegistryKey::open(command.key.root, command.key.path, access, key))
        failStatus(status, command.key.full);
    std::error_code ignored;
    if (!command.force && std::filesystem::exists(path, ignored) && !confirm("File " + file + " already exists. Overwrite")) {
        throw Failure{"The operation was canceled by the user."};
    }
    WideString text = VX_TEXT("\uFEFF") + regFileHeading();
    exportKey(command.key, key, text);
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    for (const VXWCHAR unit : text) out.put(static_cast<char>(unit & 0xFF)).put(static_cast<char>(unit >> 8));
    out.close();
    if (!out) throw Failure{"ERROR: The file can't be written: " + file};
    std::cout << "The operation completed successfully.\n";
}

}  // namespace vxreg
