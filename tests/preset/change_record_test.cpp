// SPDX-License-Identifier: MIT
#include "preset/change_record.h"

#include <doctest/doctest.h>

#include <cstring>
#include <random>

using namespace vxcomn;

namespace {

constexpr int32_t weight(int32_t priority) {
    return 0x7FFFFFFF - priority;
}

Change changeOf(std::vector<uint8_t> data, uint64_t time = 1, bool isTransient = false, uint32_t source = 0) {
    return {GUID{source, 0, 0, {}}, time, isTransient, std::make_shared<const std::vector<uint8_t>>(std::move(data))};
}

void add(PendingChanges &changes, int32_t componentId, int32_t paramId, const std::vector<uint8_t> &data) {
    addChange(changes,
              {changePriority(componentId, paramId), static_cast<int32_t>(data.size()), componentId, paramId, kChangeAllChannels},
              changeOf(data));
}

template <class T>
T at(const std::vector<uint8_t> &bytes, size_t offset) {
    T value;
    REQUIRE(offset + sizeof value <= bytes.size());
    std::memcpy(&value, bytes.data() + offset, sizeof value);
    return value;
}

}  // namespace

TEST_CASE("every row of the weights, and what has none") {
    struct Row {
        int32_t componentId, paramId, expected;
    };
    const Row rows[] = {
        {-1, -33, 1050}, {-1, -32, 1100}, {-1, -31, 1100}, {-1, -28, 1100}, {-1, -27, 1100}, {-1, -6, 1000}, {-1, -2, 200},
        {-1, -30, 200},  {-1, -29, 200},  {-1, 9, 200},    {5, 9, 1000},    {5, 10, 1000},   {5, 13, 1000},  {5, 14, 1000},
        {5, 58, 1000},   {5, 59, 1000},   {5, 130, 900},   {5, 141, 900},   {5, 144, 950},   {5, -6, 1000},  {5, 11, 200},
        {5, -33, 200},   {0, -6, 1000},   {31, -6, 1000},  {0, 9, 200},     {4, 144, 200},   {-4, -33, 200},
    };
    for (const Row &row : rows) {
        INFO(row.componentId, " ", row.paramId);
        CHECK(weight(changePriority(row.componentId, row.paramId)) == row.expected);
    }
    // Nothing else stands out: five commands of the global component, nine values of component 5, and the switch of each component.
    int special = 0;
    for (int32_t component = -4; component <= 31; ++component) {
        for (int32_t param = -64; param <= 256; ++param) special += weight(changePriority(component, param)) != 200 ? 1 : 0;
    }
    CHECK(special == 5 + 9 + 36);
}

TEST_CASE(
    "weight 1100 comes before 1050, 1000, 950, 900 and 200; then the smaller data, the lower component, the lower parameter") {
    PendingChanges changes;
    add(changes, 3, 1, {1, 2, 3, 4});
    add(changes, 5, 130, {1});
    add(changes, -1, -33, {1});
    add(changes, 2, 7, {1});
    add(changes, 5, 144, {1});
    add(changes, 2, 3, {1});
    add(changes, 1, -6, {9, 9});
    add(changes, -1, -32, {1});
    add(changes, 2, -7, {1});
    add(changes, -4, 200, {1});

    std::vector<std::pair<int32_t, int32_t>> order;
    for (const auto &[key, change] : changes) order.emplace_back(key.componentId, key.paramId);
    CHECK(order == std::vector<std::pair<int32_t, int32_t>>{
                       {-1, -32}, {-1, -33}, {1, -6}, {5, 144}, {5, 130}, {-4, 200}, {2, -7}, {2, 3}, {2, 7}, {3, 1}});
}

TEST_CASE("two deliveries with an equal key meet in one entry: the data is the later one's, all else the first one's") {
    PendingChanges changes;
    const ChangeKey key{changePriority(0, 1), 1, 0, 1, kChangeAllChannels};
    addChange(changes, key, changeOf({7}, 11, true, 5));
    addChange(changes, key, changeOf({8}, 12, false, 6));
    REQUIRE(changes.size() == 1);
    const Change &met = changes.begin()->second;
    CHECK(met.source.Data1 == 5);
    CHECK(met.time == 11);
    CHECK(met.isTransient);
    CHECK(*met.data == std::vector<uint8_t>{8});
    // Of another size it is another entry.
    addChange(changes, {key.priority, 2, 0, 1, kChangeAllChannels}, changeOf({8, 9}));
    CHECK(changes.size() == 2);
}

TEST_CASE("records stand back to back, each with its data right behind it") {
    PendingChanges changes;
    const GUID source = {0x01020304, 0x0506, 0x0708, {9, 10, 11, 12, 13, 14, 15, 16}};
    const auto data = std::make_shared<const std::vector<uint8_t>>(std::vector<uint8_t>{0xAA, 0xBB, 0xCC});
    addChange(changes, {changePriority(-1, -32), 3, -1, -32, kChangeAllChannels}, {source, 0x8000000000000123, true, data});
    addChange(changes, {changePriority(2, 300), 0, 2, 300, kChangeAllChannels}, changeOf({}, 77));

    const std::vector<uint8_t> records = changeRecords(changes);
    REQUIRE(records.size() == 48 + 3 + 48);
    const std::vector<uint8_t> guidBytes = {4, 3, 2, 1, 6, 5, 8, 7, 9, 10, 11, 12, 13, 14, 15, 16};
    CHECK(std::vector<uint8_t>(records.begin(), records.begin() + 16) == guidBytes);
    CHECK(at<uint64_t>(records, 16) == 0x123);  // bit 63 is clear
    CHECK(at<int32_t>(records, 24) == -1);
    CHECK(at<int32_t>(records, 28) == -32);
    CHECK(at<uint32_t>(records, 32) == 0x80000000);
    CHECK(at<uint32_t>(records, 36) == 3);
    CHECK(at<uint64_t>(records, 40) == 1);
    CHECK(std::vector<uint8_t>(records.begin() + 48, records.begin() + 51) == *data);

    CHECK(std::vector<uint8_t>(records.begin() + 51, records.begin() + 67) == std::vector<uint8_t>(16));
    CHECK(at<uint64_t>(records, 51 + 16) == 77);
    CHECK(at<int32_t>(records, 51 + 24) == 2);
    CHECK(at<int32_t>(records, 51 + 28) == 300);
    CHECK(at<uint32_t>(records, 51 + 36) == 0);
    CHECK(at<uint64_t>(records, 51 + 40) == 0);

    CHECK(changeRecords({}).empty());
}
