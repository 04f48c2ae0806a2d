// SPDX-License-Identifier: MIT
//
// The engines that the library knows by name, and their component chains. Control threads.
#pragma once

#include <string_view>

#include "vxcomn/engine.h"

namespace vxcomn {

// The short name of an engine: "KZNOVA" if `engineName` begins with "KZNOVA" or "KZ.Novara", else "VXORLO".
std::string_view engineShortNameOf(std::string_view engineName);

// The record of an engine in the built-in table, by its exact name there; an unknown name falls back to "VXORLO".
// Kept: `Size` of the records is 8 although they hold more. Clients store and compare the first 8 bytes only.
const EngineConfig &engineDescription(std::string_view name);

// The table's names, in the order of their bytes.
inline constexpr std::string_view kEngineNames[] = {"KZ.Novara", "KZNOVA", "Tarnlight.Orlo", "VXORLO"};

}  // namespace vxcomn
