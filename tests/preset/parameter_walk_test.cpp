// SPDX-License-Identifier: MIT
#include "preset/parameter_walk.h"

#include <doctest/doctest.h>

#include "platform/guid.h"
#include "preset/store_value_name.h"
#include "tests/preset/walk_host.h"

using namespace vxcomn;
using test::Delivered;

namespace {

using List = std::vector<Delivered>;

struct Walk : test::SlotKeys {
    test::WalkHost host{*this};
    test::TaggedLog log{host};
};

std::string utf8(const WideString &text) {
    return toUtf8(text);
}

bool sameGuid(const GUID &left, const GUID &right) {
    return std::memcmp(&left, &right, sizeof(GUID)) == 0;
}

}  // namespace

TEST_CASE_FIXTURE(Walk, "what was written is delivered once, with its source and its stamp") {
    const test::SlotClient client(*this);
    const uint64_t first = writeFrom(client.source(), 3, -12, {1, 2, 3, 4}, false);
    const uint64_t second = write(-1, 7, {9});
    CHECK(host.walk() == List{{-1, 7, {9}}, {3, -12, {1, 2, 3, 4}}});
    const Change &seeded = host.ParamChanges.begin()->second, &written = host.ParamChanges.rbegin()->second;
    CHECK(written.time == first);
    CHECK(sameGuid(written.source, client.InstanceGuid));
    CHECK(seeded.time == second);
    CHECK(sameGuid(seeded.source, GUID{}));
    CHECK(host.ParamChanges.begin()->first.channel == INT32_MIN);
    CHECK(host.walk().empty());
    // Equal data is news all the same.
    write(-1, 7, {9});
    CHECK(host.walk() == List{{-1, 7, {9}}});
    CHECK(host.walk().empty());
}

TEST_CASE_FIXTURE(Walk, "a forced walk delivers everything again") {
    const test::SlotClient client(*this);
    write(0, 1, {1});
    writeFrom(client.source(), 0, 2, {2, 2}, true);
    const List all = {{0, 1, {1}}, {0, 2, {2, 2}, true}};
    CHECK(host.walk() == all);
    CHECK(host.walk().empty());
    CHECK(host.walk(true) == all);
    CHECK(host.walk().empty());
}

TEST_CASE_FIXTURE(Walk, "once the stamps are reset every value counts as new, the clients' own ones too") {
    const test::SlotClient client(*this);
    write(0, 1, {1});
    writeFrom(client.source(), 0, 2, {2, 2}, true);
    const List all = host.walk();
    REQUIRE(all.size() == 2);
    host.ResetLastParamTime();
    CHECK(host.walk() == all);
    CHECK(host.walk().empty());
}

TEST_CASE_FIXTURE(Walk, "two changes between two walks: the walk sees the last only, of whatever size") {
    write(2, 5, {1, 1, 1});
    write(2, 5, {2});
    CHECK(host.walk() == List{{2, 5, {2}}});
}

TEST_CASE_FIXTURE(Walk, "two changes with different sizes that two walks saw are one delivery each") {
    write(2, 5, {1, 1, 1});
    CHECK(host.walk() == List{{2, 5, {1, 1, 1}}});
    write(2, 5, {2});
    CHECK(host.walk() == List{{2, 5, {2}}});
}

TEST_CASE_FIXTURE(Walk, "a component subkey named 32 or -5 logs the range message and is passed over") {
    for (const char *component : {"32", "-5"}) {
        part(component, "Data").setBytes(VX_TEXT("1"), std::vector<uint8_t>{1});
        part(component, "Time").setU64(VX_TEXT("1"), freshStamp());
        stamp(component);
    }
    write(31, 1, {31});
    write(-4, 1, {4});
    CHECK(host.walk() == List{{-4, 1, {4}}, {31, 1, {31}}});
    CHECK(log.count("Component id is out of range (32)!") == 1);
    CHECK(log.count("Component id is out of range (-5)!") == 1);
}

TEST_CASE_FIXTURE(Walk, "parameters 257 and -65 log the range message and are passed over; 256 and -64 are accepted") {
    for (const int32_t param : {257, -65, 256, -64}) write(4, param, {1});
    CHECK(host.walk() == List{{4, -64, {1}}, {4, 256, {1}}});
    CHECK(log.count("Parameter id is out of range (257)!") == 1);
    CHECK(log.count("Parameter id is out of range (-65)!") == 1);
}

