// SPDX-License-Identifier: MIT
//
// Being told what others changed: polls, waits, their ends, and what is handed out.
#include <doctest/doctest.h>

#include <chrono>
#include <future>
#include <thread>

#include "tests/control/changes.h"
#include "tests/control/open_slot.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using namespace std::chrono_literals;

namespace {

const EngineConfig kNovara = {20, 0, 1, {{0, 0}}};

// Nobody has to wait as long as this.
constexpr uint32_t kLong = 60000;

// A second client on the slot, the one that listens, with everything old behind it.
struct TwoClients : OpenSlot {
    TwoClients() : other(machine) {
        while (!receiveParams(handle(), 0).empty()) {
        }
        while (receiveConfig(handle(), 0)) {
        }
    }
    void write(int32_t component, int32_t param, const Bytes &data, bool transient = false) const {
        REQUIRE(VXAPOCOMAPI_SetParameterEx(other.endpoint, component, param, -1, data.data(), static_cast<uint32_t>(data.size()), 0,
                                           transient ? 1 : 0, nullptr, nullptr) == 1);
    }
    // Waits until a thread is inside a path.
    static void untilInside(const Event &idle) {
        while (waitForOne(idle, 0) == WaitOutcome::signalled) std::this_thread::yield();
        std::this_thread::sleep_for(20ms);
    }

    Client other;
};

// Receives until there is something, as an application does.
std::vector<ChangeRecord> nextParams(VXAPOHandle handle) {
    for (;;) {
        if (auto records = receiveParams(handle, kLong); !records.empty()) return records;
    }
}
ConfigNotice nextConfig(VXAPOHandle handle) {
    for (;;) {
        if (auto notice = receiveConfig(handle, kLong)) return *notice;
    }
}

}  // namespace

TEST_CASE_FIXTURE(TwoClients, "a time-out of 0 makes a receive call a poll") {
    CHECK(receiveParams(handle(), 0).empty());
    CHECK_FALSE(receiveConfig(handle(), 0));
    write(4, 20, {1});
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Other") == 1);
    CHECK(receiveParams(handle(), 0).size() == 1);
    const auto notice = receiveConfig(handle(), 0);
    REQUIRE(notice);
    CHECK(notice->name == "UserProfile");
    CHECK_FALSE(receiveConfig(handle(), 0));
}

TEST_CASE_FIXTURE(TwoClients, "engine name and record changed together come in two calls, the name first") {
    CHECK(VXAPOCOMAPI_SetEngine(other.endpoint, "KZNOVA", &kNovara) == 1);
    const auto first = receiveConfig(handle(), 0), second = receiveConfig(handle(), 0);
    REQUIRE(first);
    REQUIRE(second);
    CHECK(first->name == "EngineName");
    CHECK(second->name == "EngineConfig");
    CHECK(second->data.size() == 524);
    CHECK_FALSE(receiveConfig(handle(), 0));
}

TEST_CASE_FIXTURE(TwoClients, "the notice carries what stands selected as yet, until the getter takes the new value over") {
    CHECK(VXAPOCOMAPI_SetEngine(other.endpoint, "KZNOVA", &kNovara) == 1);
    auto notice = receiveConfig(handle(), 0);
    REQUIRE(notice);
    CHECK(notice->text() == "VXORLO");
    char name[1024];
    CHECK(VXAPOCOMAPI_GetEngine(handle(), name) == 1);
    CHECK(std::string(name) == "KZNOVA");
    notice = receiveConfig(handle(), 0);
    REQUIRE(notice);
    CHECK(notice->name == "EngineConfig");
    CHECK(std::memcmp(notice->data.data(), &kNovara, sizeof kNovara) == 0);
}

