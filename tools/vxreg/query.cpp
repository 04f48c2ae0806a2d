// SPDX-License-Identifier: MIT
//
// vxreg query: prints a key's values and the keys below it. A key is a blank line, its full name, and a row for each value; the
// names of the keys below follow behind a blank line. With /s each of them is printed so in turn. With /t, or /s and the name of a
// value, the line is a search: only keys with a match are printed, then their number.
#include <iostream>

#include "tools/vxreg/command.h"
#include "tools/vxreg/value_text.h"

namespace vxreg {
namespace {

using vxcomn::RegistryKey;
using vxcomn::RegistryType;
using vxcomn::RegistryValue;
using vxcomn::WideString;

class Printer {
  public:
    explicit Printer(const Command &command) : command_(command) {
        if (command.type) {
            type_ = parseType(*command.type);
            if (!type_) failSyntax("query", "'" + *command.type + "' is no type of value");
        }
        if (command.value) name_ = vxcomn::toWide(*command.value);
    }

    void print() {
        RegistryKey key;
        if (const auto status = RegistryKey::open(command_.key.root, command_.key.path, vxcomn::RegistryAccess::read, key)) {
            failStatus(status, command_.key.full);
        }
        if (isSearch()) {
            walk(key, command_.key);
            std::cout << "\nEnd of search: " << matches_ << " match(es) found.\n";
            if (matches_ == 0) throw Failure{"ERROR: Nothing matches below " + command_.key.full};
        } else if (name_) {
            printOne(key);
        } else {
            walk(key, command_.key);
        }
    }

  private:
    bool isSearch() const { return type_.has_value() || (command_.recursive && name_.has_value()); }

    bool matches(const WideString &name, const RegistryValue &value) const {
        return (!name_ || vxcomn::equalIgnoringCase(name, *name_)) && (!type_ || value.type == *type_);
    }

    static void printRow(const WideString &name, const RegistryValue &value) {
        std::cout << "    " << printName(name) << "    " << typeName(value.type) << "    " << printData(value) << "\n";
    }

    // One value by name. The key's own value counts as there, also when nobody has set it.
    void printOne(const RegistryKey &key) const {
        RegistryValue value;
        const auto status = key.query(*name_, value);
        const bool unset = status == vxcomn::status::fileNotFound && name_->empty();
        if (status != vxcomn::status::ok && !unset) failStatus(status, command_.key.full + ", " + printName(*name_));
        std::cout << "\n" << command_.key.full << "\n";
        if (unset) {
            std::cout << "    (Default)    REG_SZ    (value not set)\n";
        } else {
            printRow(*name_, value);
        }
        std::cout << "\n";
    }

    void walk(const RegistryKey &key, const KeyName &name) {
        std::vector<WideString> values, keys;
        auto status = key.values(values);
        if (status == vxcomn::status::ok) status = key.subkeys(keys);
        if (status != vxcomn::status::ok) failStatus(status, name.full);

        bool titled = !isSearch();
        if (titled) std::cout << "\n" << name.full << "\n";
        for (const WideString &valueName : values) {
            RegistryValue value;
            if (key.query(valueName, value) != vxcomn::status::ok || !matches(valueName, value)) continue;
            if (!titled) std::cout << "\n" << name.full << "\n";
            titled = true;
            ++matches_;
            printRow(valueName, value);
        }
        if (!command_.recursive) {
            if (isSearch()) return;
            std::cout << "\n";
            for (const WideString &keyName : keys) std::cout << below(name, keyName).full << "\n";
            return;
        }
        for (const WideString &keyName : keys) {
            RegistryKey next;  // one that has gone meanwhile, or is closed to us, is left out
            if (key.openBelow(keyName, vxcomn::RegistryAccess::read, next) == vxcomn::status::ok) walk(next, below(name, keyName));
        }
    }

    const Command &command_;
    std::optional<RegistryType> type_;
    std::optional<WideString> name_;
    int matches_ = 0;
};

}  // namespace

void query(const std::vector<std::string> &arguments) {
    const Command command = parseCommand("query", arguments, " /v= /ve /s /t=");
    Printer(command).print();
    if (command.recursive && !command.value && !command.type) std::cout << "\n";
}

}  // namespace vxreg
