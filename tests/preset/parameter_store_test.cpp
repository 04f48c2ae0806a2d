// SPDX-License-Identifier: MIT
#include "preset/parameter_store.h"
#include "preset/forced_selection.h"

#include <doctest/doctest.h>

#include <atomic>
#include <cstring>
#include <set>
#include <thread>

#include "platform/change_signal.h"
#include "platform/guid.h"
#include "platform/last_error.h"
#include "platform/named_mutex.h"
#include "tests/preset/store_fixture.h"
#include "tests/support/helper.h"

using namespace vxcomn;
using test::StoreFixture;
using vxcomn::testing::DebugCapture;
using Bytes = std::vector<uint8_t>;

namespace {

const GUID kWriter = {0x11223344, 0x5566, 0x7788, {1, 2, 3, 4, 5, 6, 7, 8}};

RegistryValue valueOf(const RegistryKey &key, const VXWCHAR *name) {
    RegistryValue value;
    key.query(name, value);
    return value;
}

uint64_t stampOf(const RegistryKey &key, const VXWCHAR *name = store_name::writeTime) {
    uint64_t stamp = 0;
    CHECK(key.readU64(name, stamp) == RegistryRead::value);
    return stamp;
}

// Says as many stamps as it is told to.
const test::Helper drawStamps("draw-stamps", [](const std::vector<std::string> &arguments) {
    std::string all;
    for (int i = 0; i < std::atoi(arguments.at(0).c_str()); ++i) all += std::to_string(freshStamp()) + " ";
    test::sayLine(all);
    return 0;
});

}  // namespace

TEST_CASE_FIXTURE(StoreFixture, "a parameter is written with data, source and time, and its stamp in both keys above") {
    const Bytes data = {1, 2, 3};
    uint64_t stamp = 0;
    const WideString id = guidText(kWriter);
    REQUIRE(WriteParameter(nullptr, parameters, 3, -18, 5, data, {kWriter, id}, false, &stamp));
    CHECK(stamp != 0);
    CHECK(stamp < uint64_t{1} << 63);
    const RegistryValue written = valueOf(open(parameters, VX_TEXT("3\\Data")), VX_TEXT("-18"));
    CHECK(written.type == RegistryType::binary);
    CHECK(written.data == data);
    const RegistryValue source = valueOf(open(parameters, VX_TEXT("3\\Source")), VX_TEXT("-18"));
    CHECK(source.type == RegistryType::binary);
    REQUIRE(source.data.size() == sizeof(GUID));
    CHECK(std::memcmp(source.data.data(), &kWriter, sizeof(GUID)) == 0);
    CHECK(valueOf(open(parameters, VX_TEXT("3\\Time")), VX_TEXT("-18")).type == RegistryType::qword);
    CHECK(stampOf(open(parameters, VX_TEXT("3\\Time")), VX_TEXT("-18")) == stamp);
    CHECK(stampOf(open(parameters, VX_TEXT("3"))) == stamp);
    CHECK(stampOf(open(parameters)) == stamp);
    CHECK(valueOf(open(parameters), store_name::writeTime).type == RegistryType::qword);
}

TEST_CASE_FIXTURE(StoreFixture, "a parameter without a source has none, and the global component is called -1") {
    REQUIRE(write(-1, 7, {9}));
    CHECK_FALSE(open(parameters, VX_TEXT("-1\\Source")));
    CHECK(valueOf(open(parameters, VX_TEXT("-1\\Data")), VX_TEXT("7")).data == Bytes{9});
}

TEST_CASE_FIXTURE(StoreFixture, "a transient value bears its client in its name") {
    const WideString id = guidText(kWriter);
    const Bytes shared = {1}, own = {2};
    REQUIRE(write(0, 4, shared));
    REQUIRE(WriteParameter(nullptr, parameters, 0, 4, -1, own, {kWriter, id}, true, nullptr));
    const RegistryKey data = open(parameters, VX_TEXT("0\\Data"));
    CHECK(valueOf(data, VX_TEXT("4")).data == shared);
    CHECK(valueOf(data, (VX_TEXT("4,") + id).c_str()).data == own);
    std::vector<WideString> names;
    for (const VXWCHAR *subkey : {VX_TEXT("0\\Source"), VX_TEXT("0\\Time")}) {
        CHECK(open(parameters, subkey).values(names) == status::ok);
        CHECK(std::count(names.begin(), names.end(), VX_TEXT("4,") + id) == 1);
    }
}

TEST_CASE_FIXTURE(StoreFixture, "a value written as transient but without a source string gets the plain name") {
    const Bytes data = {5};
    REQUIRE(WriteParameter(nullptr, parameters, 0, 4, -1, data, {kWriter, {}}, true, nullptr));
    std::vector<WideString> names;
    CHECK(open(parameters, VX_TEXT("0\\Data")).values(names) == status::ok);
    CHECK(names == std::vector<WideString>{VX_TEXT("4")});
    CHECK_FALSE(open(parameters, VX_TEXT("0\\Source")));
}

