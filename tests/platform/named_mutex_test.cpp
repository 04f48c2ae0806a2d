// SPDX-License-Identifier: MIT
#include "platform/named_mutex.h"

#include <doctest/doctest.h>

#include <atomic>
#include <thread>
#include <vector>

#include "platform/event.h"
#include "platform/guid.h"
#include "platform/registry.h"
#include "tests/platform/registry_fixture.h"
#include "tests/platform/rounds.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr uint32_t kLong = 20000;  // ms; what only a failure waits for

WideString freshName() {
    GUID guid;
    REQUIRE(newGuid(guid));
    return VX_TEXT("Global\\") + guidText(guid);
}

// Holds the mutex named by the first argument, and owns it if the second says so. Ends when its input ends.
const test::Helper holder("hold-mutex", [](const std::vector<std::string> &arguments) {
    NamedMutex mutex;
    if (NamedMutex::create(toWide(arguments.at(0)), mutex) != status::ok) return 1;
    if (arguments.at(1) == "own" && mutex.acquire(kLong) == MutexWait::failed) return 2;
    test::sayLine("ready");
    while (std::getchar() != EOF) {
    }
    if (arguments.at(1) == "own" && mutex.release() != status::ok) return 3;
    return 0;
});

// Adds 1 to a value of the registry, many times, each under the mutex.
const test::Helper counter("count-under-mutex", [](const std::vector<std::string> &arguments) {
    NamedMutex mutex;
    RegistryKey key;
    if (NamedMutex::create(toWide(arguments.at(0)), mutex) != status::ok) return 1;
    if (RegistryKey::open(test::RegistryFixture::kRoot, toWide(arguments.at(1)), RegistryAccess::readWrite, key) != status::ok)
        return 2;
    for (int i = 0; i < std::atoi(arguments.at(2).c_str()); ++i) {
        const MutexLock lock(mutex, kLong);
        uint32_t count = 0;
        if (!lock.owns()) return 3;
        if (key.readU32(VX_TEXT("count"), count) != RegistryRead::value) return 4;
        if (key.setU32(VX_TEXT("count"), count + 1) != status::ok) return 5;
    }
    return 0;
});

test::Process startHolder(const WideString &name, const char *how) {
    test::Process process = test::startHelper("hold-mutex", {toUtf8(name), how});
    REQUIRE(process.readLine().value_or("") == "ready");
    return process;
}

}  // namespace

TEST_CASE("a mutex exists as long as somebody holds it") {
    const WideString name = freshName();
    CHECK_FALSE(NamedMutex::exists(name));
    NamedMutex first, second, opened;
    CHECK(NamedMutex::open(name, opened) == status::fileNotFound);
    CHECK_FALSE(opened);
    bool created = false;
    CHECK(NamedMutex::create(name, first, MutexOwner::none, &created) == status::ok);
    CHECK(created);
    CHECK(NamedMutex::create(name, second, MutexOwner::none, &created) == status::ok);
    CHECK_FALSE(created);
    CHECK(NamedMutex::open(name, opened) == status::ok);
    CHECK(opened);
    first.close();
    second.close();
    CHECK(NamedMutex::exists(name));
    opened.close();
    CHECK_FALSE(NamedMutex::exists(name));
    CHECK(NamedMutex::create(name, first, MutexOwner::none, &created) == status::ok);
    CHECK(created);
}

TEST_CASE("names compare exactly, and only the prefix may hold a backslash") {
    const WideString name = freshName();
    NamedMutex mutex, other;
    REQUIRE(NamedMutex::create(name + VX_TEXT("a"), mutex) == status::ok);
    CHECK_FALSE(NamedMutex::exists(name + VX_TEXT("A")));
    CHECK_FALSE(NamedMutex::exists(name));
    CHECK(NamedMutex::exists(name + VX_TEXT("a")));
    CHECK(NamedMutex::create(name + VX_TEXT("\\b"), other) == status::pathNotFound);
    CHECK(NamedMutex::create({}, other) == status::invalidParameter);
    CHECK_FALSE(other);
    CHECK_FALSE(NamedMutex::exists({}));
}

