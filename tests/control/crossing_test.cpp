// SPDX-License-Identifier: MIT
//
// From a slider in one process to a receiver in another.
#include <doctest/doctest.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <thread>

#include "tests/control/changes.h"
#include "tests/control/open_slot.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

// Nobody has to wait as long as this.
constexpr uint32_t kLong = 60000;

// Sets the voice level when told so.
const test::Helper slider("voice-slider", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(api, toWide(arguments.at(0)).c_str(), 0);
    if (VXAPOCOMAPI_SetAPOType(endpoint, "EFX") != 1) return 1;
    test::sayLine("open");
    char value[32];
    while (std::scanf("%31s", value) == 1) {
        const int32_t done = VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_VOICE_LEVEL, std::strtof(value, nullptr));
        test::sayLine(done == 1 ? "done"
                                : "error " + std::to_string(VXAPOCOMAPI_GetLastError(endpoint)) + ", of the system " +
                                      std::to_string(VXAPOCOMAPI_GetWindowsLastError(endpoint)));
    }
    return VXAPOCOMAPI_FreeAPI(api) == 1 ? 0 : 2;
});

}  // namespace

TEST_CASE_FIXTURE(OpenSlot, "a slider that is moved in one process is told to a receiver that waits in another") {
    test::Process other = test::startHelper("voice-slider", {toUtf8(machine.endpointId())});
    REQUIRE(other.readLine() == "open");
    while (!receiveParams(handle(), 0).empty()) {
    }
    for (const float value : {0.25F, 0.5F, 0.75F}) {
        std::vector<ChangeRecord> records;
        std::atomic<bool> failed{false};
        std::thread waiting([&] {
            while (records.empty() && !failed) records = receiveParams(handle(), kLong);
        });
        other.write(std::to_string(value) + "\n");
        const std::string answer = other.readLine().value_or("(it ended)");
        failed = answer != "done";
        if (failed) VXAPOCOMAPI_CancelReceiveParamChange(handle());
        waiting.join();
        CHECK(answer == "done");
        REQUIRE(records.size() == 1);
        CHECK(records[0].component == 0);
        CHECK(records[0].param == -12);
        CHECK_FALSE(records[0].source == context().InstanceGuid);
        CHECK(floatFromBytes(records[0].data) == gainOfSlider({-48.0F, 12.0F}, value));
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == value);
    }
    other.closeInput();
    CHECK(other.wait() == 0);
}