TEST_CASE_FIXTURE(TwoClients, "all five selections come out in their order, and each costs one call") {
    CHECK(VXAPOCOMAPI_SetContentType(other.endpoint, "Film") == 1);
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Night") == 1);
    CHECK(VXAPOCOMAPI_SetIOConfig(other.endpoint, "Speakers") == 1);
    CHECK(VXAPOCOMAPI_SetEngine(other.endpoint, "KZNOVA", &kNovara) == 1);
    const char *const names[] = {"EngineName", "EngineConfig", "IOConfig", "UserProfile", "ContentType"};
    const char *const texts[] = {"VXORLO", nullptr, "AnyOutput", "GlobalProfile", "AnyContent"};
    for (int i = 0; i < 5; ++i) {
        const auto notice = receiveConfig(handle(), kLong);
        REQUIRE(notice);
        CHECK(notice->name == names[i]);
        if (texts[i] != nullptr) {
            CHECK(notice->text() == texts[i]);
            CHECK(notice->data.size() == 2 * std::strlen(texts[i]) + 2);
        }
    }
    CHECK_FALSE(receiveConfig(handle(), 0));
}

TEST_CASE_FIXTURE(TwoClients, "three changes of different priority come out heaviest first in a single blob") {
    write(2, 30, {1, 2, 3});
    write(5, 130, {4, 5});
    write(-1, -31, {6});
    const auto records = receiveParams(handle(), 0);
    REQUIRE(records.size() == 3);
    CHECK(records[0].component == -1);
    CHECK(records[0].param == -31);
    CHECK(records[1].component == 5);
    CHECK(records[1].param == 130);
    CHECK(records[2].component == 2);
    CHECK(records[2].data == Bytes{1, 2, 3});
    for (const ChangeRecord &record : records) {
        CHECK(record.source == other.context().InstanceGuid);
        CHECK(record.channel == INT32_MIN);
        CHECK(record.isTransient == 0);
        CHECK((record.time & kStampUnread) == 0);
    }
}

TEST_CASE_FIXTURE(TwoClients, "the same parameter changed twice before a receive yields one record with the later data") {
    write(2, 31, {1});
    write(2, 31, {2, 2});
    const auto records = receiveParams(handle(), 0);
    REQUIRE(records.size() == 1);
    CHECK(records[0].data == Bytes{2, 2});
}

TEST_CASE_FIXTURE(TwoClients, "a change from another client ends a wait and is delivered") {
    auto params = std::async(std::launch::async, [&] { return nextParams(handle()); });
    auto config = std::async(std::launch::async, [&] { return nextConfig(handle()); });
    untilInside(context().ParamIdle);
    untilInside(context().ConfigIdle);
    write(2, 32, {7});
    CHECK(VXAPOCOMAPI_SetIOConfig(other.endpoint, "Speakers") == 1);
    const auto records = params.get();
    REQUIRE(records.size() == 1);
    CHECK(records[0].data == Bytes{7});
    CHECK(config.get().name == "IOConfig");
}

TEST_CASE_FIXTURE(TwoClients, "a cancel ends a wait of either path with nothing delivered") {
    auto params = std::async(std::launch::async, [&] { return receiveParams(handle(), kForever).size(); });
    auto config = std::async(std::launch::async, [&] { return receiveConfig(handle(), kForever).has_value(); });
    untilInside(context().ParamIdle);
    untilInside(context().ConfigIdle);
    CHECK(VXAPOCOMAPI_CancelReceiveParamChange(handle()) == 1);
    CHECK(VXAPOCOMAPI_CancelReceiveConfigChange(handle()) == 1);
    CHECK(params.get() == 0);
    CHECK_FALSE(config.get());
}

TEST_CASE_FIXTURE(TwoClients, "a cancel with nobody waiting ends the next wait at once, and the one after it waits again") {
    CHECK(VXAPOCOMAPI_CancelReceiveParamChange(handle()) == 1);
    CHECK(VXAPOCOMAPI_CancelReceiveConfigChange(handle()) == 1);
    CHECK(receiveParams(handle(), kForever).empty());
    CHECK_FALSE(receiveConfig(handle(), kForever));
    auto params = std::async(std::launch::async, [&] { return receiveParams(handle(), kForever).size(); });
    auto config = std::async(std::launch::async, [&] { return receiveConfig(handle(), kForever).has_value(); });
    untilInside(context().ParamIdle);
    untilInside(context().ConfigIdle);
    CHECK(params.wait_for(50ms) == std::future_status::timeout);
    CHECK(config.wait_for(0ms) == std::future_status::timeout);
    VXAPOCOMAPI_CancelReceiveParamChange(handle());
    VXAPOCOMAPI_CancelReceiveConfigChange(handle());
    CHECK(params.get() == 0);
    CHECK_FALSE(config.get());
}

