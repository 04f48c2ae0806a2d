// SPDX-License-Identifier: MIT
//
// Clients in processes of their own: what they set lapses with them or stays, whether they end well or are killed.
#include <doctest/doctest.h>

#include <iostream>
#include <map>
#include <sstream>

#include "control/user_parameter_table.h"
#include "preset/parameter_store.h"
#include "tests/control/control_fixture.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using test::OpenEndpoint;

namespace {

// A client that does what its standard input says, a line at a time, and answers each with the call's result.
const test::Helper controlClient("control-client", [](const std::vector<std::string> &arguments) {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(api, toWide(arguments.at(0)).c_str(), 0);
    test::sayLine(std::to_string(VXAPOCOMAPI_SetAPOType(endpoint, "EFX")));
    for (std::string line; std::getline(std::cin, line);) {
        std::istringstream words(line);
        std::string command, name;
        int32_t component = 0, param = 0;
        float value = 0;
        int32_t result = -1;
        words >> command;
        if (command == "engine") {
            words >> name;
            result = VXAPOCOMAPI_SetEngine(endpoint, name.c_str(), VXAPOCOMAPI_GetEngineDefaultConfig(name.c_str()));
        } else if (command == "ioconfig") {
            words >> name;
            result = VXAPOCOMAPI_SetIOConfig(endpoint, name.c_str());
        } else if (command == "user") {
            words >> param >> value;
            result = VXAPOCOMAPI_SetUserParameter(endpoint, static_cast<uint32_t>(param), value);
        } else if (command == "transient") {
            words >> component >> param;
            const uint8_t data[] = {42};
            result = VXAPOCOMAPI_SetUserParameterEx(endpoint, component, param, 0, data, sizeof data, 0, 1, nullptr, nullptr);
        } else if (command == "free") {
            result = VXAPOCOMAPI_FreeEndpoint(endpoint) + VXAPOCOMAPI_FreeAPI(api);
        }
        test::sayLine(std::to_string(result));
    }
    return 0;
});

struct OtherClient {
    test::Process process;
    explicit OtherClient(const SampleMachine &machine)
        : process(test::startHelper("control-client", {toUtf8(machine.endpointId())})) {
        REQUIRE(process.readLine() == "1");
    }
    std::string ask(const std::string &line) {
        process.write(line + "\n");
        return process.readLine().value_or("(it ended)");
    }
};

std::string engineOf(VXAPOHandle endpoint) {
    char name[1024] = "(none)";
    VXAPOCOMAPI_GetEngine(endpoint, name);
    return name;
}

std::string ioConfigOf(VXAPOHandle endpoint) {
    char name[1024] = "(none)";
    VXAPOCOMAPI_GetIOConfig(endpoint, name);
    return name;
}

bool standsAt(const WideString &path, const VXWCHAR *name) {
    RegistryKey key;
    RegistryValue value;
    return RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) == status::ok &&
           key.query(name, value) == status::ok;
}

}  // namespace

TEST_CASE_FIXTURE(OpenEndpoint, "an engine and a configuration lapse with the client that is killed") {
    if (none()) return;
    SampleMachine::putPreset(orloPreset(), "EFX", "Headphones");
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(engineOf(endpoint) == "VXORLO");
    CHECK(ioConfigOf(endpoint) == "AnyOutput");

    OtherClient other(machine);
    REQUIRE(other.ask("ioconfig Headphones") == "1");
    CHECK(ioConfigOf(endpoint) == "Headphones");
    REQUIRE(other.ask("engine KZ.Novara") == "1");
    CHECK(engineOf(endpoint) == "KZ.Novara");

    other.process.kill();
    other.process.wait();
    CHECK(ioConfigOf(endpoint) == "AnyOutput");
    CHECK(engineOf(endpoint) == "VXORLO");
    CHECK(context().ParamRegKeyName.get() == SampleMachine::parametersPath());
}

TEST_CASE_FIXTURE(OpenEndpoint, "a client that ends takes its setter values along and leaves its configuration's name") {
    if (none()) return;
    const WideString slot = SampleMachine::configurationPath();
    {
        OtherClient other(machine);
        REQUIRE(other.ask("ioconfig AnyOutput") == "1");
        REQUIRE(other.ask("engine VXORLO") == "1");
        for (const VXWCHAR *name : {store_name::engineSetter, store_name::engineName, store_name::engineConfig,
                                    store_name::ioConfigSetter, store_name::ioConfig}) {
            CAPTURE(toUtf8(name));
            CHECK(standsAt(slot, name));
        }
        CHECK(other.ask("free") == "2");
    }
    for (const VXWCHAR *name :
         {store_name::engineSetter, store_name::engineName, store_name::engineConfig, store_name::ioConfigSetter}) {
        CAPTURE(toUtf8(name));
        CHECK_FALSE(standsAt(slot, name));
    }
    CHECK(standsAt(slot, store_name::ioConfig));
}

