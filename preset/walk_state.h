// SPDX-License-Identifier: MIT
//
// What the update walks remember from one walk to the next: the stamps they have seen, the clients that run, and the keys that they
// look into each time. Belongs to one thread at a time, but for `forget`, which any thread may raise.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <map>

#include "platform/registry.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

inline constexpr int32_t kLowestComponent = -4, kHighestComponent = 31;
inline constexpr int32_t kLowestParam = -64, kHighestParam = 256;
inline constexpr size_t kComponentCount = kHighestComponent - kLowestComponent + 1;  // 36
inline constexpr size_t kParamCount = kHighestParam - kLowestParam + 1;              // 321

// In a parameter's slot: to be read again. Never part of a stamp.
inline constexpr uint64_t kStampUnread = uint64_t{1} << 63;

struct GuidLess {
    bool operator()(const GUID &left, const GUID &right) const noexcept { return std::memcmp(&left, &right, sizeof(GUID)) < 0; }
};

// For each running client, component and parameter the stamp that was delivered last.
using KnownClients = std::map<GUID, std::map<int32_t, std::map<int32_t, uint64_t>>, GuidLess>;

// A key that stays open between the walks, so that looking into it costs no search for it.
struct KeptKey {
    WideString path;
    RegistryKey key;
};

struct WalkState {
    uint64_t configurationStamp = 0;
    uint64_t parameterStamp = 0;
    std::array<uint64_t, kComponentCount> componentStamps = {};
    std::array<std::array<uint64_t, kParamCount>, kComponentCount> paramStamps = {};
    KnownClients clients;
    KeptKey clientsKey, parameterKey;

    // Everything below the parameter key is to count as new. The next walk sees to it: a walk that is under way must not lose the
    // marks it has set.
    std::atomic<bool> forget{false};

    uint64_t &paramStamp(int32_t componentId, int32_t paramId) {
        return paramStamps[static_cast<size_t>(componentId - kLowestComponent)][static_cast<size_t>(paramId - kLowestParam)];
    }
    uint64_t &componentStamp(int32_t componentId) { return componentStamps[static_cast<size_t>(componentId - kLowestComponent)]; }
};

}  // namespace vxcomn
