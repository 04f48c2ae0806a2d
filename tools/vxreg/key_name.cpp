// SPDX-License-Identifier: MIT
#include "tools/vxreg/key_name.h"

namespace vxreg {
namespace {

using vxcomn::RegistryRoot;
using vxcomn::toWide;

struct RootName {
    const char *brief;
    const char *full;
    RegistryRoot root;
};
constexpr RootName kRoots[] = {
    {"HKLM", "HKEY_LOCAL_MACHINE", RegistryRoot::localMachine},
    {"HKCU", "HKEY_CURRENT_USER", RegistryRoot::currentUser},
    {"HKU", "HKEY_USERS", RegistryRoot::users},
    {"HKCR", "HKEY_CLASSES_ROOT", RegistryRoot::classesRoot},
};

}  // namespace

std::optional<KeyName> parseKeyName(const std::string &text) {
    const size_t end = text.find('\\');
    std::string path = end == std::string::npos ? std::string() : text.substr(end + 1);
    if (path.ends_with('\\')) path.pop_back();
    // An empty name between two backslashes names no key.
    if (path.starts_with('\\') || path.ends_with('\\') || path.find("\\\\") != std::string::npos) return std::nullopt;
    const vxcomn::WideString given = toWide(text.substr(0, end));
    for (const RootName &name : kRoots) {
        if (!vxcomn::equalIgnoringCase(given, toWide(name.brief)) && !vxcomn::equalIgnoringCase(given, toWide(name.full))) continue;
        KeyName key{name.root, toWide(path), name.full};
        if (!path.empty()) key.full.append("\\").append(path);
        return key;
    }
    return std::nullopt;
}

KeyName below(const KeyName &key, const vxcomn::WideString &name) {
    KeyName next = key;
    if (!next.path.empty()) next.path.push_back('\\');
    next.path += name;
    next.full.append("\\").append(vxcomn::toUtf8(name));
    return next;
}

}  // namespace vxreg
