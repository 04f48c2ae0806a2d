// SPDX-License-Identifier: MIT
#include "platform/change_signal.h"

#include <doctest/doctest.h>

#include <chrono>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "tests/platform/registry_fixture.h"
#include "tests/platform/rounds.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr uint32_t kLong = 20000;  // ms; what only a failure waits for
constexpr uint32_t kShort = 30;    // ms; long enough for a signal that must not come
constexpr auto kRoot = test::RegistryFixture::kRoot;
constexpr auto kName = VX_TEXT("number");

uint32_t numberIn(const RegistryKey &key) {
    uint32_t number = 0;
    key.readU32(kName, number);
    return number;
}

// Writes each number that it is given into the key, and says when the write has returned. Without numbers counts for ever.
const test::Helper writer("write-numbers", [](const std::vector<std::string> &arguments) {
    RegistryKey key;
    if (RegistryKey::create(kRoot, toWide(arguments.at(0)), RegistryAccess::readWrite, key) != status::ok) return 1;
    if (arguments.size() > 1) {
        const auto first = static_cast<uint32_t>(std::stoul(arguments[1]));
        for (uint32_t number = first;; ++number) {
            if (key.setU32(kName, number) != status::ok) return 2;
            if (number == first) test::sayLine("writing");
        }
    }
    char line[32];
    test::sayLine("ready");
    while (std::fgets(line, sizeof line, stdin) != nullptr) {
        if (key.setU32(kName, static_cast<uint32_t>(std::stoul(line))) != status::ok) return 3;
        test::sayLine("written");
    }
    return 0;
});

// Says each new number that it finds in the key, waiting for as long as there is none.
const test::Helper watcher("watch-number", [](const std::vector<std::string> &arguments) {
    RegistryKey key, above;
    ChangeSignal signal;
    if (RegistryKey::open(kRoot, toWide(arguments.at(0)), RegistryAccess::read, above) != status::ok) return 1;
    if (above.openBelow(toWide(arguments.at(1)), RegistryAccess::read, key) != status::ok) return 2;
    if (ChangeSignal::open(above, ChangeFilter::values, signal) != status::ok) return 3;
    for (uint32_t last = 0;;) {
        if (signal.arm() != status::ok) return 4;
        if (const uint32_t number = numberIn(key); number != last) test::sayLine(std::to_string(last = number));
        if (waitForOne(signal, kForever) != WaitOutcome::signalled) return 5;
    }
});

struct Watch : test::RegistryFixture {
    ChangeSignal signal;

    Watch() { REQUIRE(ChangeSignal::open(key, ChangeFilter::values, signal) == status::ok); }
    bool signalled(uint32_t milliseconds = kLong) const { return waitForOne(signal, milliseconds) == WaitOutcome::signalled; }
};

// A writer in another process.
struct Writer {
    test::Process process;

    explicit Writer(const WideString &path) : process(test::startHelper("write-numbers", {toUtf8(path)})) {
        REQUIRE(process.readLine().value_or("") == "ready");
    }
    void write(uint32_t number) {
        process.write(std::to_string(number) + "\n");
        REQUIRE(process.readLine().value_or("") == "written");
    }
};

}  // namespace

TEST_CASE_FIXTURE(Watch, "what is not armed is not signalled, and one arming is signalled once for many writes") {
    CHECK(key.setU32(kName, 1) == status::ok);
    CHECK_FALSE(signalled(kShort));
    CHECK(signal.arm() == status::ok);
    CHECK_FALSE(signalled(0));
    for (uint32_t i = 2; i < 12; ++i) CHECK(key.setU32(kName, i) == status::ok);
    CHECK(signalled());
    CHECK_FALSE(signalled(0));
    CHECK(key.setU32(kName, 20) == status::ok);
    CHECK_FALSE(signalled(kShort));
    CHECK(signal.arm() == status::ok);
    CHECK_FALSE(signalled(kShort));
    CHECK(key.setU32(kName, 21) == status::ok);
    CHECK(signalled());
}

TEST_CASE_FIXTURE(Watch, "arming again forgets what signalled before") {
    CHECK(signal.arm() == status::ok);
    CHECK(key.setU32(kName, 1) == status::ok);
    CHECK(signal.arm() == status::ok);
    CHECK_FALSE(signalled(kShort));
    CHECK(key.setU32(kName, 2) == status::ok);
    CHECK(signalled());
}

