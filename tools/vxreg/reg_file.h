// SPDX-License-Identifier: MIT
//
// The text format of exported registry keys, as Windows' own tools write and read it:
//
//     Windows Registry Editor Version 5.00
//
//     [HKEY_LOCAL_MACHINE\Software\Name]     a key; [-...] deletes it
//     @="the key's own value"                text, with \\ and \" for a backslash and a quote
//     "Level"=dword:0000001f                 eight hexadecimal digits
//     "Bytes"=hex:00,ff,1e                   REG_BINARY; hex(N): any type by its number, a line goes on behind a backslash
//     "Old"=-                                deletes a value
//
// Written as UTF-16 little-endian with a byte order mark and CR LF; read in that or UTF-8, with either line end. What a text in
// quotes could not give back exactly is written as bytes.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "tools/vxreg/key_name.h"

namespace vxreg {

struct RegFileValue {
    vxcomn::WideString name;
    std::optional<vxcomn::RegistryValue> value;  // none: it is deleted
    int line;
};

struct RegFileKey {
    KeyName key;
    bool isDeleted;
    int line;
    std::vector<RegFileValue> values;
};

// What is wrong with a file, and where.
struct RegFileError {
    int line;
    std::string what;
};

// Reads a whole file, or throws a RegFileError.
std::vector<RegFileKey> parseRegFile(const std::string &bytes);

// The beginning of a file, and one key with its values as the lines that follow. UTF-16 units, not yet bytes.
vxcomn::WideString regFileHeading();
vxcomn::WideString regFileText(const KeyName &key, const std::vector<vxcomn::RegistryEntry> &values);

}  // namespace vxreg
