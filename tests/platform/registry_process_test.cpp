// SPDX-License-Identifier: MIT
//
// The registry between processes: several write at once, and one is killed in the middle of its writes.
#include <doctest/doctest.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <random>
#include <thread>

#include "tests/platform/registry_fixture.h"
#include "tests/platform/rounds.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr int kSlots = 20;
constexpr auto kRoot = test::RegistryFixture::kRoot;

WideString slotName(int slot) {
    return toWide("value " + std::to_string(slot));
}

// Values of its own and keys of its own, in a key that others write into as well.
const test::Helper writeMany("write-many", [](const std::vector<std::string> &arguments) {
    RegistryKey key, below;
    if (RegistryKey::create(kRoot, toWide(arguments.at(0)), RegistryAccess::readWrite, key) != status::ok) return 1;
    for (int i = 0; i < std::atoi(arguments.at(2).c_str()); ++i) {
        const WideString name = toWide(arguments.at(1) + "-" + std::to_string(i));
        if (key.setU32(name, static_cast<uint32_t>(i)) != status::ok) return 2;
        if (i % 10 == 0 && key.createBelow(name, RegistryAccess::write, below) != status::ok) return 3;
        if (key.setU32(VX_TEXT("shared"), static_cast<uint32_t>(i)) != status::ok) return 4;
    }
    return 0;
});

// Tells what is there, then writes on for ever: write number n goes to slot n mod kSlots, of every seventh round of slots into a
// key that is made for it and deleted behind it. Each write is acknowledged once it has returned.
const test::Helper writeOn("write-on", [](const std::vector<std::string> &arguments) {
    RegistryKey key;
    if (RegistryKey::create(kRoot, toWide(arguments.at(0)), RegistryAccess::all, key) != status::ok) return 1;
    for (int slot = 0; slot < kSlots; ++slot) {
        uint32_t number = 0;
        key.readU32(slotName(slot), number);
        test::sayLine(std::to_string(number));
    }
    for (auto n = static_cast<uint32_t>(std::atoi(arguments.at(1).c_str()));; ++n) {
        if (key.setU32(slotName(static_cast<int>(n % kSlots)), n) != status::ok) return 2;
        test::sayLine(std::to_string(n));
        if (n % 7 != 0) continue;
        RegistryKey below;
        if (key.createBelow(VX_TEXT("short\\lived"), RegistryAccess::write, below) != status::ok) return 3;
        if (below.setU32(VX_TEXT("v"), n) != status::ok) return 4;
        if (key.deleteTreeBelow(VX_TEXT("short")) != status::ok) return 5;
    }
});

}  // namespace

TEST_CASE_FIXTURE(test::RegistryFixture, "three processes write at once and no write is lost") {
    constexpr int kWrites = test::kManyWrites;
    const std::vector<std::string> writers = {"a", "b", "c"};
    std::vector<test::Process> processes;
    for (const std::string &writer : writers) {
        processes.push_back(test::startHelper("write-many", {toUtf8(path), writer, std::to_string(kWrites)}));
    }
    for (test::Process &process : processes) CHECK(process.wait() == 0);
    int wrong = 0;
    for (const std::string &writer : writers) {
        for (int i = 0; i < kWrites; ++i) {
            const WideString name = toWide(writer + "-" + std::to_string(i));
            uint32_t number = 0;
            RegistryKey below;
            if (key.readU32(name, number) != RegistryRead::value || number != static_cast<uint32_t>(i)) ++wrong;
            if (i % 10 == 0 && key.openBelow(name, RegistryAccess::read, below) != status::ok) ++wrong;
        }
    }
    CHECK(wrong == 0);
    std::vector<WideString> names;
    CHECK(key.values(names) == status::ok);
    CHECK(names.size() == writers.size() * kWrites + 1);
    CHECK(key.subkeys(names) == status::ok);
    CHECK(names.size() == writers.size() * ((kWrites + 9) / 10));
}

TEST_CASE_FIXTURE(test::RegistryFixture, "several threads write at once and no write is lost") {
    constexpr int kThreads = 4, kWrites = 100;
    std::vector<std::thread> threads;
    std::vector<int> failures(kThreads);
    for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([this, t, &failures] {
            RegistryKey own;
            if (RegistryKey::open(kRoot, path, RegistryAccess::readWrite, own) != status::ok) ++failures[static_cast<size_t>(t)];
            for (int i = 0; i < kWrites; ++i) {
                const WideString name = toWide(std::to_string(t) + "-" + std::to_string(i));
                uint32_t number = 0;
                if (own.setU32(name, static_cast<uint32_t>(i)) != status::ok) ++failures[static_cast<size_t>(t)];
                if (own.readU32(name, number) != RegistryRead::value || number != static_cast<uint32_t>(i)) {
                    ++failures[static_cast<size_t>(t)];
                }
            }
        });
    }
    for (std::thread &thread : threads) thread.join();
    CHECK(failures == std::vector<int>(kThreads));
    std::vector<WideString> names;
    CHECK(key.values(names) == status::ok);
    CHECK(names.size() == kThreads * kWrites);
}

// The helpers' machine is not this process's, so on Linux each of them is the only one to have the store open, and the next one has
// to put it in order behind the killed one. On Windows the registry is the system's.
TEST_CASE_FIXTURE(test::RegistryFixture, "a process killed in the middle of its writes loses none that had returned") {
    const auto seed = std::random_device()();
    INFO("seed ", seed);
    std::mt19937 random(seed);
    const auto machine = std::filesystem::temp_directory_path() / ("vxcomn-killed-" + std::to_string(test::processId()));
    std::filesystem::create_directories(machine);

    std::vector<uint32_t> expected(kSlots, 0);
    uint32_t next = 1;
    int lost = 0, acknowledged = 0;
    for (int round = 0; round < test::kKillRounds; ++round) {
        test::Process writer =
            test::startHelper("write-on", {toUtf8(path), std::to_string(next)}, {{"VXCOMN_ROOT", machine.string()}});
        for (int slot = 0; slot < kSlots; ++slot) {
            const auto line = writer.readLine();
            REQUIRE(line);
            const auto found = static_cast<uint32_t>(std::stoul(*line));
            // The last write may have been done although nobody could tell any more.
            const bool unsaid = next % kSlots == static_cast<uint32_t>(slot) && found == next;
            if (found != expected[static_cast<size_t>(slot)] && !unsaid) ++lost;
            expected[static_cast<size_t>(slot)] = found;
        }
        const int wanted = std::uniform_int_distribution(0, 60)(random);
        const auto acknowledge = [&](const std::string &line) {
            next = static_cast<uint32_t>(std::stoul(line));
            expected[next % kSlots] = next;
            ++next;
            ++acknowledged;
        };
        for (int i = 0; i < wanted; ++i) {
            const auto line = writer.readLine();
            REQUIRE(line);
            acknowledge(*line);
        }
        std::this_thread::sleep_for(std::chrono::microseconds(std::uniform_int_distribution(0, 300)(random)));
        writer.kill();
        while (const auto line = writer.readLine()) acknowledge(*line);
        CHECK(writer.errors() == "");
    }
    std::filesystem::remove_all(machine);
    CHECK(lost == 0);
    CHECK(acknowledged > test::kKillRounds);
    MESSAGE(test::kKillRounds << " rounds, " << acknowledged << " acknowledged writes, " << lost << " lost");
}