TEST_CASE_FIXTURE(OpenEndpoint, "a killed client's setter values stay in the registry and count no more") {
    if (none()) return;
    OtherClient other(machine);
    REQUIRE(other.ask("engine KZ.Novara") == "1");
    other.process.kill();
    other.process.wait();
    CHECK(standsAt(SampleMachine::configurationPath(), store_name::engineName));
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(engineOf(endpoint) == "VXORLO");
}

TEST_CASE_FIXTURE(OpenEndpoint, "a transient parameter lapses with the client that is killed, and the shared value is told again") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    const uint8_t shared[] = {11};
    REQUIRE(VXAPOCOMAPI_SetUserParameterEx(endpoint, 0, 77, 0, shared, sizeof shared, 0, 0, nullptr, nullptr) == 1);
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 0) == 1) {
    }
    // What is told of the one parameter: whether it is transient, and its byte.
    const auto told = [&]() -> std::pair<int, int> {
        if (count != 1 || size != 49) return {-1, -1};
        const auto *record = static_cast<const uint8_t *>(blob);
        return record[28] == 77 ? std::pair<int, int>(record[40], record[48]) : std::pair<int, int>(-1, -1);
    };
    OtherClient other(machine);
    REQUIRE(other.ask("transient 0 77") == "1");
    REQUIRE(VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 10000, 0) == 1);
    CHECK(told() == std::pair(1, 42));

    const auto transients = [] {
        RegistryKey key;
        std::vector<WideString> names;
        REQUIRE(RegistryKey::open(RegistryRoot::localMachine, SampleMachine::parametersPath() + VX_TEXT("\\0\\Data"),
                                  RegistryAccess::read, key) == status::ok);
        key.values(names);
        return std::count_if(names.begin(), names.end(), [](const WideString &name) { return name.starts_with(VX_TEXT("77,")); });
    };
    CHECK(transients() == 1);
    other.process.kill();
    other.process.wait();
    // The next change, of whatever it is, makes the receiver look.
    REQUIRE(VXAPOCOMAPI_SetUserParameterEx(endpoint, 0, 78, 0, shared, sizeof shared, 0, 0, nullptr, nullptr) == 1);
    bool again = false;
    while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 0) == 1) {
        const auto *record = static_cast<const uint8_t *>(blob);
        for (uint32_t i = 0; i < count; ++i, record += 49)
            again = again || (record[28] == 77 && record[40] == 0 && record[48] == 11);
    }
    CHECK(again);
    CHECK(transients() == 0);
}

TEST_CASE_FIXTURE(OpenEndpoint, "a killed client's mark is taken away by the next look at the parameters") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    const auto marks = [] {
        RegistryKey key;
        std::vector<WideString> names;
        REQUIRE(RegistryKey::open(RegistryRoot::localMachine, SampleMachine::configurationPath() + VX_TEXT("\\Clients"),
                                  RegistryAccess::read, key) == status::ok);
        key.values(names);
        return std::count_if(names.begin(), names.end(), [](const WideString &name) { return name.starts_with(VX_TEXT("{")); });
    };
    OtherClient other(machine);
    CHECK(marks() == 2);
    other.process.kill();
    other.process.wait();
    CHECK(marks() == 2);
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 1);
    CHECK(marks() == 1);
}

TEST_CASE("a preset that is replaced by another one keeps the seventeen settings of another process") {
    const SampleMachine machine;
    if (!machine.hasEndpoint()) {
        MESSAGE("skipped: this machine has no active endpoint for rendering");
        return;
    }
    std::map<int32_t, float> set;
    {
        OtherClient other(machine);
        for (int32_t id = 0; id < kUserParameterCount; ++id) {
            set[id] = id == 0 || id == 5 || id == 16 ? static_cast<float>(id % 2) : 0.04F * static_cast<float>(id);
            REQUIRE(other.ask("user " + std::to_string(id) + " " + std::to_string(set[id])) == "1");
        }
        other.process.kill();
    }
    SampleValues values = SampleValues::usual();
    values.add(7, 7, {7});
    SampleMachine::putPreset(orloPreset(values));
    const test::Client client;
    VXAPOHandle const endpoint = VXAPOCOMAPI_GetEndpoint(client.api, machine.endpointId().c_str(), 0);
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    for (const auto &setting : set) {
        CAPTURE(setting.first);
        CHECK(VXAPOCOMAPI_GetUserParameter(endpoint, setting.first) == doctest::Approx(setting.second).epsilon(1e-5));
    }
    uint8_t seventh = 0;
    uint32_t size = 1;
    CHECK(VXAPOCOMAPI_GetUserParameterEx(endpoint, 7, 7, 0, &seventh, &size, nullptr, nullptr) == 1);
    CHECK(seventh == 7);
}