TEST_CASE("names with any character, and long ones, are told apart") {
    const WideString base = freshName();
    const WideString longName = base + WideString(150, VXWCHAR{'x'});
    const std::vector<WideString> names = {base + VX_TEXT(" /:*?%."), base + VX_TEXT("_/:*?%."), base + VX_TEXT("\u00e4\u4e2d"),
                                           longName + VX_TEXT("1"), longName + VX_TEXT("2")};
    std::vector<NamedMutex> mutexes(names.size());
    for (size_t i = 0; i < names.size(); ++i) {
        bool created = false;
        CHECK(NamedMutex::create(names[i], mutexes[i], MutexOwner::none, &created) == status::ok);
        CHECK(created);
    }
    for (size_t i = 0; i < names.size(); ++i) {
        mutexes[i].close();
        CHECK_FALSE(NamedMutex::exists(names[i]));
    }
}

TEST_CASE("a mutex exists for other processes and vanishes when its only holder is killed") {
    const WideString name = freshName();
    for (int round = 0; round < test::kKillRounds / 10; ++round) {
        test::Process process = startHolder(name, round % 2 != 0 ? "own" : "hold");
        CHECK(NamedMutex::exists(name));
        NamedMutex opened;
        CHECK(NamedMutex::open(name, opened) == status::ok);
        opened.close();
        process.kill();
        CHECK_FALSE(NamedMutex::exists(name));
        CHECK(NamedMutex::open(name, opened) == status::fileNotFound);
    }
}

TEST_CASE("an owner that is killed is reported as abandoned to the next owner, once") {
    const WideString name = freshName();
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(name, mutex) == status::ok);
    for (int round = 0; round < test::kKillRounds / 20; ++round) {
        test::Process process = startHolder(name, "own");
        CHECK(mutex.acquire(0) == MutexWait::timedOut);
        CHECK(mutex.acquire(5) == MutexWait::timedOut);
        MutexWait outcome = MutexWait::failed;
        std::thread waiter([&] {
            outcome = mutex.acquire(kLong);
            mutex.release();
        });
        process.kill();
        waiter.join();
        CHECK(outcome == MutexWait::abandoned);
        CHECK(mutex.acquire(0) == MutexWait::acquired);
        CHECK(mutex.release() == status::ok);
    }
}

TEST_CASE("an owner that releases hands over to one that waits") {
    const WideString name = freshName();
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(name, mutex) == status::ok);
    test::Process process = startHolder(name, "own");
    MutexWait outcome = MutexWait::failed;
    std::thread waiter([&] {
        outcome = mutex.acquire(kLong);
        mutex.release();
    });
    process.closeInput();
    waiter.join();
    CHECK(outcome == MutexWait::acquired);
    CHECK(process.wait() == 0);
}

TEST_CASE("an owner killed behind a new owner's back is not reported: only who held it last counts") {
    const WideString name = freshName();
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(name, mutex) == status::ok);
    test::Process process = startHolder(name, "hold");
    CHECK(mutex.acquire(0) == MutexWait::acquired);
    process.kill();
    CHECK(mutex.release() == status::ok);
    CHECK(mutex.acquire(0) == MutexWait::acquired);
    CHECK(mutex.release() == status::ok);
}

