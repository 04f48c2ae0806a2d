// SPDX-License-Identifier: MIT
//
// vxreg delete: deletes a key with all below it, one value, or all values of a key.
#include <iostream>

#include "tools/vxreg/command.h"

namespace vxreg {
namespace {

using vxcomn::RegistryAccess;
using vxcomn::RegistryKey;
using vxcomn::WideString;

void confirmOrFail(const Command &command, const std::string &question) {
    if (!command.force && !confirm(question)) throw Failure{"The operation was canceled by the user."};
}

void removeKey(const Command &command) {
    const size_t cut = command.key.path.find_last_of(VXWCHAR{'\\'});
    const WideString above = cut == WideString::npos ? WideString() : command.key.path.substr(0, cut);
    const WideString name = cut == WideString::npos ? command.key.path : command.key.path.substr(cut + 1);
    if (name.empty()) throw Failure{"ERROR: A root key can't be deleted: " + command.key.full};
    RegistryKey key, parent;
    if (const auto status = RegistryKey::open(command.key.root, command.key.path, RegistryAccess::read, key)) {
        failStatus(status, command.key.full);
    }
    key.close();
    confirmOrFail(command, "Permanently delete the registry key " + command.key.full);
    auto status = RegistryKey::open(command.key.root, above, RegistryAccess::readWrite, parent);
    if (status == vxcomn::status::ok) status = parent.deleteTreeBelow(name);
    if (status != vxcomn::status::ok) failStatus(status, command.key.full);
}

void removeValues(const Command &command, RegistryKey &key) {
    std::vector<WideString> names;
    if (const auto status = key.values(names)) failStatus(status, command.key.full);
    confirmOrFail(command, "Permanently delete all values under the registry key " + command.key.full);
    for (const WideString &name : names) {
        if (const auto status = key.deleteValue(name)) failStatus(status, command.key.full + ", " + printName(name));
    }
}

void removeValue(const Command &command, RegistryKey &key) {
    const WideString name = vxcomn::toWide(*command.value);
    vxcomn::RegistryValue old;
    auto status = key.query(name, old);
    if (status == vxcomn::status::ok) {
        confirmOrFail(command, "Delete the registry value " + printName(name));
        status = key.deleteValue(name);
    }
    if (status != vxcomn::status::ok) failStatus(status, command.key.full + ", " + printName(name));
}

}  // namespace

void remove(const std::vector<std::string> &arguments) {
    const Command command = parseCommand("delete", arguments, " /v= /ve /va /f");
    if (!command.value && !command.allValues) {
        removeKey(command);
    } else {
        RegistryKey key;
        if (const auto status = RegistryKey::open(command.key.root, command.key.path, RegistryAccess::readWrite, key)) {
            failStatus(status, command.key.full);
        }
        if (command.allValues) {
            removeValues(command, key);
        } else {
            removeValue(command, key);
        }
    }
    std::cout << "The operation completed successfully.\n";
}

}  // namespace vxreg