TEST_CASE_FIXTURE(Watch, "values written and deleted at any depth below signal, those beside and above do not") {
    RegistryKey deep, watched, beside;
    REQUIRE(key.createBelow(VX_TEXT("watched\\a\\b\\c"), RegistryAccess::readWrite, deep) == status::ok);
    REQUIRE(key.createBelow(VX_TEXT("beside"), RegistryAccess::readWrite, beside) == status::ok);
    REQUIRE(key.openBelow(VX_TEXT("Watched"), RegistryAccess::read, watched) == status::ok);
    REQUIRE(ChangeSignal::open(watched, ChangeFilter::values, signal) == status::ok);
    CHECK(signal.arm() == status::ok);
    CHECK(beside.setU32(kName, 1) == status::ok);
    CHECK(key.setU32(kName, 1) == status::ok);
    CHECK_FALSE(signalled(kShort));
    CHECK(deep.setU32(kName, 1) == status::ok);
    CHECK(signalled());
    CHECK(signal.arm() == status::ok);
    CHECK(deep.deleteValue(kName) == status::ok);
    CHECK(signalled());
}

TEST_CASE_FIXTURE(Watch, "keys made and deleted signal those alone who asked for keys") {
    ChangeSignal both;
    REQUIRE(ChangeSignal::open(key, ChangeFilter::keysAndValues, both) == status::ok);
    const auto check = [&](const char *what, bool valuesToo) {
        INFO(what);
        CHECK(waitForOne(both, kLong) == WaitOutcome::signalled);
        CHECK(signalled(valuesToo ? kLong : kShort) == valuesToo);
        CHECK(both.arm() == status::ok);
        CHECK(signal.arm() == status::ok);
    };
    RegistryKey below;
    CHECK(both.arm() == status::ok);
    CHECK(signal.arm() == status::ok);
    CHECK(key.createBelow(VX_TEXT("a\\b"), RegistryAccess::readWrite, below) == status::ok);
    check("made", false);
    CHECK(below.setU32(kName, 1) == status::ok);
    check("value", true);
    below.close();
    CHECK(key.deleteBelow(VX_TEXT("a\\b")) == status::ok);
    check("deleted", false);
    CHECK(key.createBelow(VX_TEXT("a"), RegistryAccess::readWrite, below) == status::ok);
    below.close();
    CHECK(waitForOne(both, kShort) == WaitOutcome::timedOut);
}

TEST_CASE_FIXTURE(Watch, "who watches a key that is deleted cannot arm again") {
    RegistryKey below;
    REQUIRE(key.createBelow(VX_TEXT("a\\b"), RegistryAccess::readWrite, below) == status::ok);
    REQUIRE(ChangeSignal::open(below, ChangeFilter::keysAndValues, signal) == status::ok);
    CHECK(signal.arm() == status::ok);
    below.close();
    CHECK(key.deleteTreeBelow(VX_TEXT("a")) == status::ok);
    CHECK(signal.arm() == status::keyDeleted);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "a key that was opened without the right to read, or none, cannot be watched") {
    ChangeSignal signal;
    CHECK_FALSE(signal);
    CHECK(signal.arm() == status::invalidHandle);
    CHECK(ChangeSignal::open(RegistryKey(), ChangeFilter::values, signal) == status::invalidHandle);
}

TEST_CASE_FIXTURE(Watch, "a signal is waited for together with events, and other signals") {
    RegistryKey other;
    ChangeSignal second;
    REQUIRE(key.createBelow(VX_TEXT("other"), RegistryAccess::readWrite, other) == status::ok);
    REQUIRE(ChangeSignal::open(other, ChangeFilter::values, second) == status::ok);
    Event cancel(EventReset::automatic);
    CHECK(signal.arm() == status::ok);
    CHECK(second.arm() == status::ok);
    CHECK(waitForAny({&signal, &cancel, &second}, kShort).outcome == WaitOutcome::timedOut);
    std::thread canceller([&] { cancel.set(); });
    WaitAnswer answer = waitForAny({&second, &signal, &cancel}, kLong);
    canceller.join();
    CHECK(answer.outcome == WaitOutcome::signalled);
    CHECK(answer.index == 2);
    Writer writer(path);
    std::thread writing([&] { writer.write(7); });
    answer = waitForAny({&cancel, &second, &signal}, kLong);
    writing.join();
    CHECK(answer.outcome == WaitOutcome::signalled);
    CHECK(answer.index == 2);
    CHECK(numberIn(key) == 7);
    CHECK(signal.arm() == status::ok);
    CHECK(other.setU32(kName, 1) == status::ok);
    answer = waitForAny({&cancel, &second}, kLong);
    CHECK(answer.index == 1);
}

