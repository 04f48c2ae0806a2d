// SPDX-License-Identifier: MIT
//
// Every operation of the parameter store, with each thing in turn failing that can: it ends as documented, the store holds the old
// state or the new one, and the next call works.
#include <doctest/doctest.h>

#include <cstring>
#include <filesystem>
#include <functional>

#include <sys/wait.h>
#include <unistd.h>

#include "platform/last_error.h"
#include "preset/instance_id.h"
#include "tests/fault/posix/faults.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using test::FaultKind;
using Bytes = std::vector<uint8_t>;

namespace {

constexpr FaultKind kKinds[] = {FaultKind::allocation, FaultKind::storeMemory, FaultKind::statement, FaultKind::storeFile,
                                FaultKind::file};

// A fork closes the connection, so that the next call opens one.
void closeStore() {
    const pid_t child = fork();
    if (child == 0) _exit(0);
    waitpid(child, nullptr, 0);
}

int openFiles() {
    namespace fs = std::filesystem;
    return static_cast<int>(std::distance(fs::directory_iterator("/proc/self/fd"), fs::directory_iterator()));
}

int filesSetAside() {
    namespace fs = std::filesystem;
    int count = 0;
    for (const auto &entry : fs::directory_iterator(std::getenv("VXCOMN_ROOT"))) {
        if (entry.path().filename().string().find("damaged") != std::string::npos) ++count;
    }
    return count;
}

struct Fixture : test::StoreFixture {
    const Bytes before = Bytes(40, 1), after = Bytes(50, 2);
    uint64_t stampBefore = 0;

    Bytes dataOf(const VXWCHAR *part) const {
        RegistryValue value;
        RegistryKey::queryAt(kMachine, parameters + VX_TEXT("\\2\\") + part, VX_TEXT("3"), value);
        return value.data;
    }
    uint64_t stamp() const {
        uint64_t number = 0;
        const Bytes data = dataOf(store_name::time);
        if (data.size() == sizeof number) std::memcpy(&number, data.data(), sizeof number);
        return number;
    }
    bool holdsBefore() const { return dataOf(store_name::data) == before && stamp() == stampBefore; }
    bool holdsAfter(uint64_t written) const {
        return dataOf(store_name::data) == after && stamp() != stampBefore && (written == 0 || stamp() == written);
    }
    void writeBefore() {
        forget();
        stampBefore = 0;
        REQUIRE(write(2, 3, before, &stampBefore));
    }

    // Fails each thing in an operation, with the store open already and, if that is asked for, with the store to be opened.
    // `operation` may throw for want of memory. `check(failed, threw)` looks at what became of it.
    void failAll(const char *what, const std::function<void()> &prepare, const std::function<void()> &operation,
                 const std::function<void(bool failed, bool threw)> &check, bool alsoClosed = false) {
        std::string told = what;
        for (const bool open : {true, false}) {
            if (!open && !alsoClosed) break;
            for (const FaultKind kind : kKinds) {
                bool threw = false;
                // What is opened once and kept is open by now.
                prepare();
                const int files = openFiles();
                const int failures = test::failEach(
                    kind,
                    [&] {
                        prepare();
                        threw = false;
                        if (!open) closeStore();
                    },
                    [&] {
                        try {
                            operation();
                        } catch (const std::bad_alloc &) {
                            threw = true;
                        }
                    },
                    [&](bool failed) { check(failed, threw); });
                CHECK(failures >= 0);
                prepare();
                CHECK(openFiles() == files);
                told += " " + std::to_string(failures);
            }
        }
        CHECK(filesSetAside() == 0);
        MESSAGE(told << " failures of allocations, store memory, statements, store files and files");
    }
};

// Writes the parameter and dies in the n-th of a kind. Exit status 0 if it came through.
const test::Helper dieWriting("die-writing", [](const std::vector<std::string> &arguments) {
    const Bytes after(50, 2);
    const WideString parameters = toWide(arguments.at(0));
    test::armFault(static_cast<FaultKind>(std::atoi(arguments.at(1).c_str())), std::atoi(arguments.at(2).c_str()),
                   test::FaultEffect::death);
    const bool written = WriteParameter(nullptr, parameters, 2, 3, -1, after, {}, false, nullptr);
    test::disarmFault();
    return written ? 0 : 1;
});

}  // namespace

TEST_CASE_FIXTURE(Fixture,
                  "a parameter's write that fails anywhere leaves the old value with its stamp or the new one with its own") {
    bool result = false;
    uint64_t written = 0;
    failAll(
        "overwrite:", [&] { writeBefore(); },
        [&] {
            result = false;
            written = 0;
            result = write(2, 3, after, &written);
        },
        [&](bool failed, bool threw) {
            if (result) {
                CHECK(holdsAfter(written));
            } else {
                CHECK(failed);
                CHECK((holdsBefore() || holdsAfter(written)));
            }
            if (threw) CHECK(holdsBefore());
        },
        true);
    failAll(
        "first write:", [&] { forget(); },
        [&] {
            result = false;
            written = 0;
            result = write(2, 3, after, &written);
        },
        [&](bool failed, bool) {
            const bool nothing = dataOf(store_name::data).empty() && stamp() == 0;
            if (result) CHECK(holdsAfter(written));
            if (!result) CHECK(failed);
            CHECK((nothing || holdsAfter(written)));
        });
}