TEST_CASE_FIXTURE(StoreFixture, "two writes of one parameter with equal data have different stamps, and a watcher sees both") {
    ChangeSignal signal;
    RegistryKey root = open(kStoreRoot);
    REQUIRE(ChangeSignal::open(root, ChangeFilter::keysAndValues, signal) == status::ok);
    std::set<uint64_t> seen;
    for (int i = 0; i < 2; ++i) {
        REQUIRE(signal.arm() == status::ok);
        uint64_t stamp = 0;
        REQUIRE(write(2, 2, {1, 2}, &stamp));
        CHECK(waitForOne(signal, 5000) == WaitOutcome::signalled);
        CHECK(stampOf(open(parameters, VX_TEXT("2\\Time")), VX_TEXT("2")) == stamp);
        seen.insert(stamp);
    }
    CHECK(seen.size() == 2);
}

TEST_CASE("no stamp is given twice, to whatever thread or process") {
    constexpr int kEach = 20000, kThreads = 3, kProcesses = 3;
    std::vector<test::Process> processes;
    for (int i = 0; i < kProcesses; ++i) processes.push_back(test::startHelper("draw-stamps", {std::to_string(kEach)}));
    std::vector<std::vector<uint64_t>> drawn(kThreads);
    std::vector<std::thread> threads;
    for (auto &own : drawn) {
        threads.emplace_back([&own] {
            for (int i = 0; i < kEach; ++i) own.push_back(freshStamp());
        });
    }
    for (std::thread &thread : threads) thread.join();
    std::set<uint64_t> all;
    for (const auto &own : drawn) all.insert(own.begin(), own.end());
    for (test::Process &process : processes) {
        const auto line = process.readLine();
        REQUIRE(line);
        const char *at = line->c_str();
        for (int i = 0; i < kEach; ++i) {
            char *end = nullptr;
            all.insert(std::strtoull(at, &end, 10));
            at = end;
        }
    }
    CHECK(all.size() == size_t{kEach} * (kThreads + kProcesses));
    CHECK(*all.rbegin() < uint64_t{1} << 63);
}

TEST_CASE_FIXTURE(StoreFixture, "an empty parameter key is refused with a line in the log") {
    const DebugCapture capture;
    const test::Logger logger;
    const Bytes data = {1};
    uint64_t stamp = 77;
    CHECK_FALSE(WriteParameter(&logger, {}, 0, 0, -1, data, {}, false, &stamp));
    CHECK_FALSE(WriteParameter(nullptr, {}, 0, 0, -1, data, {}, false, nullptr));
    CHECK(test::said(capture, "Empty param reg key received") == 1);
    CHECK(stamp == 77);
}

TEST_CASE_FIXTURE(StoreFixture, "a parameter key that cannot be made is told with its name and the error") {
    const DebugCapture capture;
    const test::Logger logger;
    const Bytes data = {1};
    const WideString bad = configuration + VX_TEXT("\\") + WideString(300, VXWCHAR{'x'});
    uint64_t stamp = 77;
    CHECK_FALSE(WriteParameter(&logger, bad, 0, 0, -1, data, {}, false, &stamp));
    REQUIRE(capture.lines().size() == 1);
    CHECK(capture.lines()[0].find("Failed to open reg key: " + toUtf8(bad) + " with error code ") != std::string::npos);
    CHECK(stamp == 77);
}

TEST_CASE_FIXTURE(StoreFixture, "data of 65,536 bytes is written, and of one more refused") {
    const DebugCapture capture;
    const test::Logger logger;
    const Bytes most(65536, 7), more(65537, 7);
    CHECK(WriteParameter(&logger, parameters, 0, 1, -1, most, {}, false, nullptr));
    CHECK_FALSE(WriteParameter(&logger, parameters, 0, 1, -1, more, {}, false, nullptr));
    CHECK(test::said(capture, "Failed to create 'Data' reg value with error code 87") == 1);
    Bytes read(65536);
    auto size = static_cast<uint32_t>(read.size());
    CHECK(ReadParameterValue(parameters, 0, 1, read.data(), size, nullptr, nullptr) == status::ok);
    CHECK(size == 65536);
    CHECK(read == most);
    CHECK(WriteParameter(&logger, parameters, 0, 1, -1, {}, {}, false, nullptr));
    CHECK(ReadParameterValue(parameters, 0, 1, read.data(), size, nullptr, nullptr) == status::ok);
    CHECK(size == 0);
}

