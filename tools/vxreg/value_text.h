// SPDX-License-Identifier: MIT
//
// Values as text: the names of their types, and their data as it is typed and printed.
#pragma once

#include <optional>
#include <string>

#include "platform/registry.h"

namespace vxreg {

// REG_SZ and so on, without regard to case.
std::optional<vxcomn::RegistryType> parseType(const std::string &name);
std::string typeName(vxcomn::RegistryType type);

// Data of a type from its text. Numbers are decimal or 0x and default to 0; bytes are hexadecimal, with a zero in front of an odd
// digit; the strings of a REG_MULTI_SZ stand between `separator`. Nothing if the text is no such data.
std::optional<std::vector<uint8_t>> parseData(vxcomn::RegistryType type, const std::string &text, const std::string &separator);

// Data as it is printed. What does not have the size of its type is printed as bytes.
std::string printData(const vxcomn::RegistryValue &value);

}  // namespace vxreg
