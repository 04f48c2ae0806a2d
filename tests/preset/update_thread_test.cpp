// SPDX-License-Identifier: MIT
//
// The push path as a host uses it, with writers, sync mutexes and clients in other processes.
#include "preset/update_thread.h"

#include <doctest/doctest.h>

#include <chrono>

#include "tests/preset/walk_host.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using test::Delivered;

namespace {

using List = std::vector<Delivered>;

struct Push : test::SlotKeys {
    test::WalkHost host{*this};
    test::TaggedLog log{host};
    WideString sync = syncMutexName(configuration);

    CUpdateFromRegistryThread::Owned start(bool isClient = false, bool hardwareOnly = false) {
        CUpdateFromRegistryThread::Owned thread = CUpdateFromRegistryThread::start(host, isClient, hardwareOnly);
        REQUIRE(thread);
        return thread;
    }
    bool gets(const Delivered &wanted, size_t first = 0) {
        return host.waitFor(
            [&](const test::Poll &poll) {
                const List list = test::deliveredIn(poll.changes);
                return std::find(list.begin(), list.end(), wanted) != list.end();
            },
            first);
    }
};

// Writes parameters 1 to N of component 0, each with its number as data, below the key that it is given, and says when all is done.
// With a further argument it goes on until it is killed, saying each number that has been written.
const test::Helper writer("write-parameters", [](const std::vector<std::string> &arguments) {
    const int count = std::stoi(arguments.at(1));
    for (int round = 0;; ++round) {
        for (int param = 1; param <= count; ++param) {
            const auto data = static_cast<uint8_t>(round == 0 ? param : round);
            if (!WriteParameter(nullptr, toWide(arguments[0]), 0, param, -1, {&data, 1}, {}, false, nullptr)) return 1;
        }
        test::sayLine(std::to_string(round));
        if (arguments.size() == 2) return 0;
    }
});

// Holds a mutex, as the side that runs effects does, until its input ends.
const test::Helper holder("hold-mutex", [](const std::vector<std::string> &arguments) {
    NamedMutex mutex;
    if (NamedMutex::create(toWide(arguments.at(0)), mutex) != status::ok) return 1;
    test::sayLine("holds");
    while (std::getchar() != EOF) {
    }
    return 0;
});

// A client of the slot that writes a value of its own for parameter 3 of component 0, and lives until it is killed.
const test::Helper client("transient-client", [](const std::vector<std::string> &arguments) {
    const CInstanceIDBase self;
    const WideString nothing;
    if (SetRegString(toWide(arguments.at(0)), self.InstanceId, &nothing) != status::ok) return 1;
    const uint8_t data[] = {7, 7};
    if (!WriteParameter(nullptr, toWide(arguments.at(1)), 0, 3, -1, data, {self.InstanceGuid, self.InstanceId}, true, nullptr))
        return 2;
    test::sayLine(toUtf8(self.InstanceId));
    while (std::getchar() != EOF) {
    }
    return 0;
});

}  // namespace

TEST_CASE_FIXTURE(Push, "a thread that was started misses no write, and one that was stopped walks no more") {
    for (uint8_t round = 1; round <= 20; ++round) {
        const size_t before = host.pollCount();
        REQUIRE(host.StartUpdateThread(false, false));
        write(2, 5, {round});
        CHECK(gets({2, 5, {round}}, before));
        host.StopUpdateThread();
        const size_t behind = host.pollCount();
        write(2, 5, {0});
        CHECK(host.pollCount() == behind);
    }
    CHECK(host.polls.front().wokenByRegistry);
    CHECK(host.configurationPolls.size() == host.polls.size());
    CHECK(host.rootWasOpen);
}

TEST_CASE_FIXTURE(Push, "starting and stopping is told in order") {
    start().reset();
    const std::vector<std::string> expected = {"Creating parameter polling thread (suspended)...",
                                               "Parameter polling thread has been created. Starting it up...",
                                               "Helper window thread has been created. Starting it up...",
                                               "Done.",
                                               "Exiting helper window thread...",
                                               "Done.",
                                               "Exiting parameter polling thread...",
                                               "Done."};
    std::vector<std::string> mine;
    for (const std::string &text : log.texts()) {
        if (std::find(expected.begin(), expected.end(), text) != expected.end()) mine.push_back(text);
    }
    CHECK(mine == expected);
    CHECK(log.count("{ CUpdateFromRegistryThread::ThreadFunc()") == 1);
    CHECK(log.count("{ CUpdateFromRegistryThread::HelperWndThreadFunc()") == 1);
    CHECK(log.count("Listening to changes at 'HKLM\\Software\\Ondrevale\\APO' ...") == 1);
    CHECK(log.count("Received 'Quit' event, exiting the thread ...") == 1);
}