TEST_CASE_FIXTURE(StoreFixture, "a read gives the value and its size, and what fails sets the thread's last error") {
    REQUIRE(write(1, 2, {10, 20, 30}));
    uint8_t buffer[8] = {};
    uint32_t size = sizeof buffer;
    setLastError(0);
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, nullptr) == status::ok);
    CHECK(size == 3);
    CHECK(Bytes(buffer, buffer + 3) == Bytes{10, 20, 30});
    CHECK(lastError() == status::ok);

    size = 2;
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, nullptr) == status::moreData);
    CHECK(lastError() == status::moreData);
    CHECK(size == 2);
    size = sizeof buffer;
    CHECK(ReadParameterValue(parameters, 1, 3, buffer, size, nullptr, nullptr) == status::fileNotFound);
    CHECK(lastError() == status::fileNotFound);
    CHECK(ReadParameterValue(parameters, 9, 2, buffer, size, nullptr, nullptr) == status::fileNotFound);
    CHECK(ReadParameterValue(configuration, 1, 2, buffer, size, nullptr, nullptr) == status::fileNotFound);
    CHECK(size == sizeof buffer);
}

TEST_CASE_FIXTURE(StoreFixture, "source and time of a read are the leading bytes of the value itself, and the last query decides") {
    Bytes data(16);
    for (size_t i = 0; i < data.size(); ++i) data[i] = static_cast<uint8_t>(i + 1);
    REQUIRE(write(1, 2, data));
    uint8_t buffer[16] = {};
    uint32_t size = sizeof buffer;
    GUID source = {};
    uint64_t stamp = 0;
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, &source, nullptr) == status::ok);
    CHECK(std::memcmp(&source, data.data(), 16) == 0);
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, &stamp) == status::moreData);
    CHECK(std::memcmp(&stamp, data.data(), 8) == 0);
    REQUIRE(write(1, 2, {1, 2, 3, 4, 5, 6, 7, 8}));
    size = 1;
    stamp = 0;
    CHECK(ReadParameterValue(parameters, 1, 2, buffer, size, nullptr, &stamp) == status::ok);  // although the value did not fit
    CHECK(stamp == 0x0807060504030201);
    CHECK(size == 1);
}

TEST_CASE_FIXTURE(StoreFixture, "a value is deleted from data, time and source, and its neighbours stay") {
    const Bytes data = {1};
    const WideString id = guidText(kWriter);
    REQUIRE(WriteParameter(nullptr, parameters, 6, 1, -1, data, {kWriter, id}, true, nullptr));
    REQUIRE(WriteParameter(nullptr, parameters, 6, 1, -1, data, {kWriter, id}, false, nullptr));
    deleteParameterValue(parameters, VX_TEXT("6"), parameterValueName(1, id));
    for (const VXWCHAR *subkey : {VX_TEXT("6\\Data"), VX_TEXT("6\\Time"), VX_TEXT("6\\Source")}) {
        std::vector<WideString> names;
        CHECK(open(parameters, subkey).values(names) == status::ok);
        CHECK(names == std::vector<WideString>{VX_TEXT("1")});
    }
    deleteParameterValue(parameters, VX_TEXT("6"), VX_TEXT("nothing"));
    deleteParameterValue(parameters, VX_TEXT("7"), VX_TEXT("1"));
    deleteParameterValue(configuration + VX_TEXT("\\none"), VX_TEXT("7"), VX_TEXT("1"));
}

TEST_CASE_FIXTURE(StoreFixture, "a text is written with its end and a fresh stamp, read whole, and deleted with another stamp") {
    const WideString text = VX_TEXT("Caf\u00e9 {1}");
    REQUIRE(SetRegString(configuration, store_name::engineName, &text) == status::ok);
    const RegistryKey key = open(configuration);
    const RegistryValue stored = valueOf(key, store_name::engineName);
    CHECK(stored.type == RegistryType::sz);
    CHECK(stored.data.size() == (text.size() + 1) * 2);
    const uint64_t first = stampOf(key);
    WideString read;
    CHECK(GetRegString(configuration, store_name::engineName, read) == status::ok);
    CHECK(read == text);
    CHECK(SetRegString(configuration, store_name::engineName, nullptr) == status::ok);
    const uint64_t second = stampOf(key);
    CHECK(second != first);
    CHECK(GetRegString(configuration, store_name::engineName, read) == status::fileNotFound);
    CHECK(SetRegString(configuration, store_name::engineName, nullptr) == status::fileNotFound);
    CHECK(stampOf(key) == second);
}