TEST_CASE_FIXTURE(TwoClients, "a wait ends at its time-out and leaves the path idle") {
    CHECK(receiveParams(handle(), 30).empty());
    CHECK_FALSE(receiveConfig(handle(), 30));
    CHECK(waitForOne(context().ParamIdle, 0) == WaitOutcome::signalled);
    CHECK(waitForOne(context().ConfigIdle, 0) == WaitOutcome::signalled);
}

TEST_CASE_FIXTURE(TwoClients, "a shutdown turns receive calls away") {
    context().ParamShutdown.set();
    context().ConfigShutdown.set();
    write(2, 33, {1});
    CHECK(receiveParams(handle(), kForever).empty());
    CHECK_FALSE(receiveConfig(handle(), kForever));
}

TEST_CASE("closing an endpoint while threads wait in both receive calls ends both") {
    const SampleMachine machine;
    for (int round = 0; round < 20; ++round) {
        Client client(machine);
        while (!receiveParams(client.endpoint, 0).empty()) {
        }
        VXAPOCOMAPI_EndpointContext &context = client.context();
        auto params = std::async(std::launch::async, [&] { return receiveParams(client.endpoint, kForever).size(); });
        auto config = std::async(std::launch::async, [&] { return receiveConfig(client.endpoint, kForever).has_value(); });
        while (waitForOne(context.ParamIdle, 0) == WaitOutcome::signalled ||
               waitForOne(context.ConfigIdle, 0) == WaitOutcome::signalled) {
            std::this_thread::yield();
        }
        CHECK(VXAPOCOMAPI_FreeEndpoint(client.endpoint) == 1);
        CHECK(params.get() == 0);
        CHECK_FALSE(config.get());
    }
}

TEST_CASE("a receive call that begins while the endpoint is being closed either runs or is refused") {
    const SampleMachine machine;
    for (int round = 0; round < 50; ++round) {
        Client client(machine);
        VXAPOHandle const handle = client.endpoint;
        std::atomic<bool> go{false};
        const auto receive = [&](auto call) {
            return std::async(std::launch::async, [&go, handle, call] {
                while (!go) std::this_thread::yield();
                for (int i = 0; i < 3; ++i) call(handle);
            });
        };
        // What would be handed out goes with the endpoint.
        auto params = receive([](VXAPOHandle at) { VXAPOCOMAPI_ReceiveParamChange(at, nullptr, nullptr, nullptr, kForever, 0); });
        auto config = receive([](VXAPOHandle at) { VXAPOCOMAPI_ReceiveConfigChange(at, nullptr, nullptr, nullptr, kForever, 0); });
        go = true;
        CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 1);
        params.get();
        config.get();
    }
}

TEST_CASE_FIXTURE(TwoClients, "a forced call reports the stored values even if nothing changed, as long as they aren't empty") {
    write(2, 34, {1});
    CHECK(receiveParams(handle(), 0).size() == 1);
    CHECK(receiveParams(handle(), 0).empty());
    CHECK(receiveParams(handle(), 0, true).size() == 18);
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Night") == 1);
    while (receiveConfig(handle(), 0)) {
    }
    for (int i = 0; i < 2; ++i) {
        const auto notice = receiveConfig(handle(), 0, true);
        REQUIRE(notice);
        CHECK(notice->name == "UserProfile");
    }
}

TEST_CASE_FIXTURE(OpenSlot, "the first receive delivers every parameter of a store that was seeded from the preset") {
    const auto records = receiveParams(handle(), kForever);
    REQUIRE(records.size() == 17);
    for (const ChangeRecord &record : records) {
        CHECK(record.source == GUID{});
        CHECK(record.data == stored(record.component, record.param));
    }
}

