// SPDX-License-Identifier: MIT
//
// One client's handles used by many threads at once.
#include <doctest/doctest.h>

#include <thread>

#include "tests/control/control_fixture.h"
#include "vxcomn/com_memory.h"

using namespace vxcomn;
using test::OpenEndpoint;

TEST_CASE_FIXTURE(OpenEndpoint, "threads choose slots, list endpoints, read properties and settings of one handle at once") {
    if (none()) return;
    testing::SampleMachine::putPreset(testing::orloPreset(), "MFX");
    std::atomic<int> wrong{0};
    std::vector<std::thread> threads;
    const auto repeat = [&](auto work) {
        threads.emplace_back([&wrong, work] {
            for (int i = 0; i < 30; ++i) wrong += work(i) ? 0 : 1;
        });
    };
    repeat([&](int i) { return VXAPOCOMAPI_SetAPOType(endpoint, i % 2 != 0 ? "EFX" : "MFX") == 1; });
    repeat([&](int) { return VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1; });
    repeat([&](int i) {
        VARIANT value;
        VariantInit(&value);
        const int32_t result = VXAPOCOMAPI_GetEndpointPropertyValue(endpoint, nullptr, static_cast<uint32_t>(i % 9), &value);
        VariantClear(&value);
        return result == 1;
    });
    repeat([&](int i) { return VXAPOCOMAPI_GetUserParameter(endpoint, i % 17) >= -1.0F; });
    repeat([&](int i) { return VXAPOCOMAPI_SetUserParameter(endpoint, static_cast<uint32_t>(i % 17), 0.5F) >= 0; });
    repeat([&](int) {
        uint32_t count = 0;
        VXWCHAR **ids = nullptr;
        const int32_t result = VXAPOCOMAPI_GetEndpointIDs(client.api, &count, &ids, 0, 0xF, nullptr);
        return result == 1 && VXAPOCOMAPI_FreeEndpointIDs(client.api, count, ids) == 1;
    });
    repeat([&](int i) {
        VXAPOCOMAPI_SetLastError(endpoint, i);
        return VXAPOCOMAPI_GetLastError(endpoint) != 12345;
    });
    repeat([&](int) {
        VXAPOHandle const other = VXAPOCOMAPI_GetEndpoint(client.api, machine.endpointId().c_str(), 0);
        return other != nullptr && VXAPOCOMAPI_FreeEndpoint(other) == 1;
    });
    for (std::thread &thread : threads) thread.join();
    CHECK(wrong == 0);
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(context().ParamRegKeyName.get() == testing::SampleMachine::parametersPath());
}

TEST_CASE_FIXTURE(OpenEndpoint, "ending a client ends its threads that are inside receive calls") {
    if (none()) return;
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const handle = VXAPOCOMAPI_GetEndpoint(api, machine.endpointId().c_str(), 0);
    REQUIRE(VXAPOCOMAPI_SetAPOType(handle, "EFX") == 1);
    std::thread config([&] {
        const VXWCHAR *name = nullptr;
        const void *data = nullptr;
        uint32_t size = 0;
        CHECK(VXAPOCOMAPI_ReceiveConfigChange(handle, &name, &data, &size, kForever, 0) == 0);
    });
    std::thread param([&] {
        const void *blob = nullptr;
        uint32_t size = 0, count = 0;
        while (VXAPOCOMAPI_ReceiveParamChange(handle, &blob, &size, &count, kForever, 0) != 0) {
        }
    });
    VXAPOCOMAPI_EndpointContext &opened = test::endpointOf(handle);
    while (waitForOne(opened.ConfigIdle, 0) == WaitOutcome::signalled) std::this_thread::yield();
    while (waitForOne(opened.ParamIdle, 0) == WaitOutcome::signalled) std::this_thread::yield();
    CHECK(VXAPOCOMAPI_FreeAPI(api) == 1);
    config.join();
    param.join();
}
