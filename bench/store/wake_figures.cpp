// SPDX-License-Identifier: MIT
//
// From a write in one process to the value in the hands of a blocked reader in another: through the store and its signal, through a
// word in shared memory and a futex, and through dconf. The processes are pinned to two processors; futex and store take turns. The
// time begins ahead of the write and ends behind the reader's read.
#include <algorithm>
#include <cstdio>
#include <cstring>

#include <linux/futex.h>
#include <sched.h>
#include <signal.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include "bench/store/dconf_peer.h"
#include "bench/store/figures.h"
#include "bench/support/timing.h"
#include "platform/change_signal.h"

namespace vxcomn::bench {
namespace {

constexpr int kRounds = 2000, kDconfRounds = 300;
constexpr uint32_t kPatience = 20000;  // ms

uint64_t storedValue() {
    uint64_t value = 0;
    uint32_t size = sizeof value;
    ReadParameterValue(benchParameterKey(), 0, 0, reinterpret_cast<uint8_t *>(&value), size, nullptr, nullptr);
    return value;
}

void storeValue(uint64_t value) {
    uint8_t bytes[sizeof value];
    std::memcpy(bytes, &value, sizeof value);
    require(WriteParameter(nullptr, benchParameterKey(), 0, 0, -1, bytes, {}, false, nullptr), "a write failed");
}

void waitOnFutex(SharedPage &page, uint32_t round) {
    const uint32_t seen = page.word.load();
    page.blocked.store(round);
    while (page.word.load() == seen) syscall(SYS_futex, &page.word, FUTEX_WAIT, seen, nullptr, nullptr, 0);
    keep(page.value.load());
}

void waitOnStore(SharedPage &page, ChangeSignal &signal, uint32_t round) {
    uint64_t last = 0;
    signal.arm();
    last = storedValue();
    page.blocked.store(round);
    // Armed again before it is read, as whoever goes on waiting does.
    do {
        if (waitForOne(signal, kPatience) != WaitOutcome::signalled) return;
        signal.arm();
    } while (storedValue() == last);
}

[[noreturn]] void read(SharedPage &page) {
    pinTo(1);
    RegistryKey root;
    ChangeSignal signal;
    if (RegistryKey::open(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::read, root) != status::ok ||
        ChangeSignal::open(root, ChangeFilter::keysAndValues, signal) != status::ok) {
        _exit(1);
    }
    for (uint32_t round = 1;; ++round) {
        while (page.round.load() != round) sleepMicroseconds(20);
        const Way way = page.way.load();
        if (way == Way::end) _exit(0);
        if (way == Way::futex) {
            waitOnFutex(page, round);
        } else {
            waitOnStore(page, signal, round);
        }
        page.when.store(nowNanoseconds());
        page.arrived.store(round);
    }
}

struct DconfTimes {
    int count;
    double each[kDconfRounds];
};

struct Times {
    double median, p99;
};

Times timesOf(std::vector<double> times) {
    std::sort(times.begin(), times.end());
    return {times[times.size() / 2], times[times.size() * 99 / 100]};
}

void waitUntil(const std::atomic<uint32_t> &word, uint32_t value, const char *what) {
    for (int i = 0; word.load() != value; ++i) {
        require(i < 1000000, what);
        sleepMicroseconds(20);
    }
}

double handOver(SharedPage &page, uint32_t round, Way way) {
    page.way.store(way);
    page.round.store(round);
    waitUntil(page.blocked, round, "the reader does not wait");
    sleepMicroseconds(100);  // until it really sleeps
    const int64_t begin = nowNanoseconds();
    if (way == Way::futex) {
        page.value.store(round);
        page.word.fetch_add(1);
        syscall(SYS_futex, &page.word, FUTEX_WAKE, 1, nullptr, nullptr, 0);
    } else {
        storeValue(round);
    }
    waitUntil(page.arrived, round, "the value did not arrive");
    return static_cast<double>(page.when.load() - begin);
}

// Measures with a reader of its own, in a process that then ends: the bus library ends whoever outlives the bus.
[[noreturn]] void measureDconf(const std::filesystem::path &folder, SharedPage &page, DconfTimes &times) {
    const MessageBus bus(folder);
    if (!bus) _exit(0);
    const pid_t reader = fork();
    if (reader == 0) watchDconf(page);
    try {
        require(dconfWorks(), "dconf does not work here");
        waitUntil(page.blocked, 1, "dconf's reader does not watch");
        for (uint32_t round = 1; round <= kDconfRounds; ++round) {
            page.value.store(round + 1000);
            page.round.store(round);
            sleepMicroseconds(200);
            const int64_t begin = nowNanoseconds();
            writeDconf(round + 1000);
            waitUntil(page.arrived, round, "dconf's value did not arrive");
            times.each[times.count++] = static_cast<double>(page.when.load() - begin);
        }
    } catch (const std::exception &) {
        times.count = 0;
    }
    kill(reader, SIGKILL);
    waitpid(reader, nullptr, 0);
    bus.end();
    _exit(0);
}

std::vector<double> dconfTimes(const std::filesystem::path &folder) {
    DconfTimes &times = *makeShared<DconfTimes>();
    SharedPage &page = *makeShared<SharedPage>();
    const pid_t measurer = fork();
    if (measurer == 0) measureDconf(folder, page, times);
    waitpid(measurer, nullptr, 0);
    return {times.each, times.each + times.count};
}

}  // namespace

void printWakeFigures(const std::filesystem::path &folder) {
    SharedPage &page = *makeShared<SharedPage>();
    storeValue(0);
    const pid_t reader = fork();
    if (reader == 0) read(page);
    pinTo(0);
    std::vector<double> futex, store;
    uint32_t round = 0;
    for (int i = 0; i < kRounds; ++i) {
        futex.push_back(handOver(page, ++round, Way::futex));
        store.push_back(handOver(page, ++round, Way::store));
    }
    page.way.store(Way::end);
    page.round.store(++round);
    waitpid(reader, nullptr, 0);
    cpu_set_t all;
    std::memset(&all, 0xFF, sizeof all);
    sched_setaffinity(0, sizeof all, &all);

    const Times bare = timesOf(futex), ours = timesOf(store);
    printRatio("write to a blocked reader's hands, median", ours.median, ours.median / bare.median, "a shared futex", 3.5, true);
    printRatio("write to a blocked reader's hands, p99", ours.p99, ours.p99 / bare.p99, "a shared futex's p99");
    const std::vector<double> dconf = dconfTimes(folder);
    if (dconf.empty()) {
        std::printf("  dconf: no value could be written here, so there is no comparison with it\n");
    } else {
        const Times theirs = timesOf(dconf);
        printRatio("write to a blocked reader's hands, median", ours.median, theirs.median / ours.median, "faster than dconf", 10,
                   false);
    }
    std::printf("\n");
}

}  // namespace vxcomn::bench
