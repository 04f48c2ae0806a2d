// SPDX-License-Identifier: MIT
//
// What the parameter walk costs and what it sees on a store that can be asked for its counts and written in one piece.
#include <doctest/doctest.h>

#include <map>

#include "platform/posix/registry_store.h"
#include "preset/update_thread.h"
#include "tests/preset/walk_host.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using test::Delivered;

namespace {

struct Walk : test::SlotKeys {
    test::WalkHost host{*this};
    test::SlotClient client{*this};

    uint64_t queriesOfWalk() {
        const uint64_t before = storeCounts().statements;
        host.UpdateParametersFromRegistry(true, false);
        return storeCounts().statements - before;
    }
};

// Writes the parameters 1 to 4 of component 0 over and over, shared ones and one of its own, and says each stamp with its data.
const test::Helper stampedWriter("write-stamped", [](const std::vector<std::string> &arguments) {
    const CInstanceIDBase self;
    const WideString nothing;
    if (SetRegString(toWide(arguments.at(0)), self.InstanceId, &nothing) != status::ok) return 1;
    for (uint32_t number = 1;; ++number) {
        const int32_t param = static_cast<int32_t>(number % 4) + 1;
        uint8_t data[4];
        std::memcpy(data, &number, sizeof data);
        uint64_t stamp = 0;
        if (!WriteParameter(nullptr, toWide(arguments.at(1)), 0, param, -1, data, {self.InstanceGuid, self.InstanceId}, param == 4,
                            &stamp)) {
            return 2;
        }
        test::sayLine(std::to_string(stamp) + " " + std::to_string(number));
    }
});

}  // namespace

TEST_CASE_FIXTURE(Walk,
                  "a walk over an unchanged key asks the store twice, one that finds one of 1,000 parameters at most eight times") {
    REQUIRE(inOneWrite([&] {
                for (int32_t component = 0; component < 10; ++component) {
                    for (int32_t param = 1; param <= 100; ++param) write(component, param, {1, 2, 3, 4});
                }
                return status::ok;
            }) == status::ok);
    queriesOfWalk();
    REQUIRE(host.ParamChanges.size() == 1000);
    CHECK(queriesOfWalk() <= 2);
    CHECK(host.ParamChanges.empty());

    for (uint8_t i = 1; i <= 3; ++i) {
        write(7, 50, {i});
        const uint64_t queries = queriesOfWalk();
        CHECK(test::deliveredIn(host.ParamChanges) == std::vector<Delivered>{{7, 50, {i}}});
        CHECK(queries <= 8);
        writeFrom(client.source(), 7, 51, {i, i}, true);
        CHECK(queriesOfWalk() <= 8);
        CHECK(test::deliveredIn(host.ParamChanges) == std::vector<Delivered>{{7, 51, {i, i}, true}});
        CHECK(queriesOfWalk() <= 2);
    }
}

TEST_CASE_FIXTURE(Walk, "no value goes with another's stamp, however fast another process writes") {
    test::Process writer = test::startHelper("write-stamped", {toUtf8(clients), toUtf8(parameters)});
    REQUIRE(writer.readLine());
    std::map<uint64_t, uint32_t> seen;
    const auto note = [&] {
        for (const auto &[key, change] : host.ParamChanges) {
            uint32_t number = 0;
            REQUIRE(change.data->size() == sizeof number);
            std::memcpy(&number, change.data->data(), sizeof number);
            seen[change.time] = number;
        }
    };
    std::map<uint64_t, uint32_t> written;
    const auto noteWritten = [&](const std::string &line) {
        written[std::stoull(line)] = static_cast<uint32_t>(std::stoul(line.substr(line.find(' '))));
    };
    while (seen.size() < 1000) {
        host.UpdateParametersFromRegistry(true, false);
        note();
        const auto line = writer.readLine();
        REQUIRE(line);
        noteWritten(*line);
    }
    writer.kill();
    while (const auto line = writer.readLine()) noteWritten(*line);
    host.UpdateParametersFromRegistry(true, false);
    note();
    int strange = 0, unsaid = 0;
    for (const auto &[stamp, number] : seen) {
        const auto own = written.find(stamp);
        // The first line was taken before the table began, and the last write may have been killed before it could be told.
        if (own == written.end()) {
            ++unsaid;
        } else if (own->second != number) {
            ++strange;
        }
    }
    CHECK(strange == 0);
    CHECK(unsaid <= 2);
}

TEST_CASE_FIXTURE(Walk, "a thread whose root key is deleted walks once more and ends") {
    test::TaggedLog log(host);
    const auto thread = CUpdateFromRegistryThread::start(host, false, false);
    REQUIRE(thread);
    RegistryKey above;
    REQUIRE(RegistryKey::open(test::kMachine, VX_TEXT("Software\\Ondrevale"), RegistryAccess::all, above) == status::ok);
    REQUIRE(above.deleteTreeBelow(VX_TEXT("APO")) == status::ok);
    CHECK(host.waitFor([](const test::Poll &) { return true; }));
    while (NamedMutex::exists(syncMutexName(configuration))) std::this_thread::sleep_for(std::chrono::milliseconds(1));
    CHECK(log.count("Failed to set up registry notification callback for key 'Software\\Ondrevale\\APO'. Error code: 1018") == 1);
    CHECK(host.pollCount() == 1);
}
