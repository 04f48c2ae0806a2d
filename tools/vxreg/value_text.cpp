// SPDX-License-Identifier: MIT
#include "tools/vxreg/value_text.h"

#include <charconv>
#include <cinttypes>
#include <cstdio>
#include <cstring>

namespace vxreg {
namespace {

using vxcomn::RegistryType;
using vxcomn::WideString;
using Bytes = std::vector<uint8_t>;

struct TypeName {
    const char *name;
    RegistryType type;
};
constexpr TypeName kTypes[] = {
    {"REG_NONE", RegistryType::none},     {"REG_SZ", RegistryType::sz},       {"REG_EXPAND_SZ", RegistryType::expandSz},
    {"REG_BINARY", RegistryType::binary}, {"REG_DWORD", RegistryType::dword}, {"REG_MULTI_SZ", RegistryType::multiSz},
    {"REG_QWORD", RegistryType::qword},
};

template <class Number>
std::optional<Bytes> parseNumber(const std::string &text) {
    Number number = 0;
    if (!text.empty()) {
        const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
        const char *begin = text.data() + (hexadecimal ? 2 : 0), *end = text.data() + text.size();
        const auto [stop, error] = std::from_chars(begin, end, number, hexadecimal ? 16 : 10);
        if (error != std::errc() || stop != end) return std::nullopt;
    }
    Bytes bytes(sizeof number);
    std::memcpy(bytes.data(), &number, sizeof number);
    return bytes;
}

std::optional<Bytes> parseHexadecimal(std::string text) {
    if (text.size() % 2 != 0) text.insert(text.begin(), '0');
    Bytes bytes;
    for (size_t i = 0; i < text.size(); i += 2) {
        uint8_t byte = 0;
        const char *end = text.data() + i + 2;
        const auto [stop, error] = std::from_chars(text.data() + i, end, byte, 16);
        if (error != std::errc() || stop != end) return std::nullopt;
        bytes.push_back(byte);
    }
    return bytes;
}

void appendEnded(Bytes &bytes, const std::string &text) {
    const WideString wide = vxcomn::toWide(text);
    const auto *start = reinterpret_cast<const uint8_t *>(wide.c_str());
    bytes.insert(bytes.end(), start, start + (wide.size() + 1) * sizeof(VXWCHAR));
}

// An empty string among the strings would end the list for every reader, so it is refused; one separator at the end is not.
std::optional<Bytes> parseStrings(std::string text, const std::string &separator) {
    if (text.ends_with(separator)) text.resize(text.size() - separator.size());
    Bytes bytes;
    while (!text.empty()) {
        const size_t end = text.find(separator);
        if (end == 0) return std::nullopt;
        appendEnded(bytes, text.substr(0, end));
        text.erase(0, end == std::string::npos ? end : end + separator.size());
        if (end != std::string::npos && text.empty()) return std::nullopt;
    }
    bytes.insert(bytes.end(), sizeof(VXWCHAR), 0);
    return bytes;
}

WideString units(const Bytes &data) {
    WideString text(data.size() / sizeof(VXWCHAR), VXWCHAR{0});
    if (!text.empty()) std::memcpy(text.data(), data.data(), text.size() * sizeof(VXWCHAR));
    return text;
}

std::string printStrings(WideString text) {
    while (!text.empty() && text.back() == 0) text.pop_back();
    std::string printed;
    for (size_t begin = 0; begin <= text.size();) {
        const size_t end = std::min(text.find(VXWCHAR{0}, begin), text.size());
        printed += (begin > 0 ? "\\0" : "") + vxcomn::toUtf8(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return printed;
}

template <class Number>
std::string printNumber(const Bytes &data) {
    Number number = 0;
    std::memcpy(&number, data.data(), sizeof number);
    char text[24];
    std::snprintf(text, sizeof text, "0x%" PRIx64, static_cast<uint64_t>(number));
    return text;
}

std::string printHexadecimal(const Bytes &data) {
    std::string text;
    for (const uint8_t byte : data) {
        char digits[3];
        std::snprintf(digits, sizeof digits, "%02X", byte);
        text += digits;
    }
    return text;
}

}  // namespace

std::optional<RegistryType> parseType(const std::string &name) {
    for (const TypeName &entry : kTypes) {
        if (vxcomn::equalIgnoringCase(vxcomn::toWide(name), vxcomn::toWide(entry.name))) return entry.type;
    }
    return std::nullopt;
}

std::string typeName(RegistryType type) {
    for (const TypeName &entry : kTypes) {
        if (entry.type == type) return entry.name;
    }
    return "REG_" + std::to_string(static_cast<uint32_t>(type));
}

std::optional<Bytes> parseData(RegistryType type, const std::string &text, const std::string &separator) {
    switch (type) {
        case RegistryType::dword:
            return parseNumber<uint32_t>(text);
        case RegistryType::qword:
            return parseNumber<uint64_t>(text);
        case RegistryType::none:
        case RegistryType::binary:
            return parseHexadecimal(text);
        case RegistryType::multiSz:
            return parseStrings(text, separator);
        case RegistryType::sz:
        case RegistryType::expandSz:
            break;
    }
    Bytes bytes;
    appendEnded(bytes, text);
    return bytes;
}

std::string printData(const vxcomn::RegistryValue &value) {
    switch (value.type) {
        case RegistryType::dword:
            if (value.data.size() == sizeof(uint32_t)) return printNumber<uint32_t>(value.data);
            break;
        case RegistryType::qword:
            if (value.data.size() == sizeof(uint64_t)) return printNumber<uint64_t>(value.data);
            break;
        case RegistryType::sz:
        case RegistryType::expandSz: {
            const WideString text = units(value.data);
            return vxcomn::toUtf8(text.substr(0, text.find(VXWCHAR{0})));
        }
        case RegistryType::multiSz:
            return printStrings(units(value.data));
        case RegistryType::none:
        case RegistryType::binary:
            break;
    }
    return printHexadecimal(value.data);
}

}  // namespace vxreg
