// SPDX-License-Identifier: MIT
//
// What the receive functions hand out, taken apart.
#pragma once

#include <cstring>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "VXAPOCOMAPI.h"
#include "platform/text.h"

namespace vxcomn::testing {

struct ChangeRecord {
    GUID source;
    uint64_t time;
    int32_t component, param, channel;
    uint8_t isTransient;
    std::vector<uint8_t> data;
};

// The records of a blob; it has to end where the last record does.
inline std::vector<ChangeRecord> recordsOf(const void *blob, uint32_t size, uint32_t count) {
    const auto *at = static_cast<const uint8_t *>(blob);
    const uint8_t *const end = at + size;
    std::vector<ChangeRecord> records;
    for (uint32_t i = 0; i < count; ++i) {
        if (end - at < 48) throw std::runtime_error("a blob that is cut off");
        ChangeRecord record;
        uint32_t bytes = 0;
        std::memcpy(&record.source, at, 16);
        std::memcpy(&record.time, at + 16, 8);
        std::memcpy(&record.component, at + 24, 4);
        std::memcpy(&record.param, at + 28, 4);
        std::memcpy(&record.channel, at + 32, 4);
        std::memcpy(&bytes, at + 36, 4);
        record.isTransient = at[40];
        at += 48;
        if (static_cast<size_t>(end - at) < bytes) throw std::runtime_error("a record that is cut off");
        record.data.assign(at, at + bytes);
        at += bytes;
        records.push_back(std::move(record));
    }
    if (at != end) throw std::runtime_error("a blob with a rest");
    return records;
}

// One call; empty if it delivered nothing.
inline std::vector<ChangeRecord> receiveParams(VXAPOHandle handle, uint32_t milliseconds, bool force = false) {
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    if (VXAPOCOMAPI_ReceiveParamChange(handle, &blob, &size, &count, milliseconds, force ? 1 : 0) != 1) return {};
    return recordsOf(blob, size, count);
}

struct ConfigNotice {
    std::string name;
    std::vector<uint8_t> data;

    std::string text() const {
        WideString wide(data.size() / sizeof(VXWCHAR), VXWCHAR{0});
        std::memcpy(wide.data(), data.data(), wide.size() * sizeof(VXWCHAR));
        if (wide.empty() || wide.back() != 0) return "(no end)";
        wide.pop_back();
        return toUtf8(wide);
    }
};

inline std::optional<ConfigNotice> receiveConfig(VXAPOHandle handle, uint32_t milliseconds, bool force = false) {
    const VXWCHAR *name = nullptr;
    const void *data = nullptr;
    uint32_t size = 0;
    if (VXAPOCOMAPI_ReceiveConfigChange(handle, &name, &data, &size, milliseconds, force ? 1 : 0) != 1) return std::nullopt;
    const auto *bytes = static_cast<const uint8_t *>(data);
    return ConfigNotice{toUtf8(name), {bytes, bytes + size}};
}

}  // namespace vxcomn::testing
