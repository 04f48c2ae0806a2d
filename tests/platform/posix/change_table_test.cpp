// SPDX-License-Identifier: MIT
//
// What only shows from inside: a writer that dies between its commit and its wake, and a kernel that cannot wait for several words.
#include "platform/posix/change_table.h"

#include <doctest/doctest.h>

#include <csignal>
#include <cstddef>
#include <thread>

#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/syscall.h>

#include "platform/change_signal.h"
#include "tests/platform/posix/fork.h"
#include "tests/platform/registry_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr uint32_t kLong = 20000;  // ms

// From now on the kernel does not know how to wait for several words.
bool takeAwayVectorWaits() {
    sock_filter program[] = {
        BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
        BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_futex_waitv, 0, 1),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | ENOSYS),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
    };
    const sock_fprog filter = {4, program};
    return prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 && prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &filter) == 0;
}

const test::Helper oldKernel("wait-without-vectors", [](const std::vector<std::string> &arguments) {
    if (!takeAwayVectorWaits()) return 1;
    RegistryKey key;
    ChangeSignal signal;
    Event first(EventReset::automatic), second(EventReset::automatic);
    if (RegistryKey::open(test::RegistryFixture::kRoot, toWide(arguments.at(0)), RegistryAccess::readWrite, key) != status::ok)
        return 2;
    if (ChangeSignal::open(key, ChangeFilter::values, signal) != status::ok) return 3;
    for (int i = 0; i < 20; ++i) {
        if (signal.arm() != status::ok) return 4;
        std::thread other([&] {
            std::this_thread::sleep_for(std::chrono::milliseconds(i % 5));
            if (i % 2 != 0) second.set();
            if (i % 2 == 0) key.setU32(VX_TEXT("v"), static_cast<uint32_t>(i + 1));
        });
        const WaitAnswer answer = waitForAny({&first, &second, &signal}, kLong);
        other.join();
        if (answer.outcome != WaitOutcome::signalled || answer.index != (i % 2 != 0 ? 1u : 2u)) return 5;
    }
    return waitForAny({&first, &second}, 5).outcome == WaitOutcome::timedOut ? 0 : 6;
});

}  // namespace

TEST_CASE_FIXTURE(test::RegistryFixture, "a writer that dies behind its commit and ahead of its wake leaves its watchers told") {
    ChangeSignal signal;
    Status why;
    REQUIRE(ChangeTable::get(why) != nullptr);
    REQUIRE(ChangeSignal::open(key, ChangeFilter::values, signal) == status::ok);
    REQUIRE(signal.arm() == status::ok);
    CHECK(test::inFork([] {
              Status reason;
              ChangeTable::get(reason)->beginWrite();
              raise(SIGKILL);
              return 0;
          }) == -1);
    CHECK(waitForOne(signal, kLong) == WaitOutcome::signalled);
    // Done once for that writer.
    REQUIRE(signal.arm() == status::ok);
    CHECK(waitForOne(signal, 3 * kCareMilliseconds) == WaitOutcome::timedOut);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "a writer that is slow between commit and wake is left to do its work") {
    ChangeSignal signal;
    Status why;
    REQUIRE(ChangeSignal::open(key, ChangeFilter::values, signal) == status::ok);
    REQUIRE(signal.arm() == status::ok);
    const pid_t child = test::forkFlushed();
    if (child == 0) {
        ChangeTable::get(why)->beginWrite();
        pause();
        _exit(0);
    }
    CHECK(waitForOne(signal, 3 * kCareMilliseconds) == WaitOutcome::timedOut);
    kill(child, SIGKILL);
    waitpid(child, nullptr, 0);
    CHECK(waitForOne(signal, kLong) == WaitOutcome::signalled);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "who watches a key that is deleted is signalled, whatever it watches for") {
    RegistryKey below;
    ChangeSignal signal;
    REQUIRE(key.createBelow(VX_TEXT("a\\b"), RegistryAccess::readWrite, below) == status::ok);
    REQUIRE(ChangeSignal::open(below, ChangeFilter::values, signal) == status::ok);
    CHECK(signal.arm() == status::ok);
    CHECK(key.deleteTreeBelow(VX_TEXT("a")) == status::ok);
    CHECK(waitForOne(signal, kLong) == WaitOutcome::signalled);
}

TEST_CASE_FIXTURE(test::RegistryFixture, "where the kernel cannot wait for several words at once, waits work all the same") {
    test::Process process = test::startHelper("wait-without-vectors", {toUtf8(path)});
    CHECK(process.wait() == 0);
}
