// SPDX-License-Identifier: MIT
#include "preset/engine_identity.h"

#include <algorithm>
#include <cstring>

namespace vxcomn {

bool sameEngineConfig(const EngineConfig &left, const EngineConfig &right) noexcept {
    return left.Size == right.Size && std::memcmp(&left, &right, std::min<size_t>(left.Size, sizeof left)) == 0;
}

EngineConfig engineConfigFromBytes(std::span<const uint8_t> bytes) noexcept {
    EngineConfig config{};
    if (!bytes.empty()) std::memcpy(&config, bytes.data(), std::min(bytes.size(), sizeof config));
    return config;
}

}  // namespace vxcomn
