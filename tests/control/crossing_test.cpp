// SPDX-License-Identifier: MIT
//
// From a slider in one process to a receiver in another, with clients that work at random and are killed.
// VXCOMN_CROSSING_SECONDS tells how long the last case runs.
#include <doctest/doctest.h>

#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <memory>
#include <random>
#include <thread>

#include "tests/control/changes.h"
#include "tests/control/open_slot.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using namespace std::chrono_literals;

namespace {

constexpr uint32_t kLong = 60000;

// On Linux a write is whole or isn't. Elsewhere it is several calls, and who is killed between them leaves new data with an old
// stamp, so clients rest before they are killed.
constexpr bool kWholeWrites = std::filesystem::path::preferred_separator == '/';

VXAPOHandle openSlot(const std::string &endpointId) {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(api, toWide(endpointId).c_str(), 0);
    return VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1 ? endpoint : nullptr;
}

// Sets the voice level when told so.
const test::Helper slider("voice-slider", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const endpoint = openSlot(arguments.at(0));
    if (endpoint == nullptr) return 1;
    test::sayLine("open");
    char value[32];
    while (std::scanf("%31s", value) == 1) {
        const int32_t done = VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_VOICE_LEVEL, std::strtof(value, nullptr));
        test::sayLine(done == 1 ? "done" : "failed");
    }
    return 0;
});

// Works on the parameters of the preset at random until its input ends; then it rests and waits to be killed.
const test::Helper worker("random-client", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const endpoint = openSlot(arguments.at(0));
    std::mt19937 random(static_cast<uint32_t>(std::strtoul(arguments.at(1).c_str(), nullptr, 10)));
    if (endpoint == nullptr) return 1;
    test::sayLine("open");
    std::atomic<bool> resting{false};
    std::thread listener([&] {
        while (std::getchar() != EOF) {
        }
        resting = true;
    });
    while (!resting) {
        const auto id = static_cast<uint32_t>(random() % 17);
        const float value = static_cast<float>(random() % 1001) / 1000.0F;
        const auto bytes = floatBytes(value);
        switch (random() % 6) {
            case 0:
                VXAPOCOMAPI_SetUserParameterEx(endpoint, static_cast<int32_t>(random() % 4), -12, -1, bytes.data(), 4, 0, 1,
                                               nullptr, nullptr);
                break;
            case 1:
                VXAPOCOMAPI_SetParameter(endpoint, static_cast<int32_t>(random() % 4), -12, -1, bytes.data(), 4, 1);
                break;
            case 2:
                VXAPOCOMAPI_ResetUserParameter(endpoint, 5, 115 + static_cast<int32_t>(random() % 12), 0);
                break;
            case 3:
                VXAPOCOMAPI_GetUserParameter(endpoint, static_cast<int32_t>(id));
                break;
            default:
                VXAPOCOMAPI_SetUserParameter(endpoint, id, value);
        }
        std::this_thread::sleep_for(std::chrono::microseconds(random() % 2000));
    }
    listener.join();
    test::sayLine("resting");
    std::this_thread::sleep_for(1h);
    return 0;
});

test::Process start(const char *helper, const SampleMachine &machine, uint32_t seed = 0) {
    test::Process process = test::startHelper(helper, {toUtf8(machine.endpointId()), std::to_string(seed)});
    REQUIRE(process.readLine() == "open");
    return process;
}

void tell(test::Process &process, const std::string &words) {
    process.write(words + "\n");
    REQUIRE(process.readLine() == "done");
}

using Applied = std::map<std::pair<int32_t, int32_t>, Bytes>;