TEST_CASE_FIXTURE(StoreFixture, "bytes are written with a fresh stamp, read into a buffer that is large enough, and deleted") {
    const Bytes bytes = {1, 2, 3, 4};
    REQUIRE(SetRegBinary(configuration, store_name::engineConfig, bytes.data(), bytes.size()) == status::ok);
    CHECK(stampOf(open(configuration)) != 0);
    uint8_t buffer[8] = {};
    uint32_t size = sizeof buffer;
    CHECK(GetRegBinary(configuration, store_name::engineConfig, buffer, size) == status::ok);
    CHECK(size == 4);
    CHECK(Bytes(buffer, buffer + 4) == bytes);
    size = 3;
    buffer[0] = 99;
    CHECK(GetRegBinary(configuration, store_name::engineConfig, buffer, size) == status::moreData);
    CHECK(size == 3);
    CHECK(buffer[0] == 99);
    CHECK(SetRegBinary(configuration, store_name::engineConfig, nullptr, 0) == status::ok);
    size = sizeof buffer;
    CHECK(GetRegBinary(configuration, store_name::engineConfig, buffer, size) == status::fileNotFound);
}

TEST_CASE("an empty key path is an invalid argument") {
    const WideString text = VX_TEXT("x");
    const Bytes bytes = {1};
    CHECK(SetRegString({}, VX_TEXT("a"), &text) == 0x80070057);
    CHECK(SetRegString({}, VX_TEXT("a"), nullptr) == 0x80070057);
    CHECK(SetRegBinary({}, VX_TEXT("a"), bytes.data(), 1) == 0x80070057);
}

TEST_CASE_FIXTURE(StoreFixture, "values of a wrong type or size are answers and do no harm") {
    RegistryKey key = open(configuration);
    const Bytes odd = {'a', 0, 'b', 0, 'c'};
    WideString text = VX_TEXT("before");
    uint8_t buffer[600] = {};
    uint32_t size = sizeof buffer;
    for (const RegistryType type : {RegistryType::dword, RegistryType::qword, RegistryType::multiSz, RegistryType::none}) {
        REQUIRE(key.set(VX_TEXT("v"), type, Bytes(8, 1)) == status::ok);
        CHECK(GetRegString(configuration, VX_TEXT("v"), text) == status::unsupportedType);
        CHECK(GetRegBinary(configuration, VX_TEXT("v"), buffer, size) == status::unsupportedType);
    }
    CHECK(text == VX_TEXT("before"));
    CHECK(size == sizeof buffer);
    REQUIRE(key.set(VX_TEXT("v"), RegistryType::sz, odd) == status::ok);
    CHECK(GetRegString(configuration, VX_TEXT("v"), text) == status::ok);
    CHECK(text == VX_TEXT("ab"));
    REQUIRE(key.set(VX_TEXT("v"), RegistryType::sz, {}) == status::ok);
    CHECK(GetRegString(configuration, VX_TEXT("v"), text) == status::ok);
    CHECK(text.empty());
    REQUIRE(key.set(VX_TEXT("v"), RegistryType::sz, Bytes(65536, 'x')) == status::ok);
    CHECK(GetRegString(configuration, VX_TEXT("v"), text) == status::ok);
    CHECK(text.size() == 32768);
    REQUIRE(key.set(VX_TEXT("v"), RegistryType::sz, Bytes(65538, 'x')) == status::ok);
    CHECK(GetRegString(configuration, VX_TEXT("v"), text) == status::moreData);
    REQUIRE(key.setBytes(VX_TEXT("v"), {}) == status::ok);
    CHECK(GetRegBinary(configuration, VX_TEXT("v"), buffer, size) == status::ok);
    CHECK(size == 0);
}

TEST_CASE_FIXTURE(StoreFixture, "a setter lives as long as somebody holds the mutex that its value names") {
    CHECK_FALSE(setterAlive(openConfiguration(configuration), store_name::engineSetter));
    GUID guid;
    REQUIRE(newGuid(guid));
    const WideString name = VX_TEXT("Global\\") + guidText(guid);
    REQUIRE(SetRegString(configuration, store_name::engineSetter, &name) == status::ok);
    CHECK_FALSE(setterAlive(openConfiguration(configuration), store_name::engineSetter));
    {
        NamedMutex mutex;
        REQUIRE(NamedMutex::create(name, mutex, MutexOwner::caller) == status::ok);
        CHECK(setterAlive(openConfiguration(configuration), store_name::engineSetter));
        mutex.release();
    }
    CHECK_FALSE(setterAlive(openConfiguration(configuration), store_name::engineSetter));
    for (const WideString &hostile : {WideString(), WideString(VX_TEXT("Global\\")), WideString(VX_TEXT("Global\\a\\..\\b")),
                                      WideString(VX_TEXT("..\\..\\x")), WideString(40000, VXWCHAR{'x'})}) {
        SetRegString(configuration, store_name::engineSetter, &hostile);
        CHECK_FALSE(setterAlive(openConfiguration(configuration), store_name::engineSetter));
    }
}
