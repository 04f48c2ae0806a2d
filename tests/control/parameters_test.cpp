// SPDX-License-Identifier: MIT
//
// The engine's own parameters: written, read and reset through the exported functions.
#include "tests/control/open_slot.h"

#include <cstring>

#include "platform/guid.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const Bytes kData = {1, 2, 3, 4, 5};

struct TwoConfigurations : OpenSlot {
    TwoConfigurations() { SampleMachine::putPreset(orloPreset(), "EFX", "Headphones"); }
};

std::vector<std::string> valueNames(const WideString &parameterKey, const char *component, const char *subkey) {
    RegistryKey key;
    std::vector<std::string> texts;
    if (RegistryKey::open(RegistryRoot::localMachine, parameterKey + toWide(std::string("\\") + component + "\\" + subkey),
                          RegistryAccess::read, key) != status::ok) {
        return texts;
    }
    std::vector<WideString> names;
    key.values(names);
    for (const WideString &name : names) texts.push_back(toUtf8(name));
    return texts;
}

}  // namespace

TEST_CASE_FIXTURE(OpenSlot, "a raw parameter is written with source and stamp, and read back") {
    GUID id = {};
    uint64_t time = 0;
    CHECK(VXAPOCOMAPI_SetUserParameterEx(handle(), 4, 77, -1, kData.data(), 5, 0, 0, &id, &time) == 1);
    CHECK(id == context().InstanceGuid);
    CHECK(time != 0);
    CHECK(stored(4, 77) == kData);
    Bytes room(10);
    uint32_t size = 10;
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 4, 77, -1, room.data(), &size, nullptr, nullptr) == 1);
    CHECK(size == 5);
    CHECK(Bytes(room.begin(), room.begin() + 5) == kData);
    RegistryKey component;
    uint64_t stamp = 0;
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, context().ParamRegKeyName.get() + VX_TEXT("\\4\\Time"),
                              RegistryAccess::read, component) == status::ok);
    CHECK(component.readU64(VX_TEXT("77"), stamp) == RegistryRead::value);
    CHECK(stamp == time);
}

TEST_CASE_FIXTURE(OpenSlot, "the channel is stored nowhere") {
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 78, 0, kData.data(), 5, 0) == 1);
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 78, 5, kData.data(), 2, 0) == 1);
    CHECK(stored(4, 78) == Bytes{1, 2});
}

TEST_CASE_FIXTURE(OpenSlot, "a transient parameter's value has the client's instance id in its name") {
    CHECK(VXAPOCOMAPI_SetParameterEx(handle(), 4, 79, -1, kData.data(), 5, 0, 1, nullptr, nullptr) == 1);
    const std::string name = "79," + toUtf8(context().InstanceId);
    for (const char *subkey : {"Data", "Time", "Source"}) {
        CHECK(contains(valueNames(context().ParamRegKeyName.get(), "4", subkey), name));
    }
    CHECK(stored(4, 79).empty());
}

TEST_CASE_FIXTURE(TwoConfigurations, "a global write goes to every key of the slot, a write to none is a success") {
    CHECK(VXAPOCOMAPI_SetUserParameterEx(handle(), 4, 80, -1, kData.data(), 5, 1, 0, nullptr, nullptr) == 1);
    CHECK(storedAt(SampleMachine::parametersPath(), 4, 80) == kData);
    CHECK(storedAt(SampleMachine::parametersPath("VXORLO", "Headphones"), 4, 80) == kData);
    SampleMachine::removePreset();
    SampleMachine::removePreset("EFX", "Headphones");
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 81, -1, kData.data(), 5, 1) == 1);
    CHECK(stored(4, 81).empty());
}

