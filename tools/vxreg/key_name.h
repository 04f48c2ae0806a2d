// SPDX-License-Identifier: MIT
//
// The names of keys on the command line: a root in its short or long form, and a path below it.
#pragma once

#include <optional>
#include <string>

#include "platform/registry.h"

namespace vxreg {

struct KeyName {
    vxcomn::RegistryRoot root;
    vxcomn::WideString path;  // below the root, without a backslash at either end
    std::string full;         // as it is printed: the root's long form, then the path
};

// Nothing if the name does not begin with a root.
std::optional<KeyName> parseKeyName(const std::string &text);

// The name of a key one step further down.
KeyName below(const KeyName &key, const vxcomn::WideString &name);

}  // namespace vxreg