TEST_CASE("a thread owns a mutex as often as it acquires it, through any handle, and others wait for the last release") {
    const WideString name = freshName();
    NamedMutex mutex, same;
    REQUIRE(NamedMutex::create(name, mutex) == status::ok);
    REQUIRE(NamedMutex::open(name, same) == status::ok);
    CHECK(mutex.acquire(kForever) == MutexWait::acquired);
    CHECK(same.acquire(0) == MutexWait::acquired);
    const auto tryElsewhere = [&] {
        MutexWait outcome = MutexWait::failed;
        std::thread([&] {
            outcome = same.acquire(0);
            if (outcome == MutexWait::acquired) same.release();
        }).join();
        return outcome;
    };
    CHECK(tryElsewhere() == MutexWait::timedOut);
    CHECK(mutex.release() == status::ok);
    CHECK(tryElsewhere() == MutexWait::timedOut);
    CHECK(same.release() == status::ok);
    CHECK(tryElsewhere() == MutexWait::acquired);
    CHECK(mutex.release() == status::notOwner);
}

TEST_CASE("a thread that is not the owner cannot release") {
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(freshName(), mutex) == status::ok);
    REQUIRE(mutex.acquire(0) == MutexWait::acquired);
    Status refused = status::ok;
    std::thread([&] { refused = mutex.release(); }).join();
    CHECK(refused == status::notOwner);
    CHECK(mutex.release() == status::ok);
}

TEST_CASE("a thread that ends as owner abandons") {
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(freshName(), mutex) == status::ok);
    std::thread([&] { CHECK(mutex.acquire(0) == MutexWait::acquired); }).join();
    CHECK(mutex.acquire(kLong) == MutexWait::abandoned);
    CHECK(mutex.release() == status::ok);
    CHECK(mutex.acquire(kLong) == MutexWait::acquired);
    CHECK(mutex.release() == status::ok);
}

TEST_CASE("the maker of a new mutex may own it from the beginning, the opener of an old one does not") {
    const WideString name = freshName();
    NamedMutex mutex, second;
    bool created = false;
    REQUIRE(NamedMutex::create(name, mutex, MutexOwner::caller, &created) == status::ok);
    CHECK(created);
    std::thread([&] {
        CHECK(NamedMutex::create(name, second, MutexOwner::caller, &created) == status::ok);
        CHECK_FALSE(created);
        CHECK(second.acquire(0) == MutexWait::timedOut);
        CHECK(second.release() == status::notOwner);
    }).join();
    CHECK(mutex.release() == status::ok);
    CHECK(mutex.release() == status::notOwner);
}

TEST_CASE("an empty mutex object fails") {
    NamedMutex none;
    CHECK_FALSE(none);
    CHECK(none.acquire(0) == MutexWait::failed);
    CHECK(none.release() == status::invalidHandle);
    const MutexLock lock(none, 0);
    CHECK_FALSE(lock.owns());
    CHECK(lock.outcome() == MutexWait::failed);
}

TEST_CASE("threads of one process exclude each other") {
    constexpr int kThreads = 4, kTimes = 500;
    NamedMutex mutex;
    REQUIRE(NamedMutex::create(freshName(), mutex) == status::ok);
    int count = 0;
    std::atomic<int> failures{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([&] {
            for (int i = 0; i < kTimes; ++i) {
                const MutexLock lock(mutex, kLong);
                if (lock.outcome() != MutexWait::acquired) ++failures;
                ++count;
            }
        });
    }
    for (std::thread &thread : threads) thread.join();
    CHECK(failures == 0);
    CHECK(count == kThreads * kTimes);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "processes exclude each other: no count is lost") {
    const WideString name = freshName();
    const int times = test::kManyWrites;
    REQUIRE(key.setU32(VX_TEXT("count"), 0) == status::ok);
    std::vector<test::Process> processes;
    for (int i = 0; i < 3; ++i) {
        processes.push_back(test::startHelper("count-under-mutex", {toUtf8(name), toUtf8(path), std::to_string(times)}));
    }
    for (test::Process &process : processes) CHECK(process.wait() == 0);
    uint32_t count = 0;
    CHECK(key.readU32(VX_TEXT("count"), count) == RegistryRead::value);
    CHECK(count == static_cast<uint32_t>(3 * times));
    CHECK_FALSE(NamedMutex::exists(name));
}
