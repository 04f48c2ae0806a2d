// SPDX-License-Identifier: MIT
//
// A process that writes parameters is killed at any moment, again and again, while another one reads. Nothing that was acknowledged
// is lost, no value is seen with another's stamp, and of the process itself nothing stays.
#include <doctest/doctest.h>

#include <array>
#include <chrono>
#include <cstring>
#include <map>
#include <random>
#include <sstream>
#include <thread>

#include "platform/named_mutex.h"
#include "preset/instance_id.h"
#include "tests/crash/rounds.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;

namespace {

constexpr auto kMachine = RegistryRoot::localMachine;
constexpr uint64_t kComponents = 3, kParams = 4, kSlots = kComponents * kParams;

// Where number n is written, and what: the number, and as many further bytes as it says, all the same.
int32_t componentOf(uint64_t number) {
    return static_cast<int32_t>(number % kComponents) - 1;
}
int32_t paramOf(uint64_t number) {
    return static_cast<int32_t>(number / kComponents % kParams);
}
std::vector<uint8_t> dataOf(uint64_t number) {
    std::vector<uint8_t> data(8 + number * 37 % 5000, static_cast<uint8_t>(number));
    std::memcpy(data.data(), &number, sizeof number);
    return data;
}

struct Read {
    uint64_t number = 0, stamp = 0;
    bool torn = false;  // not what any write wrote
};

// The value with the stamp that stood before and behind it; nothing if it changed meanwhile or there is none.
std::optional<Read> readSlot(const WideString &parameters, int32_t component, int32_t param) {
    const WideString above = parameters + VX_TEXT("\\") + decimalName(component) + VX_TEXT("\\");
    const WideString name = decimalName(param);
    RegistryValue before, data, behind;
    if (RegistryKey::queryAt(kMachine, above + store_name::time, name, before, 8) != status::ok) return {};
    if (RegistryKey::queryAt(kMachine, above + store_name::data, name, data, 65536) != status::ok) return {};
    if (RegistryKey::queryAt(kMachine, above + store_name::time, name, behind, 8) != status::ok) return {};
    if (before.data != behind.data || before.data.size() != 8) return {};
    Read read;
    std::memcpy(&read.stamp, before.data.data(), 8);
    if (data.data.size() >= 8) std::memcpy(&read.number, data.data.data(), 8);
    read.torn = data.data != dataOf(read.number);
    return read;
}

// Says its instance id, then writes on for ever from a number on and says each number and its stamp once the write has returned.
const test::Helper writeParameters("write-parameters", [](const std::vector<std::string> &arguments) {
    const WideString parameters = toWide(arguments.at(0));
    const CInstanceIDBase self;
    test::sayLine(toUtf8(self.InstanceMutex.name()));
    for (uint64_t number = std::stoull(arguments.at(1));; ++number) {
        uint64_t stamp = 0;
        const std::vector<uint8_t> data = dataOf(number);
        if (!WriteParameter(nullptr, parameters, componentOf(number), paramOf(number), -1, data,
                            {self.InstanceGuid, self.InstanceId}, false, &stamp)) {
            return 1;
        }
        test::sayLine(std::to_string(number) + " " + std::to_string(stamp));
    }
});

// Reads all slots for ever, and says what it saw when its input ends: reads, torn values, values that came with two stamps.
const test::Helper readParameters("read-parameters", [](const std::vector<std::string> &arguments) {
    const WideString parameters = toWide(arguments.at(0));
    bool end = false;
    std::thread input([&end] {
        while (std::fgetc(stdin) != EOF) {
        }
        std::atomic_ref(end).store(true);
    });
    uint64_t reads = 0, torn = 0, twoStamps = 0;
    std::map<uint64_t, uint64_t> stamps;  // of the numbers seen last
    while (!std::atomic_ref(end).load()) {
        for (uint64_t slot = 0; slot < kSlots; ++slot) {
            const auto read = readSlot(parameters, componentOf(slot), paramOf(slot));
            if (!read) continue;
            ++reads;
            if (read->torn) ++torn;
            const auto [known, fresh] = stamps.emplace(read->number, read->stamp);
            if (!fresh && known->second != read->stamp) ++twoStamps;
            known->second = read->stamp;
            if (stamps.size() > 4 * kSlots) stamps.erase(stamps.begin());
        }
        std::this_thread::sleep_for(std::chrono::microseconds(200));
    }
    input.join();
    test::sayLine(std::to_string(reads) + " " + std::to_string(torn) + " " + std::to_string(twoStamps));
    return 0;
});

struct Tally {
    int acknowledged = 0, lost = 0, torn = 0, wrongStamp = 0, tokens = 0;
};

// What the parent knows of each slot.
struct Known {
    uint64_t number = 0, stamp = 0;
};

// Looks at all slots while no writer runs. The number behind the last acknowledged one may have been written unheard.
void verify(const WideString &parameters, uint64_t next, std::array<Known, kSlots> &known, Tally &tally) {
    for (uint64_t slot = 0; slot < kSlots; ++slot) {
        Known &expected = known[slot];
        const auto read = readSlot(parameters, componentOf(slot), paramOf(slot));
        if (!read) {
            if (expected.number != 0) ++tally.lost;
            continue;
        }
        const bool unheard = next % kSlots == slot && read->number == next;
        if (read->torn) ++tally.torn;
        if (read->number != expected.number && !unheard) ++tally.lost;
        if (unheard ? read->stamp == expected.stamp : expected.stamp != 0 && read->stamp != expected.stamp) ++tally.wrongStamp;
        expected = {read->number, read->stamp};
    }
}

}  // namespace

