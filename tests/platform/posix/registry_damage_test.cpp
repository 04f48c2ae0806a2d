// SPDX-License-Identifier: MIT
//
// A registry.db that is damaged: cut off, garbage, single bytes flipped. Each ends in a store that works, and nothing of the old
// file is thrown away. One helper does all rounds of a kind, each in a forked child with a machine of its own.
#include <doctest/doctest.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>

#include "platform/registry.h"
#include "tests/platform/posix/fork.h"
#include "tests/platform/rounds.h"
#include "tests/support/helper.h"
#include "tests/support/process.h"

using namespace vxcomn;
namespace fs = std::filesystem;
using Bytes = std::vector<char>;

namespace {

constexpr auto kRoot = RegistryRoot::localMachine;
constexpr int kValues = 60;

Bytes load(const fs::path &path) {
    std::ifstream file(path, std::ios::binary);
    return Bytes(std::istreambuf_iterator<char>(file), {});
}

void store(const fs::path &path, const Bytes &bytes) {
    std::ofstream(path, std::ios::binary).write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
}

WideString valueName(int number) {
    return toWide("a value with a longer name, number " + std::to_string(number));
}

int seedStore() {
    RegistryKey key, below;
    if (RegistryKey::create(kRoot, VX_TEXT("Software\\Seed"), RegistryAccess::all, key) != status::ok) return 1;
    for (int i = 0; i < kValues; ++i) {
        if (key.setBytes(valueName(i), std::vector<uint8_t>(150, static_cast<uint8_t>(i))) != status::ok) return 2;
        if (key.createBelow(toWide("key " + std::to_string(i)), RegistryAccess::write, below) != status::ok) return 3;
    }
    return 0;
}

// Goes through all that is there and then writes: whatever the file was like before, this must work now.
int useStore() {
    RegistryKey key, found;
    std::vector<WideString> names;
    if (RegistryKey::open(kRoot, VX_TEXT("Software\\Seed"), RegistryAccess::read, found) == status::ok) {
        RegistryValue value;
        if (found.values(names) == status::ok) {
            for (const WideString &name : names) found.query(name, value);
        }
        for (int i = 0; i < kValues; ++i) found.query(valueName(i), value);
        found.subkeys(names);
    }
    if (RegistryKey::create(kRoot, VX_TEXT("Software\\New"), RegistryAccess::all, key) != status::ok) return 1;
    for (uint32_t i = 0; i < 20; ++i) {
        // Another damaged page may come to light at any statement; the key is then made anew.
        if (key.setU32(valueName(static_cast<int>(i)), i) == status::ok) continue;
        if (RegistryKey::create(kRoot, VX_TEXT("Software\\New"), RegistryAccess::all, key) != status::ok) return 2;
        if (key.setU32(valueName(static_cast<int>(i)), i) != status::ok) return 3;
    }
    uint32_t number = 0;
    if (key.readU32(valueName(19), number) != RegistryRead::value || number != 19) return 4;
    for (const auto root :
         {RegistryRoot::localMachine, RegistryRoot::currentUser, RegistryRoot::users, RegistryRoot::classesRoot}) {
        if (RegistryKey::open(root, {}, RegistryAccess::read, found) != status::ok) return 5;
    }
    return 0;
}

// A machine whose registry.db is `bytes`, used once. 0: as if nothing were wrong; 1: set aside as it was and begun anew; else
// failed.
int useDamaged(const fs::path &machine, const Bytes &bytes) {
    fs::remove_all(machine);
    fs::create_directories(machine);
    store(machine / "registry.db", bytes);
    const int result = test::inFork([&] {
        setenv("VXCOMN_ROOT", machine.c_str(), 1);
        return useStore();
    });
    if (result != 0) return 100 + result;
    const fs::path aside = machine / "registry.db.damaged-1";
    if (!fs::exists(aside)) return 0;
    // What a statement had already written may stand in its journal; the file's length tells that it is the old one.
    return fs::file_size(aside) >= bytes.size() ? 1 : 2;
}

// Arguments: machine, seeded file, "cut" or "flip". Prints how many rounds ended how, and the first failure.
const test::Helper damageRounds("damage-rounds", [](const std::vector<std::string> &arguments) {
    const fs::path machine = arguments.at(0);
    const Bytes whole = load(arguments.at(1));
    const bool cut = arguments.at(2) == "cut";
    const size_t step = test::kSanitized ? 8 : 1;
    int unnoticed = 0, aside = 0, rounds = 0;
    const auto round = [&](size_t at, const Bytes &bytes) {
        const int result = useDamaged(machine, bytes);
        ++rounds;
        unnoticed += result == 0 ? 1 : 0;
        aside += result == 1 ? 1 : 0;
        if (result > 1) test::sayLine("failed at " + std::to_string(at) + " with " + std::to_string(result));
    };
    if (cut) {
        for (size_t length = 1; length < whole.size(); length += length < 200 ? 7 * step : 512 * step) {
            round(length, Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)));
        }
    } else {
        // Every byte of the file's header, then strided through the rest of it.
        for (size_t at = 0; at < whole.size(); at += at < 100 ? step : 41 * step) {
            Bytes changed = whole;
            changed[at] = static_cast<char>(changed[at] ^ 0xFF);
            round(at, changed);
        }
    }
    test::sayLine(std::to_string(rounds) + " " + std::to_string(unnoticed) + " " + std::to_string(aside));
    return 0;
});

