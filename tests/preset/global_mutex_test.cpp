// SPDX-License-Identifier: MIT
#include "preset/global_mutex.h"

#include <doctest/doctest.h>

#include <chrono>

#include "platform/guid.h"
#include "preset/instance_id.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using vxcomn::testing::DebugCapture;

namespace {

WideString freshName() {
    GUID guid;
    REQUIRE(newGuid(guid));
    return guidText(guid);
}

// Owns the mutex, says so, and lets go of it when its input ends.
const test::Helper ownMutex("own-mutex", [](const std::vector<std::string> &arguments) {
    NamedMutex mutex;
    if (NamedMutex::create(toWide(arguments.at(0)), mutex) != status::ok) return 1;
    if (mutex.acquire(0) != MutexWait::acquired) return 2;
    test::sayLine("owned");
    std::string line;
    char unit = 0;
    while (std::fread(&unit, 1, 1, stdin) == 1) line += unit;
    mutex.release();
    return 0;
});

}  // namespace

TEST_CASE("a mutex without a handle says so, and its users go on without the lock") {
    const DebugCapture capture;
    const test::Logger logger;
    GlobalMutex mutex(logger);
    CHECK_FALSE(mutex);
    {
        const GlobalMutexLock lock(mutex);
        CHECK_FALSE(lock.acquired());
    }
    CHECK(test::said(capture, "Mutex handle = NULL!!!") == 1);
}

TEST_CASE("a mutex is made without an owner, under its name behind Global") {
    const DebugCapture capture;
    const test::Logger logger;
    const WideString name = freshName();
    GlobalMutex mutex(logger);
    REQUIRE(mutex.create(name) == status::ok);
    CHECK(mutex);
    CHECK(mutex.name() == name);
    CHECK(NamedMutex::exists(VX_TEXT("Global\\") + name));
    {
        const GlobalMutexLock lock(mutex);
        CHECK(lock.acquired());
    }
    mutex.close();
    CHECK_FALSE(mutex);
    CHECK(mutex.name().empty());
    CHECK_FALSE(NamedMutex::exists(VX_TEXT("Global\\") + name));
    CHECK(capture.lines().empty());
}

TEST_CASE("a mutex that is made anew lets go of the old name, also under its own name") {
    const test::Logger logger;
    const WideString first = freshName(), second = freshName();
    GlobalMutex mutex(logger);
    REQUIRE(mutex.create(first) == status::ok);
    REQUIRE(mutex.create(second) == status::ok);
    CHECK_FALSE(NamedMutex::exists(VX_TEXT("Global\\") + first));
    REQUIRE(mutex.create(mutex.name()) == status::ok);
    CHECK(NamedMutex::exists(VX_TEXT("Global\\") + second));
}

TEST_CASE("a name that no mutex can have leaves none behind") {
    const test::Logger logger;
    GlobalMutex mutex(logger);
    CHECK(mutex.create(VX_TEXT("with\\backslash")) != status::ok);
    CHECK_FALSE(mutex);
}

TEST_CASE("while another process owns the mutex a user waits for 5 s, says so and goes on") {
    const DebugCapture capture;
    const test::Logger logger;
    const WideString name = freshName();
    GlobalMutex mutex(logger);
    REQUIRE(mutex.create(name) == status::ok);
    test::Process owner = test::startHelper("own-mutex", {toUtf8(VX_TEXT("Global\\") + name)});
    REQUIRE(owner.readLine() == "owned");
    const auto begin = std::chrono::steady_clock::now();
    {
        const GlobalMutexLock lock(mutex);
        CHECK_FALSE(lock.acquired());
        CHECK(std::chrono::steady_clock::now() - begin >= std::chrono::milliseconds(kGlobalMutexWait - 100));
    }
    CHECK(test::said(capture, "Failed to acquire mutex!!!") == 1);
    owner.closeInput();
    CHECK(owner.wait() == 0);
    const GlobalMutexLock lock(mutex);
    CHECK(lock.acquired());
}

TEST_CASE("a mutex whose owner was killed is acquired at once") {
    const DebugCapture capture;
    const test::Logger logger;
    const WideString name = freshName();
    GlobalMutex mutex(logger);
    REQUIRE(mutex.create(name) == status::ok);
    test::Process owner = test::startHelper("own-mutex", {toUtf8(VX_TEXT("Global\\") + name)});
    REQUIRE(owner.readLine() == "owned");
    owner.kill();
    owner.wait();
    const GlobalMutexLock lock(mutex);
    CHECK(lock.acquired());
    CHECK(capture.lines().empty());
}

TEST_CASE("an instance is seen alive under its GUID for as long as it lives") {
    WideString name;
    {
        const CInstanceIDBase one, other;
        CHECK(one.InstanceId == guidText(one.InstanceGuid));
        CHECK(one.InstanceId != other.InstanceId);
        CHECK(one.InstanceMutex.name() == one.InstanceId);
        name = VX_TEXT("Global\\") + one.InstanceId;
        CHECK(NamedMutex::exists(name));
        NamedMutex seen;
        REQUIRE(NamedMutex::open(name, seen) == status::ok);
        CHECK(seen.acquire(0) == MutexWait::acquired);  // nobody owns it
        seen.release();
    }
    CHECK_FALSE(NamedMutex::exists(name));
}
