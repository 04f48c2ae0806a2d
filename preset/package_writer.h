// SPDX-License-Identifier: MIT
//
// Makes package archives, for the tools and the tests: stored entries with their checksums, which ordinary zip programs read. The
// library itself never writes packages. Control threads; allocates.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace vxcomn {

struct PackageEntry {
    std::string name;
    std::vector<uint8_t> bytes;
};

// The largest archive that is written: positions are 32-bit, and packages are small.
inline constexpr uint64_t kLargestPackageBytes = 0x7FFFFFFF;

// The archive with the entries in order, the two maps among them. Nothing if it would pass what the format can say: 65,535 entries,
// names of 65,534 bytes, kLargestPackageBytes.
std::optional<std::vector<uint8_t>> writePackage(std::span<const PackageEntry> entries);

// The checksum that zip programs verify.
uint32_t zipChecksum(std::span<const uint8_t> bytes);

}  // namespace vxcomn