TEST_CASE_FIXTURE(Push, "ten writes within a millisecond cause a single walk") {
    const auto thread = start();
    using Clock = std::chrono::steady_clock;
    bool seen = false;
    for (uint8_t attempt = 1; attempt < 200 && !seen; ++attempt) {
        const size_t before = host.pollCount();
        const auto begin = Clock::now();
        for (int32_t param = 1; param <= 10; ++param) write(0, param, {attempt});
        const bool withinOne = Clock::now() - begin < std::chrono::milliseconds(1);
        REQUIRE(gets({0, 10, {attempt}}, before));
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
        seen = host.pollCount() == before + 1 && host.seen().back().changes.size() == 10;
        // Where writes take longer, some ten of them may come in two walks, but not all.
        if (withinOne) CHECK(seen);
    }
    CHECK(seen);
}

TEST_CASE_FIXTURE(Push, "what another process writes is delivered, and the values of one that is killed as far as it came") {
    const auto thread = start();
    test::Process other = test::startHelper("write-parameters", {toUtf8(parameters), "20"});
    for (uint8_t param = 1; param <= 20; ++param) CHECK(gets({0, param, {param}}));
    CHECK(other.wait() == 0);

    test::Process endless = test::startHelper("write-parameters", {toUtf8(parameters), "3", "on"});
    for (int line = 0; line < 4; ++line) REQUIRE(endless.readLine());
    endless.kill();
    // Behind its last write comes the walk that finds what the store holds.
    const size_t before = host.pollCount();
    write(9, 9, {9});
    REQUIRE(gets({9, 9, {9}}, before));
    uint8_t held[3];
    for (int32_t param = 1; param <= 3; ++param) {
        uint32_t size = 1;
        REQUIRE(ReadParameterValue(parameters, 0, param, &held[param - 1], size, nullptr, nullptr) == status::ok);
    }
    std::map<int32_t, uint8_t> last;
    for (const test::Poll &poll : host.seen()) {
        for (const auto &[key, change] : poll.changes) {
            if (key.componentId == 0 && key.paramId > 0) last[key.paramId] = change.data->at(0);
        }
    }
    for (int32_t param = 1; param <= 3; ++param) CHECK(last[param] == held[param - 1]);
}

TEST_CASE_FIXTURE(Push, "before a sleep the engine is asked to clean its buffers") {
    const auto thread = start();
    thread->injectPowerEvent(PowerEvent::suspend);
    CHECK(gets({-1, -33, {1}}));
    CHECK(log.count("Received PBT_APMSUSPEND event") == 1);
    CHECK(log.count("{ HelperWndProc()") == 1);
    CHECK_FALSE(log.has("Received PBT_APMRESUMEAUTOMATIC event"));
}

TEST_CASE_FIXTURE(Push, "behind a sleep every stored parameter is delivered, and cleaning the buffers comes first") {
    const test::SlotClient own(*this);
    write(3, 4, {3});
    write(5, 144, {5});
    write(0, -6, {1});
    writeFrom(own.source(), 3, 4, {9, 9}, true);
    const auto thread = start();
    thread->injectPowerEvent(PowerEvent::resume);
    const auto isWhole = [](const test::Poll &poll) { return poll.changes.size() >= 4; };
    REQUIRE(host.waitFor(isWhole));
    // Once more: now all of it has been delivered before.
    REQUIRE(gets({-1, -33, {1}}));
    const size_t before = host.pollCount();
    thread->injectPowerEvent(PowerEvent::resume);
    REQUIRE(host.waitFor(isWhole, before));
    REQUIRE(gets({-1, -33, {1}}, before));
    const std::vector<test::Poll> polls = host.seen();
    const auto whole = std::find_if(polls.begin() + static_cast<std::ptrdiff_t>(before), polls.end(), isWhole);
    // The reset may be met by a walk that the registry woke; the one that the helper asked for comes all the same.
    CHECK(host.waitFor([](const test::Poll &poll) { return !poll.wokenByRegistry; }, before));
    List list = test::deliveredIn(whole->changes);
    if (list.size() == 5) {  // the command was written before the walk
        CHECK(list.front() == Delivered{-1, -33, {1}});
        list.erase(list.begin());
    }
    CHECK(list == List{{0, -6, {1}}, {5, 144, {5}}, {3, 4, {3}}, {3, 4, {9, 9}, true}});
    CHECK_FALSE(holds("-1", "Data", "-33"));
    CHECK(log.count("Received PBT_APMRESUMEAUTOMATIC event") == 2);
}

