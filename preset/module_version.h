// SPDX-License-Identifier: MIT
//
// The version of the installed module, which decides what the store's keys look like. Several copies of this library may lie on one
// machine (a host may bring its own): the one in the system folder counts, and this one where there is none. Control threads.
#pragma once

#include <cstdint>

#include "diag/debug_trace.h"
#include "preset/package_discovery.h"

namespace vxcomn {

// A version's four parts: major, minor, build, revision.
constexpr int32_t versionPart(uint64_t version, int part) noexcept {
    return static_cast<int32_t>(version >> (48 - 16 * part) & 0xFFFF);
}

// What goes into the log: everything, or only why a file tells no version.
enum class VersionLog : uint8_t { all, problems };

// Packed, 0 if neither file tells one. `thisModuleVersion` (may be null) receives this library's own if it bears one.
uint64_t GetAPOModuleVersion(const CTraceFuncCallTarget &trace, const SystemFacts &facts, uint64_t *thisModuleVersion,
                             VersionLog wanted = VersionLog::all);

}  // namespace vxcomn
