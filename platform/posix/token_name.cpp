// SPDX-License-Identifier: MIT
#include "platform/posix/token_name.h"

#include <cstdint>

namespace vxcomn {
namespace {

constexpr size_t kLongestName = 200;  // bytes; file systems take 255
constexpr size_t kKeptOfLongName = 150;

bool staysAsItIs(char c) noexcept {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' || c == '_' || c == '.' ||
           c == '{' || c == '}';
}

void putHex(std::string &out, uint64_t number, int digits) {
    for (int shift = (digits - 1) * 4; shift >= 0; shift -= 4) out.push_back("0123456789ABCDEF"[number >> shift & 15]);
}

// FNV-1a from a given start; two starts make 128 bits.
uint64_t digest(const std::string &text, uint64_t start) noexcept {
    for (const char c : text) start = (start ^ static_cast<uint8_t>(c)) * 0x100000001B3u;
    return start;
}

}  // namespace

Status tokenFileName(WideView name, std::string &fileName) {
    WideView bare = name;
    for (const WideView prefix : {WideView(VX_TEXT("Global\\")), WideView(VX_TEXT("Local\\"))}) {
        if (bare.starts_with(prefix)) {
            bare.remove_prefix(prefix.size());
            break;
        }
    }
    if (bare.empty() || name.find(VXWCHAR{0}) != WideView::npos) return status::invalidParameter;
    if (bare.find(VXWCHAR{'\\'}) != WideView::npos) return status::pathNotFound;

    const std::string whole = toUtf8(name);
    fileName.clear();
    for (const char c : whole) {
        if (staysAsItIs(c) && !(fileName.empty() && c == '.')) {
            fileName.push_back(c);
        } else {
            fileName.push_back('%');
            putHex(fileName, static_cast<uint8_t>(c), 2);
        }
    }
    if (fileName.size() <= kLongestName) return status::ok;
    fileName.resize(kKeptOfLongName);
    fileName.push_back('~');
    putHex(fileName, digest(whole, 0xCBF29CE484222325u), 16);
    putHex(fileName, digest(whole, 0x9E3779B97F4A7C15u), 16);
    return status::ok;
}

}  // namespace vxcomn