TEST_CASE_FIXTURE(Push, "the side that runs effects holds the sync mutex for as long as it listens, an observer doesn't") {
    CHECK_FALSE(NamedMutex::exists(sync));
    {
        const auto thread = start(false);
        CHECK(NamedMutex::exists(sync));
    }
    CHECK_FALSE(NamedMutex::exists(sync));
    const auto thread = start(true);
    CHECK_FALSE(NamedMutex::exists(sync));
}

TEST_CASE_FIXTURE(Push, "a hardware-only observer leaves the walks to a running APO, and walks when that was killed") {
    test::Process apo = test::startHelper("hold-mutex", {toUtf8(sync)});
    REQUIRE(apo.readLine() == "holds");
    const auto thread = start(true, true);
    write(0, 1, {1});
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    CHECK(host.pollCount() == 0);
    apo.kill();
    apo.wait();
    write(0, 2, {2});
    CHECK(gets({0, 2, {2}}));
    CHECK(gets({0, 1, {1}}));
    CHECK(log.has("Mutex with name '" + toUtf8(sync) +
                  "' hasn't been created by APO or unaccessible (return code = 2), assume APO is not running."));
}

TEST_CASE_FIXTURE(Push, "an observer of another kind walks beside a running APO") {
    NamedMutex apo;
    REQUIRE(NamedMutex::create(sync, apo) == status::ok);
    const auto thread = start(true, false);
    write(0, 1, {1});
    CHECK(gets({0, 1, {1}}));
    CHECK_FALSE(log.has("hasn't been created by APO"));
}

TEST_CASE_FIXTURE(Push, "a killed client's own value lapses at the next walk, and the shared one is delivered again") {
    const auto thread = start();
    write(0, 3, {3});
    REQUIRE(gets({0, 3, {3}}));
    test::Process other = test::startHelper("transient-client", {toUtf8(clients), toUtf8(parameters)});
    const auto id = other.readLine();
    REQUIRE(id);
    REQUIRE(gets({0, 3, {7, 7}, true}));
    CHECK(holds("0", "Data", "3," + *id));
    other.kill();
    other.wait();
    const size_t before = host.pollCount();
    write(1, 1, {1});
    CHECK(gets({0, 3, {3}}, before));
    CHECK_FALSE(holds("0", "Data", "3," + *id));
}

TEST_CASE_FIXTURE(Push, "a stream of writes that never pauses is walked, and ends when the thread is told to") {
    auto thread = start();
    test::Process endless = test::startHelper("write-parameters", {toUtf8(parameters), "3", "on"});
    CHECK(host.waitFor([](const test::Poll &poll) { return !poll.changes.empty(); }));
    thread.reset();
    CHECK(log.count("Received 'Quit' event, exiting the thread ...") == 1);
    endless.kill();
}

TEST_CASE_FIXTURE(Push, "a hook that throws ends no thread, and what it missed is delivered by the next walk") {
    struct Throwing final : test::WalkHost {
        using WalkHost::WalkHost;
        std::atomic<bool> throws{true};
        std::atomic<int> thrown{0};
        void OnParametersPolled(bool wokenByRegistry) override {
            if (throws) {
                ++thrown;
                throw std::bad_alloc();
            }
            WalkHost::OnParametersPolled(wokenByRegistry);
        }
    } fussy(*this);
    const auto thread = CUpdateFromRegistryThread::start(fussy, false, false);
    REQUIRE(thread);
    write(0, 1, {1});
    while (fussy.thrown == 0) std::this_thread::sleep_for(std::chrono::milliseconds(1));
    fussy.throws = false;
    write(0, 2, {2});
    CHECK(fussy.waitFor([](const test::Poll &poll) { return test::deliveredIn(poll.changes) == List{{0, 1, {1}}, {0, 2, {2}}}; }));
}