const test::Helper seedHelper("seed-store", [](const std::vector<std::string> &) { return seedStore(); });
const test::Helper useHelper("use-store", [](const std::vector<std::string> &) { return useStore(); });

// Uses the store, waits for the parent's line, and then writes by the handle and by path.
const test::Helper holdHelper("hold-store", [](const std::vector<std::string> &) {
    RegistryKey key;
    if (RegistryKey::open(kRoot, VX_TEXT("Software\\Seed"), RegistryAccess::all, key) != status::ok) return 1;
    test::sayLine("open");
    if (std::getchar() == EOF) return 2;
    RegistryValue value;
    const Status read = key.query(valueName(3), value);
    const Status written = key.setU32(VX_TEXT("late"), 1);
    RegistryKey made;
    const Status anew = RegistryKey::create(kRoot, VX_TEXT("Software\\Late"), RegistryAccess::all, made);
    const Status late = made.setU32(VX_TEXT("late"), 2);
    test::sayLine(std::to_string(read) + " " + std::to_string(written) + " " + std::to_string(anew) + " " + std::to_string(late));
    return 0;
});

struct DamageFixture {
    fs::path folder = fs::temp_directory_path() / ("vxcomn-damage-" + std::to_string(test::processId()));
    fs::path machine = folder / "machine";
    fs::path seeded = folder / "seeded.db";
    test::Environment environment = {{"VXCOMN_ROOT", machine.string()}};

    DamageFixture() {
        fs::create_directories(machine);
        REQUIRE(test::startHelper("seed-store", {}, environment).wait() == 0);
        fs::copy_file(machine / "registry.db", seeded);
    }
    ~DamageFixture() { fs::remove_all(folder); }

    test::Outcome use() const { return test::run(test::selfProgram(), {"--helper", "use-store"}, {}, environment); }
    bool wasSetAside(int number) const {
        return fs::exists(folder / "machine" / ("registry.db.damaged-" + std::to_string(number)));
    }

    struct Count {
        int rounds, unnoticed, aside;
    };
    Count rounds(const std::string &kind) const {
        test::Process helper = test::startHelper("damage-rounds", {(folder / "rounds").string(), seeded.string(), kind});
        Count count{};
        while (const auto line = helper.readLine()) {
            CHECK_MESSAGE(!line->starts_with("failed"), *line);
            std::sscanf(line->c_str(), "%d %d %d", &count.rounds, &count.unnoticed, &count.aside);
        }
        CHECK(helper.wait() == 0);
        MESSAGE(kind << ": " << count.rounds << " rounds, " << count.aside << " set aside, " << count.unnoticed
                     << " without effect");
        return count;
    }
};

}  // namespace

TEST_CASE_FIXTURE(DamageFixture, "a store that is whole is not set aside") {
    const test::Outcome outcome = use();
    CHECK(outcome.status == 0);
    CHECK(outcome.errors == "");
    CHECK_FALSE(wasSetAside(1));
}