TEST_CASE_FIXTURE(Fixture, "a write that fails at a step says in the log at which") {
    const vxcomn::testing::DebugCapture capture;
    const test::Logger logger;
    const WideString id = VX_TEXT("{A}");
    test::failEach(
        FaultKind::statement, [&] { forget(); },
        [&] {
            WriteParameter(&logger, parameters, 2, 3, -1, after, {{}, id}, false, nullptr);
        },
        [](bool) {});
    const std::string key = toUtf8(parameters);
    CHECK(test::said(capture, "Failed to open reg key: " + key + " with error code 112") > 0);
    CHECK(test::said(capture, "Failed to create reg value: 2 with error code 112") > 0);
    for (const char *part : {"Data", "Source", "Time", "WriteTime"}) {
        CHECK(test::said(capture, "Failed to create '" + std::string(part) + "' reg value with error code 112") > 0);
    }
}

TEST_CASE_FIXTURE(Fixture, "a read that fails anywhere says so and leaves the buffer's size alone") {
    writeBefore();
    uint8_t buffer[64];
    uint32_t size = 0;
    Status result = status::ok;
    failAll(
        "read:", [] {},
        [&] {
            size = sizeof buffer;
            result = status::genFailure;
            setLastError(status::ok);
            result = ReadParameterValue(parameters, 2, 3, buffer, size, nullptr, nullptr);
        },
        [&](bool failed, bool threw) {
            if (result == status::ok) {
                CHECK(size == before.size());
                CHECK(Bytes(buffer, buffer + size) == before);
            } else {
                CHECK(failed);
                CHECK(size == sizeof buffer);
                CHECK(result != status::fileNotFound);  // it is there
                if (!threw) CHECK(lastError() == result);
            }
        },
        true);
    CHECK(holdsBefore());
}

TEST_CASE_FIXTURE(Fixture, "a text of a key that is written, read or deleted with a failure is the old or the new one") {
    const WideString first = VX_TEXT("first text"), second = VX_TEXT("second text");
    const auto text = [&] {
        WideString found;
        return GetRegString(configuration, VX_TEXT("v"), found) == status::ok ? found : WideString();
    };
    const auto prepare = [&] { REQUIRE(SetRegString(configuration, VX_TEXT("v"), &first) == status::ok); };
    Status result = status::ok;
    failAll(
        "set text:", prepare,
        [&] {
            result = status::genFailure;
            result = SetRegString(configuration, VX_TEXT("v"), &second);
        },
        [&](bool failed, bool) {
            CHECK((result == status::ok || failed));
            CHECK((text() == second || (result != status::ok && text() == first)));
        });
    failAll(
        "delete text:", prepare,
        [&] {
            result = status::genFailure;
            result = SetRegString(configuration, VX_TEXT("v"), nullptr);
        },
        [&](bool failed, bool) {
            CHECK((result == status::ok || failed));
            CHECK((text().empty() || (result != status::ok && text() == first)));
        });
    WideString read;
    failAll(
        "get text:", prepare,
        [&] {
            result = status::genFailure;
            read = VX_TEXT("before");
            result = GetRegString(configuration, VX_TEXT("v"), read);
        },
        [&](bool failed, bool) {
            CHECK((result == status::ok || failed));
            CHECK(read == (result == status::ok ? first : WideString(VX_TEXT("before"))));
        });
}

TEST_CASE_FIXTURE(Fixture, "a tree that is deleted with a failure is there whole or not at all") {
    const auto count = [&] {
        std::vector<WideString> names;
        RegistryKey key;
        if (RegistryKey::open(kMachine, parameters, RegistryAccess::read, key) != status::ok) return size_t{0};
        REQUIRE(key.subkeys(names) == status::ok);
        return names.size();
    };
    bool result = false;
    failAll(
        "delete tree:",
        [&] {
            for (int32_t component = 0; component < 3; ++component) REQUIRE(write(component, 1, before));
        },
        [&] {
            result = false;
            result = DeleteRegKeyTree(configuration, false);
        },
        [&](bool failed, bool) {
            CHECK((result || failed));
            CHECK((count() == 0 || (!result && count() == 3)));
        });
}

TEST_CASE_FIXTURE(Fixture, "a value that is deleted with a failure is there whole or not at all") {
    failAll(
        "delete value:", [&] { writeBefore(); }, [&] { deleteParameterValue(parameters, VX_TEXT("2"), VX_TEXT("3")); },
        [&](bool failed, bool) {
            const bool gone = dataOf(store_name::data).empty() && stamp() == 0;
            CHECK((gone || (failed && holdsBefore())));
        });
}

TEST_CASE_FIXTURE(Fixture, "an instance that is made with a failure is whole, or says what it lacks, or is not made") {
    WideString name;
    failAll(
        "instance:", [] {},
        [&] {
            name.clear();
            CInstanceIDBase instance;
            const GlobalMutexLock lock(instance.InstanceMutex);
            if (lock.acquired()) name = VX_TEXT("Global\\") + instance.InstanceId;
        },
        [&](bool failed, bool) {
            CHECK((!name.empty() || failed));
            if (!name.empty()) CHECK_FALSE(NamedMutex::exists(name));  // it went with the instance
        });
}

TEST_CASE_FIXTURE(Fixture,
                  "a process that dies in any statement or file operation of a write leaves the old state or the new one") {
    for (const FaultKind kind : {FaultKind::statement, FaultKind::storeFile, FaultKind::file}) {
        int n = 1, wrong = 0;
        for (;; ++n) {
            writeBefore();
            closeStore();
            test::Process writer =
                test::startHelper("die-writing", {toUtf8(parameters), std::to_string(static_cast<int>(kind)), std::to_string(n)});
            const int result = writer.wait();
            if (!holdsBefore() && !holdsAfter(0)) ++wrong;
            if (result != -1) {
                CHECK(result == 0);
                CHECK(holdsAfter(0));
                break;
            }
        }
        CHECK(wrong == 0);
        CHECK(filesSetAside() == 0);
        MESSAGE("died in " << n - 1 << " places of kind " << static_cast<int>(kind) << ", " << wrong << " neither old nor new");
    }
}
