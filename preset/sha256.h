// SPDX-License-Identifier: MIT
//
// SHA-256 (FIPS 180-4), for the identity that a preset's writer puts into it. Readers never compute it. Any thread.
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>

namespace vxcomn {

// The digest as the standard's eight 32-bit words.
std::array<uint32_t, 8> sha256(std::span<const uint8_t> bytes);

// The same as 64 small hexadecimal digits.
std::string sha256Text(std::span<const uint8_t> bytes);

}  // namespace vxcomn
