// SPDX-License-Identifier: MIT
#include "preset/change_record.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <utility>

namespace vxcomn {
namespace {

constexpr int32_t kGlobalComponent = -1;
constexpr int32_t kWeightOfMost = 200;
constexpr int32_t kWeightOfEnable = 1000;
constexpr int32_t kEnable = -6;  // a component's switch, in every component
constexpr uint64_t kStampBits = ~(uint64_t{1} << 63);

struct WeightRow {
    int32_t componentId;
    int32_t paramId;
    int32_t weight;
};

// What has a weight of its own. The engine's switches come ahead of the values that hang on them.
constexpr WeightRow kWeights[] = {
    {kGlobalComponent, -33, 1050},
    {kGlobalComponent, -32, 1100},
    {kGlobalComponent, -31, 1100},
    {kGlobalComponent, -28, 1100},
    {kGlobalComponent, -27, 1100},
    {5, 9, 1000},
    {5, 10, 1000},
    {5, 13, 1000},
    {5, 14, 1000},
    {5, 58, 1000},
    {5, 59, 1000},
    {5, 130, 900},
    {5, 141, 900},
    {5, 144, 950},
};

int32_t weightOf(int32_t componentId, int32_t paramId) noexcept {
    if (paramId == kEnable) return kWeightOfEnable;
    const auto *const row = std::find_if(std::begin(kWeights), std::end(kWeights), [=](const WeightRow &candidate) {
        return candidate.componentId == componentId && candidate.paramId == paramId;
    });
    return row != std::end(kWeights) ? row->weight : kWeightOfMost;
}

// Writes the fields of one record, least significant byte first.
class RecordWriter {
  public:
    explicit RecordWriter(uint8_t *at) noexcept : at_(at) {}

    void guid(const GUID &value) noexcept {
        number(value.Data1, 4);
        number(value.Data2, 2);
        number(value.Data3, 2);
        at_ = std::copy(std::begin(value.Data4), std::end(value.Data4), at_);
    }
    void number(uint64_t value, int bytes) noexcept {
        for (; bytes > 0; --bytes, value >>= 8) *at_++ = static_cast<uint8_t>(value);
    }
    void signedNumber(int32_t value) noexcept { number(static_cast<uint32_t>(value), 4); }

  private:
    uint8_t *at_;
};

}  // namespace

int32_t changePriority(int32_t componentId, int32_t paramId) noexcept {
    return INT32_MAX - weightOf(componentId, paramId);
}

void addChange(PendingChanges &changes, const ChangeKey &key, Change change) {
    const auto [place, isNew] = changes.try_emplace(key, change);
    if (!isNew) place->second.data = std::move(change.data);
}

std::vector<uint8_t> changeRecords(const PendingChanges &changes) {
    size_t size = 0;
    for (const auto &[key, change] : changes) size += kChangeRecordBytes + (change.data ? change.data->size() : 0);
    std::vector<uint8_t> records(size);
    size_t at = 0;
    for (const auto &[key, change] : changes) {
        const size_t dataSize = change.data ? change.data->size() : 0;
        RecordWriter record(records.data() + at);
        record.guid(change.source);
        record.number(change.time & kStampBits, 8);
        record.signedNumber(key.componentId);
        record.signedNumber(key.paramId);
        record.signedNumber(key.channel);
        record.number(dataSize, 4);
        record.number(change.isTransient ? 1 : 0, 8);  // with the seven bytes behind it
        at += kChangeRecordBytes;
        if (dataSize != 0) std::memcpy(records.data() + at, change.data->data(), dataSize);
        at += dataSize;
    }
    return records;
}

}  // namespace vxcomn