TEST_CASE_FIXTURE(Walk, "names of every kind below a parameter key stop nothing") {
    const test::SlotClient client(*this);
    const std::string id = utf8(client.InstanceId);
    for (const char *component : {"abc", "007", "+5", " 5", "5 ", "0x5", "99999999999999999999", "-0", "-", "5,5"}) {
        part(component, "Data").setBytes(VX_TEXT("1"), std::vector<uint8_t>{1});
        part(component, "Time").setU64(VX_TEXT("1"), freshStamp());
        stamp(component);
    }
    const std::vector<std::string> shared = {"",        "abc", "08", "+8", " 8", "8 ", "--8", "1e1", "8.0", std::string(300, '8'),
                                             "\xC3\xA9"};
    const std::vector<std::string> own = {",",
                                          "8,",
                                          "," + id,
                                          "8," + id + "x",
                                          "8,{}",
                                          "8," + id + "," + id,
                                          "08," + id,
                                          "257," + id,
                                          "1234567890123456," + id,
                                          "8,not a guid"};
    for (const auto &names : {shared, own}) {
        for (const std::string &name : names) {
            part("5", "Data").setBytes(toWide(name), std::vector<uint8_t>{1});
            part("5", "Time").setU64(toWide(name), freshStamp());
        }
    }
    write(5, 8, {7});
    stamp("5");
    CHECK(host.walk() == List{{5, 8, {7}}});
    for (const std::string &name : shared) {
        INFO(name);
        CHECK(holds("5", "Time", name));
        const bool isPlain = name.find('\xC3') == std::string::npos;  // the debugger output of Windows is not Unicode
        if (isPlain) CHECK(log.count("Parameter id is out of range (" + name + ")!") == 1);
    }
    // What names nobody who runs is taken away; what names a client but no parameter stays with it.
    for (const std::string &name : own) {
        INFO(name);
        const bool isClients = name.find(',') != std::string::npos && name.substr(name.find(',') + 1) == id;
        CHECK(holds("5", "Time", name) == isClients);
        CHECK(holds("5", "Data", name) == isClients);
    }
    CHECK(host.walk().empty());
}

TEST_CASE_FIXTURE(Walk, "values of wrong types and sizes are passed over, and the good ones beside them delivered") {
    const std::vector<uint8_t> sixteen(16, 5);
    write(1, 1, {1});
    // Stamps that are none.
    part("1", "Data").setBytes(VX_TEXT("2"), std::vector<uint8_t>{2});
    part("1", "Time").setBytes(VX_TEXT("2"), {});
    part("1", "Data").setBytes(VX_TEXT("3"), std::vector<uint8_t>{3});
    part("1", "Time").setBytes(VX_TEXT("3"), std::vector<uint8_t>(3));
    part("1", "Data").setBytes(VX_TEXT("4"), std::vector<uint8_t>{4});
    part("1", "Time").setText(VX_TEXT("4"), VX_TEXT("abc"));
    part("1", "Data").setBytes(VX_TEXT("5"), std::vector<uint8_t>{5});
    part("1", "Time").setBytes(VX_TEXT("5"), std::vector<uint8_t>(65537));
    part("1", "Data").setBytes(VX_TEXT("6"), std::vector<uint8_t>{6});
    part("1", "Time").setU32(VX_TEXT("6"), 6);
    // Sources that are none.
    write(1, 7, {7});
    part("1", "Source").setBytes(VX_TEXT("7"), std::vector<uint8_t>(15, 1));
    write(1, 8, {8});
    part("1", "Source").setText(VX_TEXT("8"), VX_TEXT("1234567"));
    write(1, 9, {9});
    part("1", "Source").setBytes(VX_TEXT("9"), sixteen);
    // Data that is none, none at all, and too much of it.
    write(1, 10, {10});
    part("1", "Data").setText(VX_TEXT("10"), VX_TEXT("x"));
    write(1, 11, {});
    write(1, 12, {12});
    part("1", "Data").deleteValue(VX_TEXT("12"));
    write(1, 13, {13});
    part("1", "Data").setBytes(VX_TEXT("13"), std::vector<uint8_t>(65537));
    write(1, 14, std::vector<uint8_t>(65536, 14));
    stamp("1");

    CHECK(host.walk() ==
          List{{1, 11, {}}, {1, 1, {1}}, {1, 7, {7}}, {1, 8, {8}}, {1, 9, {9}}, {1, 14, std::vector<uint8_t>(65536, 14)}});
    for (const auto &[key, change] : host.ParamChanges) {
        INFO(key.paramId);
        CHECK((std::memcmp(&change.source, sixteen.data(), 16) == 0) == (key.paramId == 9));
    }
    CHECK(log.count("Failed to read param data from the registry with error code 1630 (10)") == 1);
    CHECK(log.count("Failed to read param data from the registry with error code 2 (12)") == 1);
    CHECK(log.count("Failed to read param data from the registry with error code 234 (13)") == 1);
    // The failed ones come when they are written well.
    write(1, 12, {12});
    write(1, 13, {13});
    CHECK(host.walk() == List{{1, 12, {12}}, {1, 13, {13}}});
}

