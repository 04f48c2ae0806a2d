// SPDX-License-Identifier: MIT
#include <cstring>

#include "tools/vxreg/reg_file.h"

namespace vxreg {
namespace {

using vxcomn::RegistryType;
using vxcomn::RegistryValue;
using vxcomn::toWide;
using vxcomn::WideString;

constexpr size_t kLineUnits = 77;  // where a line of bytes goes on in the next one

WideString quoted(const WideString &text) {
    WideString out = VX_TEXT("\"");
    for (const VXWCHAR unit : text) {
        if (unit == '\\' || unit == '"') out += VXWCHAR{'\\'};
        out += unit;
    }
    return out + VXWCHAR{'"'};
}

// The text of a REG_SZ that is one: with its end, and without anything that a line could not hold.
std::optional<WideString> plainText(const RegistryValue &value) {
    if (value.type != RegistryType::sz || value.data.size() < 2 || value.data.size() % 2 != 0) return std::nullopt;
    WideString text(value.data.size() / 2, VXWCHAR{0});
    std::memcpy(text.data(), value.data.data(), value.data.size());
    if (text.back() != 0) return std::nullopt;
    text.pop_back();
    for (const VXWCHAR unit : text) {
        if (unit == 0 || unit == '\r' || unit == '\n') return std::nullopt;
    }
    return text;
}

WideString hexadecimal(uint32_t number, int digits) {
    WideString out;
    for (int shift = (digits - 1) * 4; shift >= 0; shift -= 4)
        out += static_cast<VXWCHAR>("0123456789abcdef"[number >> shift & 0xF]);
    return out;
}

std::string hexPrefix(RegistryType type) {
    if (type == RegistryType::binary) return "hex:";
    char text[16];
    std::snprintf(text, sizeof text, "hex(%x):", static_cast<unsigned>(type));
    return text;
}

void appendBytes(WideString &line, size_t column, const std::vector<uint8_t> &bytes) {
    for (size_t i = 0; i < bytes.size(); ++i) {
        line += hexadecimal(bytes[i], 2);
        column += 2;
        if (i + 1 == bytes.size()) break;
        line += VXWCHAR{','};
        if (++column < kLineUnits) continue;
        line += VX_TEXT("\\\r\n  ");
        column = 2;
    }
}

}  // namespace

WideString regFileHeading() {
    return VX_TEXT("Windows Registry Editor Version 5.00\r\n\r\n");
}

WideString regFileText(const KeyName &key, const std::vector<vxcomn::RegistryEntry> &values) {
    // Not `full`, which as UTF-8 cannot hold every name.
    const std::string root = key.full.substr(0, key.full.find('\\'));
    WideString out = VX_TEXT("[") + toWide(root);
    if (!key.path.empty()) out += VX_TEXT("\\") + key.path;
    out += VX_TEXT("]\r\n");
    for (const auto &[name, value] : values) {
        WideString line = (name.empty() ? WideString(VX_TEXT("@")) : quoted(name)) + VXWCHAR{'='};
        if (const auto text = plainText(value)) {
            line += quoted(*text);
        } else if (value.type == RegistryType::dword && value.data.size() == 4) {
            uint32_t number = 0;
            std::memcpy(&number, value.data.data(), sizeof number);
            line += VX_TEXT("dword:") + hexadecimal(number, 8);
        } else {
            line += toWide(hexPrefix(value.type));
            const size_t column = line.size();
            appendBytes(line, column, value.data);
        }
        out += line + VX_TEXT("\r\n");
    }
    return out + VX_TEXT("\r\n");
}

}  // namespace vxreg