TEST_CASE_FIXTURE(test::StoreFixture, "a writer killed at any moment loses nothing it has acknowledged and leaves no token") {
    const auto seed = std::random_device()();
    INFO("seed ", seed);
    std::mt19937 random(seed);
    const int rounds = test::crashRounds();
    test::Process reader = test::startHelper("read-parameters", {toUtf8(parameters)});

    Tally tally;
    std::array<Known, kSlots> known = {};
    uint64_t next = kSlots;
    for (int round = 0; round < rounds; ++round) {
        test::Process writer = test::startHelper("write-parameters", {toUtf8(parameters), std::to_string(next)});
        const auto instance = writer.readLine();
        REQUIRE(instance);
        const auto acknowledge = [&](const std::string &line) {
            std::istringstream words(line);
            Known written;
            words >> written.number >> written.stamp;
            REQUIRE(written.number == next);
            known[next % kSlots] = written;
            ++next;
            ++tally.acknowledged;
        };
        for (int i = std::uniform_int_distribution(0, 20)(random); i > 0; --i) {
            const auto line = writer.readLine();
            REQUIRE(line);
            acknowledge(*line);
        }
        std::this_thread::sleep_for(std::chrono::microseconds(std::uniform_int_distribution(0, 300)(random)));
        writer.kill();
        while (const auto line = writer.readLine()) acknowledge(*line);
        CHECK(writer.errors() == "");
        if (NamedMutex::exists(VX_TEXT("Global\\") + toWide(*instance))) ++tally.tokens;
        verify(parameters, next, known, tally);
        // A number that was written unheard is not written again.
        if (known[next % kSlots].number == next) ++next;
    }
    reader.closeInput();
    const auto line = reader.readLine();
    REQUIRE(line);
    uint64_t reads = 0, torn = 0, twoStamps = 0;
    std::istringstream(*line) >> reads >> torn >> twoStamps;
    CHECK(reader.wait() == 0);

    CHECK(tally.acknowledged > 0);
    CHECK(reads > 0);
    CHECK(tally.lost == 0);
    CHECK(tally.torn == 0);
    CHECK(torn == 0);
    CHECK(tally.tokens == 0);
    if (test::kWholeWrites) {
        CHECK(tally.wrongStamp == 0);
        CHECK(twoStamps == 0);
    }
    MESSAGE(rounds << " writers killed, " << tally.acknowledged << " acknowledged writes, " << tally.lost << " lost; " << reads
                   << " reads meanwhile; with another's stamp: " << tally.wrongStamp << " at rest, " << twoStamps
                   << " meanwhile; tokens left: " << tally.tokens);
}