TEST_CASE_FIXTURE(Walk, "a parameter key whose stamp is no stamp is not looked into, and a component likewise") {
    write(0, 1, {1});
    write(2, 1, {2});
    open(parameters + VX_TEXT("\\2")).setText(store_name::writeTime, VX_TEXT("12345678"));
    open(parameters).setU32(store_name::writeTime, 5);
    CHECK(host.walk().empty());
    open(parameters).setBytes(store_name::writeTime, std::vector<uint8_t>(8, 5));
    CHECK(host.walk() == List{{0, 1, {1}}});
    open(parameters).deleteValue(store_name::writeTime);
    CHECK(host.walk(true).empty());
    CHECK(log.count("Done") == 3);
}

TEST_CASE_FIXTURE(Walk, "a component without Source is delivered with a zero source, one without Time or Data says so") {
    write(0, 1, {1});
    REQUIRE_FALSE(holds("0", "Source", "1"));
    for (const auto &[component, missing] : {std::pair{"1", VX_TEXT("Time")}, {"2", VX_TEXT("Data")}}) {
        write(std::stoi(component), 1, {1});
        REQUIRE(open(parameters + toWide("\\") + toWide(component)).deleteTreeBelow(missing) == status::ok);
    }
    CHECK(host.walk() == List{{0, 1, {1}}});
    CHECK(sameGuid(host.ParamChanges.begin()->second.source, GUID{}));
    const std::string path = "Failed to  retrieve parameter Time/Data values under registry key HKLM\\" + utf8(parameters);
    CHECK(log.count(path + "\\1") == 1);
    CHECK(log.count(path + "\\2") == 1);
}

TEST_CASE_FIXTURE(Walk, "a shared value and private values of one parameter stand beside each other") {
    const test::SlotClient one(*this), two(*this);
    write(6, 3, {1});
    writeFrom(one.source(), 6, 3, {2, 2}, true);
    writeFrom(two.source(), 6, 3, {3, 3, 3}, true);
    CHECK(host.walk() == List{{6, 3, {1}}, {6, 3, {2, 2}, true}, {6, 3, {3, 3, 3}, true}});
    CHECK(sameGuid(std::next(host.ParamChanges.begin(), 1)->second.source, one.InstanceGuid));
    CHECK(sameGuid(std::next(host.ParamChanges.begin(), 2)->second.source, two.InstanceGuid));
    for (const auto &name : {WideString(VX_TEXT("3")), VX_TEXT("3,") + one.InstanceId, VX_TEXT("3,") + two.InstanceId}) {
        CHECK(holds("6", "Data", utf8(name)));
    }
    writeFrom(two.source(), 6, 3, {4, 4, 4}, true);
    CHECK(host.walk() == List{{6, 3, {4, 4, 4}, true}});
}

TEST_CASE_FIXTURE(Walk,
                  "a shared and a private value of one size meet in one entry: the first one's source, the later one's data") {
    const test::SlotClient client(*this);
    writeFrom(client.source(), 6, 3, {2}, true);
    write(6, 3, {1});
    CHECK(host.walk() == List{{6, 3, {1}, true}});
    CHECK(sameGuid(host.ParamChanges.begin()->second.source, client.InstanceGuid));
}

