// SPDX-License-Identifier: MIT
//
// Three clients of one slot in processes of their own, doing whatever comes to their mind, and one of them killed every second. Who
// receives ends with exactly the values that the store holds. VXCOMN_CLIENT_SECONDS says for how long; few by default.
#include <doctest/doctest.h>

#include <array>
#include <chrono>
#include <cstdlib>
#include <map>
#include <memory>
#include <random>
#include <thread>

#include "preset/parameter_store.h"
#include "tests/control/control_fixture.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using test::OpenEndpoint;

namespace {

using Bytes = std::vector<uint8_t>;
using Place = std::pair<int32_t, int32_t>;  // component, parameter

constexpr int32_t kFirstParam = 60, kParams = 8, kComponents = 4;

const test::Helper restlessClient("restless-client", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(api, toWide(arguments.at(0)).c_str(), 0);
    if (VXAPOCOMAPI_SetAPOType(endpoint, "EFX") != 1) return 1;
    test::sayLine("ready");
    std::mt19937 random(static_cast<uint32_t>(std::stoul(arguments.at(1))));
    const int32_t operations = std::stoi(arguments.at(2));
    for (int32_t i = 0; i < operations; ++i) {
        const int32_t component = static_cast<int32_t>(random() % kComponents);
        const int32_t param = kFirstParam + static_cast<int32_t>(random() % kParams);
        Bytes data(1 + random() % 40);
        for (uint8_t &byte : data) byte = static_cast<uint8_t>(random());
        const uint32_t what = random() % 100;
        if (what < 85) {
            VXAPOCOMAPI_SetUserParameterEx(endpoint, component, param, 0, data.data(), static_cast<uint32_t>(data.size()), 0,
                                           what < 15, nullptr, nullptr);
        } else if (what < 97) {
            VXAPOCOMAPI_SetUserParameter(endpoint, random() % 17, static_cast<float>(random() % 101) / 100.0F);
        } else if (what < 99) {
            VXAPOCOMAPI_ResetUserParameter(endpoint, 3, -12, 0);
        } else {
            VXAPOCOMAPI_ResetUserParametersEx(endpoint, 0);
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(random() % 4));
    }
    VXAPOCOMAPI_FreeAPI(api);
    return 0;
});

int secondsToRun() {
    const char *wanted = std::getenv("VXCOMN_CLIENT_SECONDS");
    return wanted != nullptr ? std::max(1, std::atoi(wanted)) : 3;
}

int32_t numberAt(const uint8_t *bytes) {
    int32_t number = 0;
    std::memcpy(&number, bytes, sizeof number);
    return number;
}

// What a receiver knows: of each parameter what it was told last.
class Receiver {
  public:
    explicit Receiver(VXAPOHandle endpoint) : endpoint_(endpoint) {}

    // False if nothing came within the time.
    bool receive(uint32_t milliseconds, bool force = false) {
        const void *blob = nullptr;
        uint32_t size = 0, count = 0;
        if (VXAPOCOMAPI_ReceiveParamChange(endpoint_, &blob, &size, &count, milliseconds, force ? 1 : 0) != 1) return false;
        const auto *record = static_cast<const uint8_t *>(blob);
        for (uint32_t i = 0; i < count; ++i) {
            const auto bytes = static_cast<size_t>(numberAt(record + 36));
            known[{numberAt(record + 24), numberAt(record + 28)}] = Bytes(record + 48, record + 48 + bytes);
            record += 48 + bytes;
        }
        CHECK(record == static_cast<const uint8_t *>(blob) + size);
        changes += count;
        return true;
    }

    std::map<Place, Bytes> known;
    uint64_t changes = 0;

  private:
    VXAPOHandle endpoint_;
};

// The shared values of the store.
std::map<Place, Bytes> storedValues(const WideString &parameters) {
    std::map<Place, Bytes> all;
    RegistryKey key;
    std::vector<WideString> components;
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, parameters, RegistryAccess::read, key) == status::ok);
    key.subkeys(components);
    for (const WideString &component : components) {
        RegistryKey data;
        std::vector<WideString> names;
        if (key.openBelow(component + VX_TEXT("\\Data"), RegistryAccess::read, data) != status::ok) continue;
        data.values(names);
        for (const WideString &name : names) {
            Bytes value;
            if (name.find(VX_TEXT(',')) != WideString::npos) continue;
            REQUIRE(data.readBytes(name, value, 65536) == RegistryRead::value);
            all[{std::stoi(toUtf8(component)), std::stoi(toUtf8(name))}] = value;
        }
    }
    return all;
}

}  // namespace

TEST_CASE_FIXTURE(OpenEndpoint, "three clients write at random and are killed, and the receiver ends with what the store holds") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    std::mt19937 random(20240611);
    const std::string id = toUtf8(machine.endpointId());
    const auto start = [&](int32_t operations) {
        auto writer = std::make_unique<test::Process>(
            test::startHelper("restless-client", {id, std::to_string(random()), std::to_string(operations)}));
        REQUIRE(writer->readLine() == "ready");
        return writer;
    };
    constexpr int32_t kForGood = 1000000;
    std::array<std::unique_ptr<test::Process>, 3> writers;
    for (auto &writer : writers) writer = start(kForGood);

    Receiver receiver(endpoint);
    receiver.receive(0, true);
    for (int second = 0; second < secondsToRun(); ++second) {
        const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(1);
        while (std::chrono::steady_clock::now() < end) receiver.receive(20);
        auto &victim = writers[random() % writers.size()];
        victim->kill();
        victim->wait();
        victim = start(kForGood);
    }
    for (const auto &writer : writers) writer->kill();
    for (const auto &writer : writers) writer->wait();
    // One that ends by itself, too; and a last write makes the receiver look for who is gone.
    CHECK(start(50)->wait() == 0);
    const uint8_t last[] = {1};
    REQUIRE(VXAPOCOMAPI_SetUserParameterEx(endpoint, 0, 99, 0, last, sizeof last, 0, 0, nullptr, nullptr) == 1);
    while (receiver.receive(0)) {
    }
    const std::map<Place, Bytes> stored = storedValues(context().ParamRegKeyName.get());
    CHECK(stored.size() >= 18);
    size_t wrong = 0;
    for (const auto &[place, value] : stored) {
        const bool isKnown = receiver.known.count(place) != 0 && receiver.known[place] == value;
        if (!isKnown) MESSAGE("component " << place.first << ", parameter " << place.second);
        wrong += isKnown ? 0 : 1;
    }
    CHECK(wrong == 0);
    MESSAGE(receiver.changes << " changes received, " << stored.size() << " values stored");
}
