// SPDX-License-Identifier: MIT
//
// Writers write, watchers are told, and any of them is killed in the middle: what each watcher reads last is the last value.
#include <doctest/doctest.h>

#include <chrono>
#include <cstring>
#include <memory>
#include <random>
#include <thread>

#include "platform/change_signal.h"
#include "tests/crash/rounds.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr uint32_t kPatience = 10000;  // ms; what only a missed signal waits for
constexpr int kWriters = 4, kWatchers = 4;

uint64_t valueIn(const WideString &parameters) {
    uint64_t number = 0;
    uint32_t size = sizeof number;
    ReadParameterValue(parameters, 0, 0, reinterpret_cast<uint8_t *>(&number), size, nullptr, nullptr);
    return number;
}

bool writeValue(const WideString &parameters, uint64_t number) {
    std::vector<uint8_t> data(sizeof number);
    std::memcpy(data.data(), &number, sizeof number);
    return WriteParameter(nullptr, parameters, 0, 0, -1, data, {}, false, nullptr);
}

// Writes each number that it is given, and says when the write has returned.
const test::Helper writer("write-numbers", [](const std::vector<std::string> &arguments) {
    const WideString parameters = toWide(arguments.at(0));
    char line[32];
    test::sayLine("ready");
    while (std::fgets(line, sizeof line, stdin) != nullptr) {
        if (!writeValue(parameters, std::stoull(line))) return 1;
        test::sayLine("written");
    }
    return 0;
});

// Says each new value: arms, reads, waits. What it finds although no signal came, it calls missed.
const test::Helper watcher("watch-values", [](const std::vector<std::string> &arguments) {
    const WideString parameters = toWide(arguments.at(0));
    RegistryKey root;
    ChangeSignal signal;
    if (RegistryKey::open(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::read, root) != status::ok) return 1;
    if (ChangeSignal::open(root, ChangeFilter::keysAndValues, signal) != status::ok) return 2;
    bool signalled = true;
    for (uint64_t last = UINT64_MAX;;) {
        if (signal.arm() != status::ok) return 3;
        if (const uint64_t number = valueIn(parameters); number != last) {
            if (!signalled) test::sayLine("missed");
            test::sayLine(std::to_string(last = number));
        }
        signalled = waitForOne(signal, kPatience) == WaitOutcome::signalled;
    }
});

// Reads what the watcher says until it is this value.
bool hears(test::Process &process, uint64_t value, int &missed) {
    while (const auto line = process.readLine()) {
        if (*line == "missed") {
            ++missed;
        } else if (std::stoull(*line) == value) {
            return true;
        }
    }
    return false;
}

}  // namespace

TEST_CASE_FIXTURE(test::StoreFixture, "four writers and four watchers with random kills: each watcher reads the last value last") {
    const auto seed = std::random_device()();
    INFO("seed ", seed);
    std::mt19937 random(seed);
    const auto drawn = [&random](int below) { return std::uniform_int_distribution(0, below - 1)(random); };
    REQUIRE(writeValue(parameters, 0));
    const auto startWriter = [&] {
        auto process = std::make_unique<test::Process>(test::startHelper("write-numbers", {toUtf8(parameters)}));
        REQUIRE(process->readLine() == "ready");
        return process;
    };
    const auto startWatcher = [&] {
        return std::make_unique<test::Process>(test::startHelper("watch-values", {toUtf8(parameters)}));
    };
    std::vector<std::unique_ptr<test::Process>> writers, watchers;
    for (int i = 0; i < kWriters; ++i) writers.push_back(startWriter());
    for (int i = 0; i < kWatchers; ++i) watchers.push_back(startWatcher());
    const int rounds = std::max(test::crashRounds() / 2, 10);
    int kills = 0, missed = 0, deaf = 0;
    uint64_t next = 1;
    for (auto &each : watchers) REQUIRE(hears(*each, 0, missed));
    uint64_t last = 0;
    for (int round = 0; round < rounds; ++round) {
        const int victim = drawn(10) == 0 ? drawn(kWriters) : -1;
        for (auto &each : writers) each->write(std::to_string(next++) + "\n");
        if (drawn(20) == 0) {
            const auto index = static_cast<size_t>(drawn(kWatchers));
            watchers[index]->kill();
            watchers[index] = startWatcher();
            ++kills;
        }
        for (int i = 0; i < kWriters; ++i) {
            std::unique_ptr<test::Process> &each = writers[static_cast<size_t>(i)];
            if (i != victim) {
                REQUIRE(each->readLine() == "written");
                continue;
            }
            std::this_thread::sleep_for(std::chrono::microseconds(drawn(300)));
            each->kill();
            each = startWriter();
            ++kills;
        }
        const uint64_t now = valueIn(parameters);
        if (now == last) continue;  // the only write that could have changed it did not happen
        last = now;
        for (auto &each : watchers) {
            if (!hears(*each, last, missed)) ++deaf;
        }
    }
    CHECK(missed == 0);
    CHECK(deaf == 0);
    MESSAGE(rounds << " rounds, " << next - 1 << " writes, " << kills << " kills, " << missed << " signals missed");
}

TEST_CASE_FIXTURE(test::StoreFixture, "a write between arming, reading and waiting is never missed, in every interleaving") {
    // Two turns of a watcher, and three writes of another process anywhere between its steps.
    constexpr int kSteps = 6, kGaps = kSteps + 1;
    RegistryKey root = open(kStoreRoot);
    test::Process other = test::startHelper("write-numbers", {toUtf8(parameters)});
    REQUIRE(other.readLine() == "ready");
    uint64_t current = 0;
    int interleavings = 0, missed = 0, heard = 0;
    for (int first = 0; first < kGaps; ++first) {
        for (int second = first; second < kGaps; ++second) {
            for (int third = second; third < kGaps; ++third) {
                ChangeSignal signal;
                REQUIRE(ChangeSignal::open(root, ChangeFilter::keysAndValues, signal) == status::ok);
                const auto writes = [&](int gap) {
                    for (const int at : {first, second, third}) {
                        if (at != gap) continue;
                        other.write(std::to_string(++current) + "\n");
                        REQUIRE(other.readLine() == "written");
                    }
                };
                enum Step : uint8_t { arm, read, wait } next = arm;
                uint64_t seen = 0;
                // One step; false if it is a wait that would go on.
                const auto step = [&] {
                    switch (next) {
                        case arm:
                            REQUIRE(signal.arm() == status::ok);
                            next = read;
                            return true;
                        case read:
                            seen = valueIn(parameters);
                            next = wait;
                            return true;
                        case wait:
                            break;
                    }
                    if (waitForOne(signal, 0) != WaitOutcome::signalled) return false;
                    ++heard;
                    next = arm;
                    return true;
                };
                for (int i = 0; i < kSteps; ++i) {
                    writes(i);
                    // Who would sleep now has read the last value.
                    if (!step() && seen != current) ++missed;
                }
                writes(kSteps);
                while (step()) {
                }
                if (seen != current) ++missed;
                ++interleavings;
            }
        }
    }
    CHECK(missed == 0);
    CHECK(heard > 0);
    MESSAGE(interleavings << " interleavings, " << missed << " writes missed");
}