// The shared values below a parameter key; `transient` counts the others.
Applied storedValues(const WideString &parameterKey, size_t &transient) {
    Applied values;
    RegistryKey key;
    std::vector<WideString> components;
    transient = 0;
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, parameterKey, RegistryAccess::read, key) == status::ok);
    key.subkeys(components);
    for (const WideString &component : components) {
        RegistryKey data;
        std::vector<WideString> names;
        if (key.openBelow(component + VX_TEXT("\\Data"), RegistryAccess::read, data) == status::ok) data.values(names);
        for (const WideString &name : names) {
            Bytes bytes;
            if (name.find(VXWCHAR{','}) != WideString::npos) {
                ++transient;
            } else if (data.readBytes(name, bytes, 65536) == RegistryRead::value) {
                values[{std::stoi(toUtf8(component)), std::stoi(toUtf8(name))}] = bytes;
            }
        }
    }
    return values;
}

// What an engine would have been told last.
struct Receiver {
    VXAPOHandle handle;
    Applied values;
    uint64_t records = 0;

    bool receive(uint32_t milliseconds) {
        const auto changes = receiveParams(handle, milliseconds);
        for (const ChangeRecord &change : changes) values[{change.component, change.param}] = change.data;
        records += changes.size();
        return !changes.empty();
    }
    // Until nothing is new any more. A walk passes over a client's mark behind one that it takes away, so several may be needed.
    void drain() {
        for (int quiet = 0; quiet < 8; quiet = receive(0) ? 0 : quiet + 1) {
        }
    }
};

}  // namespace

TEST_CASE_FIXTURE(OpenSlot, "a slider that is moved in one process is told to a receiver that waits in another") {
    test::Process other = start("voice-slider", machine);
    Receiver{handle(), {}}.drain();
    for (const float value : {0.25F, 0.5F, 0.75F}) {
        std::vector<ChangeRecord> records;
        std::thread waiting([&] {
            while (records.empty()) records = receiveParams(handle(), kLong);
        });
        tell(other, std::to_string(value));
        waiting.join();
        REQUIRE(records.size() == 1);
        CHECK(records[0].component == 0);
        CHECK(records[0].param == -12);
        CHECK_FALSE(records[0].source == context().InstanceGuid);
        CHECK(floatFromBytes(records[0].data) == gainOfSlider({-48.0F, 12.0F}, value));
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == value);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "three clients work at random and one is killed every second: what was told is what is stored") {
    const char *const wanted = std::getenv("VXCOMN_CROSSING_SECONDS");
    const int seconds = wanted != nullptr ? std::atoi(wanted) : 5;
    const auto seed = std::random_device()();
    CAPTURE(seed);
    std::mt19937 random(seed);
    Receiver receiver{handle(), {}};
    std::atomic<bool> ended{false};
    std::vector<std::unique_ptr<test::Process>> clients;
    const auto startOne = [&] {
        return std::make_unique<test::Process>(start("random-client", machine, static_cast<uint32_t>(random())));
    };
    for (int i = 0; i < 3; ++i) clients.push_back(startOne());
    std::thread receiving([&] {
        while (!ended) receiver.receive(50);
    });
    const auto end = [](test::Process &process) {
        if (!kWholeWrites) {
            process.closeInput();
            process.readLine();
        }
        process.kill();
        process.wait();
    };
    for (int second = 0; second < seconds; ++second) {
        std::this_thread::sleep_for(1s);
        std::unique_ptr<test::Process> &chosen = clients[random() % clients.size()];
        end(*chosen);
        chosen = startOne();
    }
    for (const std::unique_ptr<test::Process> &process : clients) end(*process);
    ended = true;
    receiving.join();
    receiver.drain();
    size_t transient = 0;
    const Applied stored = storedValues(context().ParamRegKeyName.get(), transient);
    CHECK(transient == 0);
    CHECK(receiver.values.size() == stored.size());
    for (const auto &[parameter, bytes] : stored) {
        CAPTURE(parameter.first);
        CAPTURE(parameter.second);
        CHECK(receiver.values[parameter] == bytes);
    }
    CHECK(receiver.records > stored.size());
    MESSAGE(seconds << " s, " << receiver.records << " records");
}