// The reader arms, reads and waits; another process writes at each point of that. Wherever it writes, the reader ends up with the
// new number and never waits in vain.
TEST_CASE_FIXTURE(Watch,
                  "a write before the arming, between arming and reading, between reading and waiting, and while waiting is seen") {
    Writer writer(path);
    enum Point { beforeArming, beforeReading, beforeWaiting, whileWaiting };
    uint32_t written = 0;
    for (int round = 0; round < (test::kDearProcesses ? 20 : 100); ++round) {
        for (const Point point : {beforeArming, beforeReading, beforeWaiting, whileWaiting}) {
            INFO("round ", round, ", point ", static_cast<int>(point));
            ++written;
            if (point == beforeArming) writer.write(written);
            REQUIRE(signal.arm() == status::ok);
            if (point == beforeReading) writer.write(written);
            const uint32_t read = numberIn(key);
            if (point == beforeWaiting) writer.write(written);
            std::thread late;
            if (point == whileWaiting) late = std::thread([&] { writer.write(written); });
            if (read != written) {
                CHECK(signalled());
                CHECK(numberIn(key) == written);
            }
            if (late.joinable()) late.join();
            CHECK((read == written) == (point == beforeArming || point == beforeReading));
        }
    }
}

TEST_CASE_FIXTURE(Watch,
                  "writers that are killed at any moment leave no watcher behind: the last number read is the last written") {
    constexpr int kWatchers = 4, kWriters = 4;
    const int rounds = test::kDearProcesses ? 10 : test::kKillRounds / 4;
    const auto seed = std::random_device()();
    INFO("seed ", seed);
    std::mt19937 random(seed);
    RegistryKey below;
    REQUIRE(key.createBelow(VX_TEXT("deep\\down"), RegistryAccess::readWrite, below) == status::ok);
    const std::string target = toUtf8(path + VX_TEXT("\\deep\\down"));
    struct Watcher {
        std::unique_ptr<test::Process> process;
        std::string last;  // what it said last
    };
    std::vector<Watcher> watchers(kWatchers);
    const auto start = [&](Watcher &watcher) {
        watcher.process = std::make_unique<test::Process>(test::startHelper("watch-number", {toUtf8(path), "deep\\down"}));
        watcher.last.clear();
    };
    for (Watcher &watcher : watchers) start(watcher);

    int behind = 0;
    uint32_t next = 1;
    for (int round = 0; round < rounds; ++round) {
        std::vector<test::Process> writers;
        for (int i = 0; i < kWriters; ++i, next += 1000000) {
            writers.push_back(test::startHelper("write-numbers", {target, std::to_string(next)}));
        }
        // In every second round a writer has written by then, however slowly processes start.
        if (round % 2 == 0) REQUIRE(writers.front().readLine().value_or("") == "writing");
        std::this_thread::sleep_for(
            std::chrono::microseconds(std::uniform_int_distribution(0, test::kDearProcesses ? 300000 : 8000)(random)));
        // A watcher that is killed takes nobody's news away.
        if (round % 5 == 0) start(watchers.front());
        for (test::Process &writer : writers) writer.kill();
        const std::string last = std::to_string(numberIn(below));
        if (last == "0") continue;  // killed before their first write
        for (Watcher &watcher : watchers) {
            // A watcher that was left behind never says the last number, and this would not end.
            while (watcher.last != last) {
                const auto line = watcher.process->readLine();
                if (!line) break;
                watcher.last = *line;
            }
            behind += watcher.last != last ? 1 : 0;
        }
    }
    CHECK(behind == 0);
    CHECK(numberIn(below) != 0);
    MESSAGE(rounds << " rounds of " << kWriters << " writers killed under " << kWatchers << " watchers, " << behind
                   << " left behind");
}