TEST_CASE_FIXTURE(DamageFixture, "garbage in place of registry.db is set aside with a message and a fresh one begun") {
    Bytes garbage(50000);
    std::mt19937 random(1);
    for (char &byte : garbage) byte = static_cast<char>(random());
    store(machine / "registry.db", garbage);
    store(machine / "registry.db-wal", garbage);
    const test::Outcome outcome = use();
    CHECK(outcome.status == 0);
    CHECK(outcome.errors.starts_with("registry: " + (machine / "registry.db").string() + " is damaged ("));
    CHECK(outcome.errors.find((machine / "registry.db.damaged-1").string()) != std::string::npos);
    CHECK(load(machine / "registry.db.damaged-1") == garbage);
    CHECK(use().errors == "");
    store(machine / "registry.db", garbage);
    CHECK(use().status == 0);
    CHECK(load(machine / "registry.db.damaged-2") == garbage);
}

TEST_CASE_FIXTURE(DamageFixture, "the message also goes to the debug output if that is a file") {
    store(machine / "registry.db", Bytes(5000, 'x'));
    environment.emplace_back("VXCOMN_DEBUG_OUTPUT", (folder / "log").string());
    CHECK(use().errors != "");
    const Bytes log = load(folder / "log");
    CHECK(std::string(log.begin(), log.end()).starts_with("registry: "));
}

TEST_CASE_FIXTURE(DamageFixture, "a store of which only the journal is left is set aside") {
    store(machine / "registry.db-wal", Bytes(5000, 'x'));
    SUBCASE("no file") {
        fs::remove(machine / "registry.db");
    }
    SUBCASE("an empty file") {
        store(machine / "registry.db", {});
    }
    CHECK(use().status == 0);
    CHECK(load(machine / "registry.db.damaged-1-wal") == Bytes(5000, 'x'));
}

TEST_CASE_FIXTURE(DamageFixture, "a database that is another program's is set aside whole") {
    fs::remove(machine / "registry.db");
    const std::string make =
        "sqlite3 '" + (machine / "registry.db").string() + "' 'CREATE TABLE keys (a); PRAGMA user_version = 1' 2>/dev/null";
    if (std::system(make.c_str()) != 0) {
        MESSAGE("skipped: no sqlite3 program on this machine");
        return;
    }
    CHECK(use().status == 0);
    CHECK(wasSetAside(1));
}

TEST_CASE_FIXTURE(DamageFixture, "a store cut off at any length is set aside or works, and then writes hold") {
    const Count count = rounds("cut");
    CHECK(count.rounds > (test::kSanitized ? 5 : 50));
    CHECK(count.aside + count.unnoticed == count.rounds);
    CHECK(count.aside > count.rounds / 2);
}

TEST_CASE_FIXTURE(DamageFixture, "a store with a flipped byte is set aside or works, and then writes hold") {
    const Count count = rounds("flip");
    CHECK(count.rounds > (test::kSanitized ? 50 : 500));
    CHECK(count.aside + count.unnoticed == count.rounds);
    CHECK(count.aside > count.rounds / 50);
}

TEST_CASE_FIXTURE(DamageFixture,
                  "a process that has the damaged file open goes on with the fresh one, its old handles answering 1018") {
    test::Process holder = test::startHelper("hold-store", {}, environment);
    REQUIRE(holder.readLine() == "open");
    // Another process finds the damage and sets the file aside.
    std::fstream file(machine / "registry.db", std::ios::binary | std::ios::in | std::ios::out);
    const std::string zeroes(100, '\0');
    file.write(zeroes.data(), 100).flush();
    CHECK(use().status == 0);
    REQUIRE(wasSetAside(1));
    holder.write("\n");
    CHECK(holder.readLine() == "1018 1018 0 0");
    CHECK(holder.wait() == 0);
    CHECK(holder.errors() == "");
    CHECK_FALSE(wasSetAside(2));
    // The fresh file's own journal was left to it.
    CHECK(use().errors == "");
}

TEST_CASE_FIXTURE(DamageFixture, "several processes that find the same damage at once set the file aside once") {
    constexpr int kRounds = test::kSanitized ? 3 : 20;
    for (int round = 1; round <= kRounds; ++round) {
        store(machine / "registry.db", Bytes(20000, static_cast<char>('a' + round)));
        std::vector<test::Process> processes;
        for (int i = 0; i < 4; ++i) processes.push_back(test::startHelper("use-store", {}, environment));
        for (test::Process &process : processes) CHECK(process.wait() == 0);
        CHECK(wasSetAside(round));
        CHECK_FALSE(wasSetAside(round + 1));
    }
}
