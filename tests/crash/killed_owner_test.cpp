// SPDX-License-Identifier: MIT
//
// Two writers share the slot's mutex, and one is killed while it holds it: the other one goes on.
#include <doctest/doctest.h>

#include <chrono>
#include <random>
#include <thread>

#include "platform/guid.h"
#include "preset/global_mutex.h"
#include "tests/crash/rounds.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using vxcomn::testing::DebugCapture;

namespace {

// Takes the mutex and writes for ever while it holds it.
const test::Helper holdAndWrite("hold-and-write", [](const std::vector<std::string> &arguments) {
    const CTraceFuncCallTarget silent;
    GlobalMutex mutex(silent);
    if (mutex.create(toWide(arguments.at(0))) != status::ok) return 1;
    const GlobalMutexLock lock(mutex);
    if (!lock.acquired()) return 2;
    test::sayLine("owned");
    const std::vector<uint8_t> data = {1};
    while (WriteParameter(nullptr, toWide(arguments.at(1)), 0, 1, -1, data, {}, false, nullptr)) {
    }
    return 3;
});

}  // namespace

TEST_CASE_FIXTURE(test::StoreFixture, "when the owner of the slot's mutex is killed the other writer goes on") {
    const auto seed = std::random_device()();
    INFO("seed ", seed);
    std::mt19937 random(seed);
    const DebugCapture capture;
    const test::Logger logger;
    GUID guid;
    REQUIRE(newGuid(guid));
    GlobalMutex mutex(logger);
    REQUIRE(mutex.create(guidText(guid)) == status::ok);
    const int rounds = std::max(test::crashRounds() / 10, 5);
    int stuck = 0, unwritten = 0;
    for (int round = 0; round < rounds; ++round) {
        test::Process owner = test::startHelper("hold-and-write", {toUtf8(mutex.name()), toUtf8(parameters)});
        REQUIRE(owner.readLine() == "owned");
        // Now and then the other one waits already.
        const int delay = std::uniform_int_distribution(-1000, 1000)(random);
        std::thread killer([&owner, delay] {
            if (delay > 0) std::this_thread::sleep_for(std::chrono::microseconds(delay));
            owner.kill();
        });
        if (delay < 0) std::this_thread::sleep_for(std::chrono::microseconds(-delay));
        {
            const GlobalMutexLock lock(mutex);
            if (!lock.acquired()) ++stuck;
            if (!write(0, 2, {static_cast<uint8_t>(round)})) ++unwritten;
        }
        killer.join();
    }
    CHECK(stuck == 0);
    CHECK(unwritten == 0);
    CHECK(capture.lines().empty());
    MESSAGE(rounds << " owners killed, the other one stuck " << stuck << " times, " << unwritten << " writes failed");
}
