// SPDX-License-Identifier: MIT
//
// Input and output of the preset verbs: whole files, with `-` for the standard streams. Nothing is written over unasked.
#pragma once

#include <cstdint>
#include <filesystem>
#include <span>
#include <string>
#include <vector>

namespace vx::preset {

using Bytes = std::vector<uint8_t>;

// More than any preset or package comes to; a larger input is refused.
inline constexpr uint64_t kLargestInputBytes = 256u << 20;

Bytes readInput(const std::string &path);

// Writes the whole or nothing. An existing file is refused unless `force`.
void writeOutput(const std::string &path, std::span<const uint8_t> bytes, bool force);
void writeOutput(const std::string &path, const std::string &text, bool force);

}  // namespace vx::preset
