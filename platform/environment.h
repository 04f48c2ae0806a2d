// SPDX-License-Identifier: MIT
//
// Environment variables, as UTF-8. Control threads.
#pragma once

#include <optional>
#include <string>

namespace vxcomn {

// Nothing if the variable is unset; an empty text if it is set to nothing (Windows cannot tell these apart from unset).
std::optional<std::string> environmentVariable(const char *name);

}  // namespace vxcomn