TEST_CASE_FIXTURE(Walk, "a client's death removes its private values at the next walk, and the shared ones are delivered again") {
    write(6, 3, {1});
    write(6, 4, {9});
    write(7, -2, {5});
    const uint64_t stampOfShared = write(7, 2, {6});
    std::string id;
    {
        const test::SlotClient client(*this);
        id = utf8(client.InstanceId);
        writeFrom(client.source(), 6, 3, {2, 2}, true);
        writeFrom(client.source(), 7, 2, {3, 3}, true);
        writeFrom(client.source(), 7, 9, {4, 4}, true);
        CHECK(host.walk().size() == 7);
    }
    CHECK(host.walk() == List{{6, 3, {1}}, {7, 2, {6}}});
    CHECK(host.ParamChanges.rbegin()->second.time == stampOfShared);
    for (const char *part : {"Data", "Time", "Source"}) {
        CHECK_FALSE(holds("6", part, "3," + id));
        CHECK_FALSE(holds("7", part, "2," + id));
        CHECK_FALSE(holds("7", part, "9," + id));
    }
    CHECK(holds("6", "Data", "3"));
    RegistryValue value;
    CHECK(RegistryKey::queryAt(test::kMachine, clients, toWide(id), value) == status::fileNotFound);
    CHECK(log.count("Client with id " + id + " is not running, disposing registry entry HKLM\\" + utf8(clients) + " ...") == 1);
    CHECK(log.count("Done.") == 1);
    // A parameter that only the client had a value of has no shared one.
    CHECK(log.count("Failed to read param data from the registry with error code 2 (9)") == 1);
    CHECK(host.walk().empty());
}

TEST_CASE_FIXTURE(Walk, "private values of somebody who was never known are removed, too") {
    GUID stranger;
    REQUIRE(newGuid(stranger));
    const WideString id = guidText(stranger);
    writeFrom({stranger, id}, 0, 1, {1}, true);
    CHECK(host.walk().empty());
    CHECK_FALSE(holds("0", "Data", "1," + utf8(id)));
}

TEST_CASE_FIXTURE(Walk, "a client that comes in the middle of a walk keeps what it writes, and it is delivered") {
    host.walk();
    WalkMemory memory;
    PendingChanges changes;
    ParameterWalk walk(host, memory, changes, false);
    write(0, 2, {2});
    const test::SlotClient early(*this);
    walk.lookAtClients(configuration);
    const test::SlotClient late(*this);
    writeFrom(late.source(), 0, 1, {1}, true);
    walk.lookAtParameters(parameters, nullptr);
    CHECK(test::deliveredIn(changes) == List{{0, 1, {1}, true}, {0, 2, {2}}});
    CHECK(holds("0", "Data", "1," + utf8(late.InstanceId)));
    // Who lives without a mark is no client of the slot.
    const CInstanceIDBase stranger;
    writeFrom({stranger.InstanceGuid, stranger.InstanceId}, 0, 1, {1}, true);
    walk.lookAtParameters(parameters, nullptr);
    CHECK_FALSE(holds("0", "Data", "1," + utf8(stranger.InstanceId)));
}

TEST_CASE_FIXTURE(Walk, "behind a deleted mark one is passed over in this walk and met in the next") {
    std::vector<std::string> dead;
    for (int i = 0; i < 4; ++i) {
        const test::SlotClient client(*this);
        dead.push_back(utf8(client.InstanceId));
    }
    const auto left = [&] {
        std::vector<WideString> names;
        REQUIRE(open(clients).values(names) == status::ok);
        return std::count_if(names.begin(), names.end(), [](const WideString &name) { return name.front() == VXWCHAR{'{'}; });
    };
    host.walk();
    const auto behindFirst = left();
    CHECK(behindFirst > 0);
    CHECK(behindFirst < 4);
    for (int i = 0; i < 3; ++i) host.walk();
    CHECK(left() == 0);
    CHECK(log.texts().size() > 0);
    for (const std::string &id : dead) {
        CHECK(log.count("Client with id " + id + " is not running, disposing registry entry HKLM\\" + utf8(clients) + " ...") == 1);
    }
}

TEST_CASE_FIXTURE(Walk, "a client that lives keeps its private values although the mark ahead of it was deleted") {
    std::vector<std::unique_ptr<test::SlotClient>> all;
    for (int i = 0; i < 6; ++i) all.push_back(std::make_unique<test::SlotClient>(*this));
    for (const auto &client : all) writeFrom(client->source(), 0, 1, {1}, true);
    for (size_t i = 0; i < all.size(); i += 2) all[i].reset();
    for (int i = 0; i < 4; ++i) host.walk();
    for (size_t i = 1; i < all.size(); i += 2) CHECK(holds("0", "Data", "1," + utf8(all[i]->InstanceId)));
    std::vector<WideString> names;
    REQUIRE(open(clients).values(names) == status::ok);
    CHECK(names.size() == 3 + 1);  // with WriteTime
}

