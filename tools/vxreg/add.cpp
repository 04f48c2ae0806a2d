// SPDX-License-Identifier: MIT
//
// vxreg add: makes a key and writes a value into it.
#include <iostream>

#include "tools/vxreg/command.h"
#include "tools/vxreg/value_text.h"

namespace vxreg {

void add(const std::vector<std::string> &arguments) {
    const Command command = parseCommand("add", arguments, " /v= /ve /t= /d= /s= /f");
    const std::string typeText = command.type.value_or("REG_SZ");
    const auto type = parseType(typeText);
    if (!type) failSyntax("add", "'" + typeText + "' is no type of value");
    const std::string separator = command.separator.value_or("\\0");
    if (separator.empty()) failSyntax("add", "the separator is empty");
    const auto data = parseData(*type, command.data.value_or(""), separator);
    if (!data) throw Failure{"ERROR: '" + command.data.value_or("") + "' is no data of type " + typeName(*type)};

    vxcomn::RegistryKey key;
    const auto access = vxcomn::RegistryAccess::readWrite;
    if (const auto status = vxcomn::RegistryKey::create(command.key.root, command.key.path, access, key)) {
        failStatus(status, command.key.full);
    }
    // Data without a name goes into the key's own value; a line without either makes the key alone.
    if (command.value || command.data) {
        const vxcomn::WideString name = vxcomn::toWide(command.value.value_or(""));
        vxcomn::RegistryValue old;
        if (!command.force && key.query(name, old) == vxcomn::status::ok &&
            !confirm("Value " + printName(name) + " exists, overwrite")) {
            throw Failure{"The operation was canceled by the user."};
        }
        if (const auto status = key.set(name, *type, *data)) failStatus(status, command.key.full + ", " + printName(name));
    }
    std::cout << "The operation completed successfully.\n";
}

}  // namespace vxreg
