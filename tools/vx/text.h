// SPDX-License-Identifier: MIT
//
// Small conversions between text, numbers and paths that all verbs need. Numbers are read whole or not at all.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace vx {

// printf into a string.
[[gnu::format(gnu_printf, 1, 2)]] std::string textf(const char *pattern, ...);

std::filesystem::path pathOf(const std::string &utf8);
std::string utf8Of(const std::filesystem::path &path);

// Decimal, or hexadecimal behind 0x; the whole text, in the bounds.
std::optional<int64_t> parseInteger(std::string_view text, int64_t lowest, int64_t highest);
// A finite decimal number; the whole text. A leading + is fine.
std::optional<double> parseNumber(std::string_view text);

std::vector<std::string> split(const std::string &text, char separator);
std::string lowered(std::string text);

// "-6.02 dB" of a linear level, "silent" for nothing at all.
std::string decibelText(double linear);

}  // namespace vx
