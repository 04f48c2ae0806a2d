// SPDX-License-Identifier: MIT
//
// Why an engine did not open. The library only says that it did not; this looks in the same places, in the same order, and tells
// what is there.
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace vx {

// The module's file name that the library composes.
std::string engineModuleName(const std::string &engine, const std::optional<std::string> &platform, int hostType);

// Where the library looks for a module of this file name, first to last, leaving out where the system looks by itself.
std::vector<std::filesystem::path> modulePlaces(const std::string &module);

// Ends with the reason and what to do.
[[noreturn]] void failEngine(const std::string &engine, const std::optional<std::string> &platform, int hostType);

}  // namespace vx
