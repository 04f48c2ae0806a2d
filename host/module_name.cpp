// SPDX-License-Identifier: MIT
#include "host/module_name.h"

#include <string_view>

namespace vxcomn {

namespace {

constexpr int kHostTypeWithoutPlatformPart = 3;

const char *platformPart(std::string_view platform) {
    if (platform == "HiFi2" || platform == "iSST") return ".HiFi2";
    return platform == "AIC326x" ? ".AIC326x" : "";
}

}  // namespace

std::string composeModuleName(const char *EngineName, const char *PlatformName, int HostType) {
    std::string name = EngineName == nullptr ? "" : EngineName;
    if (PlatformName != nullptr && HostType != kHostTypeWithoutPlatformPart)
        name += std::string(".DSP") + platformPart(PlatformName);
    return name + ".dll";
}

}  // namespace vxcomn
