// SPDX-License-Identifier: MIT
//
// Changes of parameters on their way from the store to an engine: in which order they are told, and how they are handed out. Any
// thread, one at a time for one map.
#pragma once

#include <compare>
#include <cstdint>
#include <map>
#include <memory>
#include <vector>

#include "vxcomn/com_types.h"

namespace vxcomn {

inline constexpr int32_t kChangeAllChannels = INT32_MIN;  // the store keeps no channel
inline constexpr uint32_t kChangeRecordBytes = 48;

// 0x7FFFFFFF less the weight: what weighs more comes earlier.
int32_t changePriority(int32_t componentId, int32_t paramId) noexcept;

// What a pending change is known by, in the order of significance. Signed.
struct ChangeKey {
    int32_t priority = 0;
    int32_t dataSize = 0;
    int32_t componentId = 0;
    int32_t paramId = 0;
    int32_t channel = kChangeAllChannels;

    friend auto operator<=>(const ChangeKey &, const ChangeKey &) = default;
};

struct Change {
    GUID source = {};
    uint64_t time = 0;
    bool isTransient = false;
    std::shared_ptr<const std::vector<uint8_t>> data;
};

using PendingChanges = std::map<ChangeKey, Change>;

// Adds a change; where one of that key waits already only its data is replaced.
void addChange(PendingChanges &changes, const ChangeKey &key, Change change);

// All of them as records of 48 bytes, each with its data right behind it, in map order; little-endian:
//     0 Source, 16 Time (bit 63 clear), 24 ComponentId, 28 ParamId, 32 Channel, 36 DataSize, 40 IsTransient, 41 seven zeros
std::vector<uint8_t> changeRecords(const PendingChanges &changes);

}  // namespace vxcomn
