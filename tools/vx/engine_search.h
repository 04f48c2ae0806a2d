// SPDX-License-Identifier: MIT
//
// Why an engine did not open. The library only says that it did not; this looks in the same places, in the same order, and tells
// what is there.
#pragma once

#include <optional>
#include <string>

namespace vx {

// The module's file name that the library composes.
std::string engineModuleName(const std::string &engine, const std::optional<std::string> &platform, int hostType);

// Ends with the reason and what to do.
[[noreturn]] void failEngine(const std::string &engine, const std::optional<std::string> &platform, int hostType);

}  // namespace vx