TEST_CASE_FIXTURE(OpenSlot, "data of 65,536 bytes is taken, a byte more and data that is nowhere are refused") {
    const Bytes large(65537, 9);
    VXAPOCOMAPI_SetLastError(handle(), -2);
    CHECK(VXAPOCOMAPI_SetUserParameterEx(handle(), 4, 82, -1, large.data(), 65536, 0, 0, nullptr, nullptr) == 1);
    CHECK(stored(4, 82).size() == 65536);
    const std::string path = toUtf8(context().ParamRegKeyName.get());
    const auto lines = linesOf(
        [&] { CHECK(VXAPOCOMAPI_SetUserParameterEx(handle(), 4, 83, -1, large.data(), 65537, 0, 0, nullptr, nullptr) == 0); });
    CHECK(contains(lines, "Failed to set parameter with path " + path));
    CHECK(VXAPOCOMAPI_SetParameterEx(handle(), 4, 83, -1, nullptr, 1, 0, 0, nullptr, nullptr) == 0);
    CHECK(VXAPOCOMAPI_SetParameterEx(handle(), 4, 83, -1, nullptr, 0xFFFFFFFF, 1, 0, nullptr, nullptr) == 0);
    CHECK(stored(4, 83).empty());
    CHECK(VXAPOCOMAPI_SetParameterEx(handle(), 4, 84, -1, nullptr, 0, 0, 0, nullptr, nullptr) == 1);
    CHECK(error() == -2);
}

TEST_CASE_FIXTURE(NoSlot, "a raw write without a slot fails, and tells the identity all the same") {
    GUID id = {};
    const auto lines =
        linesOf([&] { CHECK(VXAPOCOMAPI_SetParameterEx(handle(), 1, 2, -1, kData.data(), 5, 0, 0, &id, nullptr) == 0); });
    CHECK(contains(lines, "Empty param reg key received"));
    CHECK(contains(lines, "Failed to set parameter with path "));
    CHECK(id == context().InstanceGuid);
    uint32_t size = 4;
    uint8_t room[4];
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 1, 2, -1, room, &size, nullptr, nullptr) == 0);
}

TEST_CASE_FIXTURE(OpenSlot, "a raw read of what neither store nor preset holds fails, as one into too small a room does") {
    uint8_t room[4];
    uint32_t size = 4;
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 9, 9, -1, room, &size, nullptr, nullptr) == 0);
    CHECK(size == 4);
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 9, 9, -1, kData.data(), 5, 0) == 1);
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 9, 9, -1, room, &size, nullptr, nullptr) == 0);
    CHECK(stored(9, 9) == kData);
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 9, 9, -1, nullptr, &size, nullptr, nullptr) == 0);
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 9, 9, -1, room, nullptr, nullptr, nullptr) == 0);
}

TEST_CASE_FIXTURE(OpenSlot, "raw writes and reads inside others of their kind are turned away") {
    uint8_t room[8];
    uint32_t size = 8;
    context().InSetUserParameterEx = 1;
    context().InGetUserParameterEx = 1;
    CHECK(
        contains(linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameterEx(handle(), 4, 1, -1, room, 1, 0, 0, nullptr, nullptr) == 0); }),
                 "Triggered re-entry check, exiting..."));
    CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 4, 1, -1, room, &size, nullptr, nullptr) == 0); }),
                   "Triggered re-entry check, exiting..."));
    // The exported write has no such check: it is for callers inside.
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 1, -1, kData.data(), 5, 0) == 1);
    context().InSetUserParameterEx = 0;
    context().InGetUserParameterEx = 0;
    CHECK(VXAPOCOMAPI_GetUserParameterEx(handle(), 4, 1, -1, room, &size, nullptr, nullptr) == 1);
}

TEST_CASE_FIXTURE(OpenSlot, "raw calls are traced with their arguments, the exported write is not") {
    uint8_t room[8] = {};
    uint32_t size = 8;
    const auto set = linesOf([&] { VXAPOCOMAPI_SetUserParameterEx(handle(), 4, -5, -1, room, 3, 1, 1, nullptr, nullptr); });
    REQUIRE_FALSE(set.empty());
    CHECK(set.front().rfind("{ VXAPOCOMAPI_SetUserParameterEx(apoComHandle = 0x", 0) == 0);
    CHECK(set.front().find(", componentId = 4, paramId = -5, dataSize = 3, IsGlobal = 1, isTransient = 1") != std::string::npos);
    const auto get = linesOf([&] { VXAPOCOMAPI_GetUserParameterEx(handle(), -1, -2, -1, room, &size, nullptr, nullptr); });
    REQUIRE_FALSE(get.empty());
    CHECK(get.front().find(", componentId = -1, paramId = -2, *dataSize = 8") != std::string::npos);
    CHECK(linesOf([&] { VXAPOCOMAPI_SetParameter(handle(), 4, -5, -1, room, 3, 0); }).empty());
}