TEST_CASE_FIXTURE(Walk, "the command to clean the buffers is delivered once and no longer stands in the store behind the walk") {
    write(0, -6, {1});
    host.CleanProcBuffers();
    REQUIRE(holds("-1", "Data", "-33"));
    CHECK(host.walk() == List{{-1, -33, {1}}, {0, -6, {1}}});
    for (const char *part : {"Data", "Time", "Source"}) CHECK_FALSE(holds("-1", part, "-33"));
    CHECK(host.walk().empty());
    CHECK(host.walk(true) == List{{0, -6, {1}}});
    host.CleanProcBuffers();
    CHECK(host.walk() == List{{-1, -33, {1}}});
    // Parameter -33 of another component is a value like others.
    write(0, -33, {1});
    CHECK(host.walk() == List{{0, -33, {1}}});
    CHECK(holds("0", "Data", "-33"));
}

TEST_CASE_FIXTURE(Walk, "missing keys are told, the hook is called at each end") {
    host.UpdateParametersFromRegistry(true, false);
    CHECK(log.count("Failed to open registry key HKLM\\" + utf8(clients) + " to check for endpoint's clients") == 1);
    CHECK(log.count("{ UpdateParamsFromRegistry()") == 1);
    CHECK(log.count("Failed to open registry key HKLM\\" + utf8(parameters) + " to check for new parameters") == 1);
    CHECK(log.count("Done") == 0);
    host.ParamRegKeyName.set({});
    host.UpdateParametersFromRegistry(false, true);
    REQUIRE(host.polls.size() == 2);
    CHECK(host.polls[0].wokenByRegistry);
    CHECK_FALSE(host.polls[1].wokenByRegistry);
    CHECK(log.count("Failed to open registry key HKLM\\" + utf8(clients) + " to check for endpoint's clients") == 1);
    host.CleanProcBuffers();  // nowhere to write to
    CHECK_FALSE(log.has("Empty param reg key received"));
}

TEST_CASE_FIXTURE(Walk, "a walk that finds something says what it looks at") {
    const uint64_t written = write(0, 1, {1});
    host.walk();
    CHECK(log.count("ParamRegKeyName = " + utf8(parameters)) == 1);
    CHECK(log.count("Receiving new parameters from the registry with timestamp " + std::to_string(written) +
                    " (previous timestamp 0)...") == 1);
    CHECK(log.count("Done") == 1);
    const std::vector<std::string> texts = log.texts();
    CHECK(std::any_of(texts.begin(), texts.end(), [&](const std::string &text) {
        return text.rfind("{ UpdateParametersFromRegistry(ParamRegKeyName = " + utf8(parameters) + ", GlobalMutex = 0x", 0) == 0;
    }));
}

TEST_CASE("a number is read as it is written, and nothing else is one") {
    for (const int32_t number : {0, 1, -1, 9, 10, -64, 256, 2147483647, -2147483647 - 1}) {
        CHECK(parseDecimal(toWide(std::to_string(number))) == number);
    }
    for (const char *text : {"", "-", "-0", "00", "01", "+1", " 1", "1 ", "1a", "a1", "--1", "1-", "1.", "2147483648",
                             "-2147483649", "99999999999999", "999999999999999", "9999999999999999", "\xD9\xA1"}) {
        INFO(text);
        CHECK(parseDecimal(toWide(text)) == std::nullopt);
    }
    CHECK(parseDecimal(WideString(1, VXWCHAR{0})) == std::nullopt);
}

TEST_CASE("a value's name is a number, or a number, a comma and a client") {
    GUID client;
    REQUIRE(newGuid(client));
    const StoreValueName shared = parseValueName(VX_TEXT("-18"));
    CHECK(shared.paramId == -18);
    CHECK_FALSE(shared.isPrivate);
    CHECK_FALSE(shared.client);
    const StoreValueName own = parseValueName(parameterValueName(256, guidText(client)));
    CHECK(own.paramId == 256);
    CHECK(own.isPrivate);
    REQUIRE(own.client);
    CHECK(sameGuid(*own.client, client));
    CHECK(parseValueName(VX_TEXT("5,")).isPrivate);
    CHECK_FALSE(parseValueName(VX_TEXT("5,")).client);
    CHECK_FALSE(parseValueName(VX_TEXT("x,") + guidText(client)).paramId);
    CHECK(parseValueName(VX_TEXT("x,") + guidText(client)).client);
}