TEST_CASE_FIXTURE(TwoClients, "what a receive call handed out stays until the next one delivers") {
    write(2, 35, {1, 2, 3});
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Night") == 1);
    const void *blob = nullptr, *data = nullptr;
    const VXWCHAR *name = nullptr;
    uint32_t size = 0, count = 0, dataSize = 0;
    REQUIRE(VXAPOCOMAPI_ReceiveParamChange(handle(), &blob, &size, &count, 0, 0) == 1);
    REQUIRE(VXAPOCOMAPI_ReceiveConfigChange(handle(), &name, &data, &dataSize, 0, 0) == 1);
    char profile[512];
    CHECK(VXAPOCOMAPI_GetUserProfile(handle(), profile) == 1);
    CHECK(receiveParams(handle(), 0).size() > 0);  // the other profile's key
    CHECK_FALSE(receiveConfig(handle(), 0));
    CHECK(dataSize == 28);
    CHECK(toUtf8(WideString(static_cast<const VXWCHAR *>(data))) == "GlobalProfile");
}

TEST_CASE_FIXTURE(TwoClients, "outs may be null, and nothing is written where nothing is delivered") {
    write(2, 36, {1});
    CHECK(VXAPOCOMAPI_SetUserProfile(other.endpoint, "Night") == 1);
    CHECK(VXAPOCOMAPI_ReceiveParamChange(handle(), nullptr, nullptr, nullptr, 0, 0) == 1);
    CHECK(VXAPOCOMAPI_ReceiveConfigChange(handle(), nullptr, nullptr, nullptr, 0, 0) == 1);
    const void *blob = this;
    uint32_t size = 5, count = 6;
    CHECK(VXAPOCOMAPI_ReceiveParamChange(handle(), &blob, &size, &count, 0, 0) == 0);
    CHECK(blob == this);
    CHECK(size == 5);
    CHECK(count == 6);
}

TEST_CASE_FIXTURE(TwoClients, "a set re-entry mark turns a receive call away") {
    context().InReceiveConfigChange = 1;
    context().InReceiveParamChange = 1;
    write(2, 37, {1});
    CHECK(contains(linesOf([&] { CHECK(receiveParams(handle(), kForever).empty()); }), "Triggered re-entry check, exiting..."));
    CHECK(contains(linesOf([&] { CHECK_FALSE(receiveConfig(handle(), kForever)); }), "Triggered re-entry check, exiting..."));
    CHECK(waitForOne(context().ParamIdle, 0) == WaitOutcome::signalled);
}

TEST_CASE_FIXTURE(NoSlot, "without a slot a receive call waits for its time-out") {
    CHECK(receiveParams(handle(), 1).empty());
    CHECK_FALSE(receiveConfig(handle(), 1));
}

TEST_CASE_FIXTURE(TwoClients, "cancels are traced with the handle") {
    const auto lines = linesOf([&] {
        VXAPOCOMAPI_CancelReceiveParamChange(handle());
        VXAPOCOMAPI_CancelReceiveConfigChange(handle());
    });
    REQUIRE(lines.size() == 4);
    CHECK(lines[0].rfind("{ VXAPOCOMAPI_CancelReceiveParamChange(apoComHandle = 0x", 0) == 0);
    CHECK(lines[2].rfind("{ VXAPOCOMAPI_CancelReceiveConfigChange(apoComHandle = 0x", 0) == 0);
}

TEST_CASE_FIXTURE(TwoClients, "bad handles receive and cancel nothing, and nothing touches the errors") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    int something = 0;
    for (VXAPOHandle bad : {static_cast<VXAPOHandle>(nullptr), static_cast<VXAPOHandle>(&something), client->api}) {
        CHECK(receiveParams(bad, kForever).empty());
        CHECK_FALSE(receiveConfig(bad, kForever));
        CHECK(VXAPOCOMAPI_CancelReceiveParamChange(bad) == 0);
        CHECK(VXAPOCOMAPI_CancelReceiveConfigChange(bad) == 0);
    }
    receiveParams(handle(), 0);
    receiveConfig(handle(), 0);
    CHECK(error() == -2);
}

TEST_CASE_FIXTURE(TwoClients, "a write of one's own is told, too") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL, 0.5F) == 1);
    const auto records = receiveParams(handle(), 0);
    REQUIRE(records.size() == 1);
    CHECK(records[0].source == context().InstanceGuid);
}
