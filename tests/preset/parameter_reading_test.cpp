// SPDX-License-Identifier: MIT
//
// Reading a parameter out of the store, which seeds it where it is missing.
#include <thread>

#include "platform/last_error.h"
#include "tests/preset/seeded_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE_FIXTURE(Seeded, "a stored parameter is read, and nothing is reset") {
    write(5, 115, {7, 8});
    uint8_t data[4] = {};
    uint32_t size = sizeof data;
    CHECK(host->GetParameter(5, 115, -1, data, size, nullptr, nullptr));
    CHECK(size == 2);
    CHECK(data[1] == 8);
}

TEST_CASE_FIXTURE(Seeded, "a parameter that is not there is seeded first and then read") {
    DeleteRegKeyTree(host->ParamRegKeyName.get(), false);
    uint8_t data[4] = {};
    uint32_t size = sizeof data;
    const GraphLog log;
    CHECK(host->GetParameter(5, 115, -1, data, size, nullptr, nullptr));
    CHECK(size == 1);
    CHECK(data[0] == 1);
    CHECK(log.inOrder({"{ GetParameter(ComponentId = 5, ParamId = 115, Channel = -1)",
                       "Looks like preset hasn't been loaded in the registry, load it.", "{ ResetParameters()",
                       "} GetParameter(ComponentId = 5, ParamId = 115, Channel = -1)"}));
}

TEST_CASE_FIXTURE(Seeded, "a parameter that neither store nor preset has is no value, with the registry's error") {
    uint8_t data[4] = {};
    uint32_t size = sizeof data;
    setLastError(status::ok);
    CHECK_FALSE(host->GetParameter(5, 99, -1, data, size, nullptr, nullptr));
    CHECK(lastError() == status::fileNotFound);
}

TEST_CASE_FIXTURE(Seeded, "a value that does not fit costs the user nothing") {
    write(5, 115, {7, 8, 9, 10, 11});
    uint8_t data[4] = {};
    uint32_t size = sizeof data;
    CHECK_FALSE(host->GetParameter(5, 115, -1, data, size, nullptr, nullptr));
    CHECK(lastError() == status::moreData);
    CHECK(value(5, 115) == Bytes{7, 8, 9, 10, 11});
}

TEST_CASE_FIXTURE(Graph, "without a parameter key no parameter is read") {
    uint8_t data[4] = {};
    uint32_t size = sizeof data;
    CHECK_FALSE(host->GetParameter(5, 115, -1, data, size, nullptr, nullptr));
    CHECK(size == 4);
}

TEST_CASE_FIXTURE(Seeded, "threads may select, reset and read one object at the same time") {
    putPreset(seedDocument(2), "EFX", "Other");
    host->Enabled = 0;
    std::vector<std::thread> threads;
    threads.emplace_back([this] {
        for (int round = 0; round < 10; ++round) host->IOConfigName.set(round % 2 == 0 ? VX_TEXT("Other") : VX_TEXT("LineOut"));
    });
    threads.emplace_back([this] {
        for (int round = 0; round < 5; ++round) host->ResetParameters(false, round % 2 == 0);
    });
    threads.emplace_back([this] {
        for (int round = 0; round < 10; ++round) {
            host->ResetParameter(5, 115, false);
            std::vector<WideString> keys;
            host->GetAllParamRegKeysForAPOType(VX_TEXT("EFX"), keys);
            CHECK(keys.size() == 2);
        }
    });
    bool failed = false;
    threads.emplace_back([this, &failed] {
        for (int round = 0; round < 20; ++round) {
            uint8_t data[4] = {};
            uint32_t size = sizeof data;
            host->UpdateEngine();
            failed = failed || !host->GetParameter(-1, -18, -1, data, size, nullptr, nullptr);
        }
    });
    for (std::thread &thread : threads) thread.join();
    CHECK_FALSE(failed);
    host->ResetParameters(false, false);
    CHECK(value(5, 115) == Bytes{1});
}