TEST_CASE_FIXTURE(OpenSlot, "resetting one parameter takes back that one alone") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL, 0.5F) == 1);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL, 0.5F) == 1);
    for (const int32_t globally : {0, 1}) {
        VXAPOCOMAPI_SetLastError(handle(), -2);
        CHECK(VXAPOCOMAPI_ResetUserParameter(handle(), 0, -12, globally) == 1);
        CHECK(error() == 0);
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == 0.8F);
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL) == 0.5F);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a parameter that the preset doesn't hold keeps its value in its reset") {
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 90, -1, kData.data(), 5, 0) == 1);
    CHECK(VXAPOCOMAPI_ResetUserParameter(handle(), 4, 90, 0) == 1);
    CHECK(stored(4, 90) == kData);
}

TEST_CASE_FIXTURE(OpenSlot, "resetting all takes back every parameter of the key and leaves the power on") {
    SampleValues off = SampleValues::usual();
    off.blocks.front().values.front() = {0};
    SampleMachine::putPreset(orloPreset(off), "MFX");
    CHECK(VXAPOCOMAPI_SetAPOType(handle(), "MFX") == 1);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_POWER_ON) == 0.0F);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL, 0.5F) == 1);
    CHECK(VXAPOCOMAPI_SetParameter(handle(), 4, 91, -1, kData.data(), 5, 0) == 1);
    CHECK(VXAPOCOMAPI_ResetUserParametersEx(handle(), 0) == 1);
    CHECK(error() == 0);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == 0.8F);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_POWER_ON) == 1.0F);
    CHECK(stored(4, 91).empty());
}

TEST_CASE_FIXTURE(TwoConfigurations, "a reset of one key leaves the others, the one without that says so is global") {
    const WideString other = SampleMachine::parametersPath("VXORLO", "Headphones");
    storeAt(other, 4, 92, kData);
    CHECK(VXAPOCOMAPI_ResetUserParametersEx(handle(), 0) == 1);
    CHECK(storedAt(other, 4, 92) == kData);
    CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_ResetUserParameters(handle()) == 1); }),
                   "Deleting content of 'HKLM\\Software\\Ondrevale\\APO' registry key"));
    CHECK(storedAt(other, 4, 92).empty());
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_POWER_ON) == 1.0F);
}

TEST_CASE_FIXTURE(NoSlot, "resets without a slot fail with -9") {
    const auto one = linesOf([&] { CHECK(VXAPOCOMAPI_ResetUserParameter(handle(), 0, -12, 0) == 0); });
    CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    CHECK(contains(one, "Error: -9"));
    VXAPOCOMAPI_SetLastError(handle(), 0);
    CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_ResetUserParameters(handle()) == 0); }), "Error: -9"));
    CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
}

TEST_CASE_FIXTURE(OpenSlot, "bad handles do nothing in raw calls and resets either") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    int something = 0;
    uint8_t room[4] = {};
    uint32_t size = 4;
    for (VXAPOHandle bad : {static_cast<VXAPOHandle>(nullptr), static_cast<VXAPOHandle>(&something), client->api}) {
        CHECK(VXAPOCOMAPI_SetParameter(bad, 0, 0, 0, room, 4, 0) == 0);
        CHECK(VXAPOCOMAPI_SetParameterEx(bad, 0, 0, 0, room, 4, 0, 0, nullptr, nullptr) == 0);
        CHECK(VXAPOCOMAPI_SetUserParameterEx(bad, 0, 0, 0, room, 4, 0, 0, nullptr, nullptr) == 0);
        CHECK(VXAPOCOMAPI_GetUserParameterEx(bad, 0, 0, 0, room, &size, nullptr, nullptr) == 0);
        CHECK(VXAPOCOMAPI_ResetUserParameter(bad, 0, 0, 0) == 0);
        CHECK(VXAPOCOMAPI_ResetUserParameters(bad) == 0);
        CHECK(VXAPOCOMAPI_ResetUserParametersEx(bad, 1) == 0);
    }
    CHECK(error() == -2);
}
