// SPDX-License-Identifier: MIT
#include "platform/environment.h"

#include <cstdlib>

namespace vxcomn {

std::optional<std::string> environmentVariable(const char *name) {
    const char *value = std::getenv(name);
    if (value == nullptr) return std::nullopt;
    return std::string(value);
}

}  // namespace vxcomn
