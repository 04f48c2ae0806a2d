// SPDX-License-Identifier: MIT
//
// What choosing a slot does: the names, the client's mark, the preset and its tables, and a store that fits the preset.
#include <doctest/doctest.h>

#include "platform/guid.h"
#include "preset/parameter_store.h"
#include "tests/control/control_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;
using test::CallLog;
using test::Client;
using test::OpenEndpoint;

namespace {

constexpr PresetHash kNoPreset = {1, 2, 3, 4, 5, 6, 7, 8};

template <size_t size>
std::vector<uint8_t> bytesOf(const std::array<uint8_t, size> &bytes) {
    return {bytes.begin(), bytes.end()};
}

// As if the store had been filled from another preset.
void forgetPreset(const WideString &parameters) {
    REQUIRE(SetRegBinary(parameters, store_name::presetHash, reinterpret_cast<const uint8_t *>(kNoPreset.data()),
                         sizeof kNoPreset) == status::ok);
}

std::vector<uint8_t> stored(const WideString &parameters, int32_t component, int32_t param) {
    uint8_t buffer[64];
    uint32_t size = sizeof buffer;
    if (ReadParameterValue(parameters, component, param, buffer, size, nullptr, nullptr) != status::ok) return {};
    return {buffer, buffer + size};
}

std::vector<uint8_t> storedHash(const WideString &parameters) {
    std::vector<uint8_t> bytes(32);
    uint32_t size = 32;
    REQUIRE(GetRegBinary(parameters, store_name::presetHash, bytes.data(), size) == status::ok);
    return bytes;
}

std::vector<uint8_t> hashOf(const PresetHash &words) {
    const auto *bytes = reinterpret_cast<const uint8_t *>(words.data());
    return {bytes, bytes + sizeof words};
}

// A preset whose levels stand at half their linear gain, so that its digest is another one.
PresetDocument otherPreset() {
    SampleValues values;
    values.add(-1, -2, {1}).add(-1, -18, {0}).add(5, 115, {0});
    for (int32_t component = 0; component < 4; ++component) values.add(component, -12, bytesOf(floatBytes(0.5F)));
    for (int32_t param = kFirstBandParam; param <= kLastBandParam; ++param)
        values.add(5, param, bytesOf(bandBytes({1, 100.0F, 2.0F, 3.0F})));
    return orloPreset(values);
}

}  // namespace

TEST_CASE_FIXTURE(OpenEndpoint, "an APO type in lower case fails with -2, and in upper case is stored") {
    if (none()) return;
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, "sfx") == 0);
    CHECK(VXAPOCOMAPI_GetLastError(endpoint) == VXAPOCOMAPI_ERROR_INVALID_APO_TYPE);
    CHECK(toUtf8(context().APOTypeStr.get()) == "sfx");
    CHECK(context().APOType.get() == 0);
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, "SFX") == 1);
    CHECK(VXAPOCOMAPI_GetLastError(endpoint) == 0);
    CHECK(context().APOType.get() == 3);
}

TEST_CASE_FIXTURE(OpenEndpoint, "each of the five names has its number, and others have none") {
    if (none()) return;
    const std::pair<const char *, int32_t> names[] = {{"EFX", 1}, {"MFX", 2}, {"SFX", 3}, {"LFX", 5}, {"GFX", 4}};
    for (const auto &[name, number] : names) {
        CHECK(VXAPOCOMAPI_SetAPOType(endpoint, name) == 1);
        CHECK(context().APOType.get() == number);
        CHECK(context().APOTypeRegKeyName.get() == SampleMachine::configurationPath(name));
    }
    for (const char *name : {"", "EFX ", "\xFF\xFE", "%s%n"}) {
        CHECK(VXAPOCOMAPI_SetAPOType(endpoint, name) == 0);
        CHECK(VXAPOCOMAPI_GetLastError(endpoint) == VXAPOCOMAPI_ERROR_INVALID_APO_TYPE);
        CHECK(context().APOType.get() == 4);
    }
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, nullptr) == 0);
}

TEST_CASE("choosing a slot is logged, and so is a wrong name") {
    const CallLog log;
    const OpenEndpoint open;
    if (open.none()) return;
    VXAPOCOMAPI_SetAPOType(open.endpoint, "sfx");
    VXAPOCOMAPI_SetAPOType(open.endpoint, "EFX");
    CHECK(log.hasInOrder({"{ VXAPOCOMAPI_SetAPOType(apoComHandle = 0x" + test::hexadecimal(open.endpoint) + ")", "APO Type: sfx",
                          "Error: -2", "APO Type: EFX"}));
}

TEST_CASE("a first choice opens the preset, fills the store and finds it consistent") {
    const CallLog log;
    const OpenEndpoint open;
    if (open.none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(open.endpoint, "EFX") == 1);
    const WideString key = SampleMachine::parametersPath();
    CHECK(open.context().ParamRegKeyName.get() == key);
    CHECK(toUtf8(open.context().EngineShortName.get()) == "VXORLO");
    CHECK(log.hasInOrder({"Opening preset file: " + toUtf8(open.context().PresetFilePath.get()) + " ...",
                          "Accessing parameters' registry key: " + toUtf8(key) + " ...",
                          "Checking if the parameters in the registry correspond to the preset file...",
                          "Parameters are consistent with the preset file."}));
    CHECK(storedHash(key) == hashOf(open.context().PresetHash));
    CHECK(VXAPOCOMAPI_GetUserParameter(open.endpoint, USER_PARAM_ID_ENABLE_EQ) == 1.0F);
}

TEST_CASE_FIXTURE(OpenEndpoint, "setting the type that is set changes nothing") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CallLog log;  // the context was made before it and stays silent
    const WideString key = SampleMachine::parametersPath();
    forgetPreset(key);
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(storedHash(key) == hashOf(kNoPreset));
}

TEST_CASE_FIXTURE(OpenEndpoint, "the client marks each slot that it chooses, and takes its mark along to the next") {
    if (none()) return;
    const WideString mark = guidText(context().InstanceGuid);
    const auto markAt = [&](const char *type) {
        WideString text = VX_TEXT("?");
        const Status found = GetRegString(SampleMachine::configurationPath(type) + VX_TEXT("\\Clients"), mark, text);
        return found == status::ok && text.empty();
    };
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(markAt("EFX"));
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "MFX") == 1);
    CHECK_FALSE(markAt("EFX"));
    CHECK(markAt("MFX"));
    CHECK(VXAPOCOMAPI_FreeEndpoint(endpoint) == 1);
    CHECK(markAt("MFX"));
}

TEST_CASE_FIXTURE(OpenEndpoint, "the mark is written with a fresh stamp") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    RegistryKey clients;
    REQUIRE(RegistryKey::open(RegistryRoot::localMachine, SampleMachine::configurationPath() + VX_TEXT("\\Clients"),
                              RegistryAccess::read, clients) == status::ok);
    uint64_t stamp = 0;
    CHECK(clients.readU64(store_name::writeTime, stamp) == RegistryRead::value);
    CHECK(stamp != 0);
}

TEST_CASE_FIXTURE(OpenEndpoint, "the preset narrows the ranges, shapes the bands and tells whether it bypasses everything") {
    if (none()) return;
    SampleValues values = SampleValues::usual();
    const std::array<std::pair<float, float>, 4> ranges = {{{-10, 1}, {-20, 2}, {-30, 3}, {-40, 4}}};
    for (int32_t component = 0; component < 4; ++component) {
        const auto &[minimum, maximum] = ranges[static_cast<size_t>(component)];
        values.add(component, -20, bytesOf(floatBytes(minimum))).add(component, -21, bytesOf(floatBytes(maximum)));
    }
    values.add(4, -20, bytesOf(floatBytes(-1))).add(0, -20, {1, 2});  // not a slider's; too short
    values.add(5, 119, bytesOf(bandBytes({0, 77.0F, 0.5F, 9.0F})));
    values.add(5, 120, {1, 2, 3});  // cut off
    values.add(-1, -18, {1});
    SampleMachine::putPreset(orloPreset(values));
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    CHECK(context().VoiceRange.minimum == -10.0F);
    CHECK(context().VoiceRange.maximum == 1.0F);
    CHECK(context().SurroundRange.minimum == -20.0F);
    CHECK(context().SurroundRange.maximum == 2.0F);
    CHECK(context().DetailRange.minimum == -30.0F);
    CHECK(context().DetailRange.maximum == 3.0F);
    CHECK(context().BassRange.minimum == -40.0F);
    CHECK(context().BassRange.maximum == 4.0F);
    CHECK(context().EqBandType[2] == 0);
    CHECK(context().EqBandFrequency[2] == 77.0F);
    CHECK(context().EqBandQ[2] == 0.5F);
    CHECK(context().EqBandFrequency[0] == 31.25F);
    CHECK(context().BypassAllInPreset == 1);

    SampleMachine::putPreset(orloPreset(), "MFX");
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "MFX") == 1);
    CHECK(context().BypassAllInPreset == 0);
}

TEST_CASE("a store filled from another preset keeps each user parameter that could be read") {
    const CallLog log;
    const WideString key = SampleMachine::parametersPath();
    OpenEndpoint first;
    if (first.none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(first.endpoint, "EFX") == 1);
    std::array<float, 17> set = {};
    for (int32_t id = 0; id < 17; ++id) {
        const bool isSwitch = id == 0 || id == 5 || id == 16;
        set[static_cast<size_t>(id)] = isSwitch ? (id == 0 ? 0.0F : 1.0F) : 0.05F * static_cast<float>(id);
        REQUIRE(VXAPOCOMAPI_SetUserParameter(first.endpoint, static_cast<uint32_t>(id), set[static_cast<size_t>(id)]) == 1);
        set[static_cast<size_t>(id)] = VXAPOCOMAPI_GetUserParameter(first.endpoint, id);
    }
    WriteParameter(nullptr, key, 9, 99, -1, std::vector<uint8_t>{5}, {}, false, nullptr);
    SampleMachine::putPreset(otherPreset());

    SUBCASE("that another client finds") {
        const Client other;
        VXAPOHandle const second = VXAPOCOMAPI_GetEndpoint(other.api, first.machine.endpointId().c_str(), 0);
        REQUIRE(VXAPOCOMAPI_SetAPOType(second, "EFX") == 1);
        for (int32_t id = 0; id < 17; ++id) CHECK(VXAPOCOMAPI_GetUserParameter(second, id) == set[static_cast<size_t>(id)]);
        CHECK(storedHash(key) == hashOf(test::endpointOf(second).PresetHash));
    }
    SUBCASE("that the same client finds when it comes back to the slot") {
        REQUIRE(VXAPOCOMAPI_SetAPOType(first.endpoint, "MFX") == 1);
        REQUIRE(VXAPOCOMAPI_SetAPOType(first.endpoint, "EFX") == 1);
        for (int32_t id = 0; id < 17; ++id) CHECK(VXAPOCOMAPI_GetUserParameter(first.endpoint, id) == set[static_cast<size_t>(id)]);
    }
    SUBCASE("that a client finds behind a wrong name") {
        const Client other;
        VXAPOHandle const second = VXAPOCOMAPI_GetEndpoint(other.api, first.machine.endpointId().c_str(), 0);
        CHECK(VXAPOCOMAPI_SetAPOType(second, "efx") == 0);
        REQUIRE(VXAPOCOMAPI_SetAPOType(second, "EFX") == 1);
        for (int32_t id = 0; id < 17; ++id) CHECK(VXAPOCOMAPI_GetUserParameter(second, id) == set[static_cast<size_t>(id)]);
    }
    CHECK(stored(key, 9, 99).empty());
    CHECK(log.has("Resetting parameters in the regsitry by reading them from the preset file..."));
}

TEST_CASE_FIXTURE(OpenEndpoint, "user parameters that can't be read take the new preset's value") {
    if (none()) return;
    const WideString key = SampleMachine::parametersPath();
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_VOICE_LEVEL, 0.25F) == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_SURROUND_LEVEL, 0.75F) == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_EQ_BAND2_LEVEL, 0.5F) == 1);
    deleteParameterValue(key, VX_TEXT("3"), VX_TEXT("-12"));  // the bass level, which is read first
    WriteParameter(nullptr, key, 2, -12, -1, std::vector<uint8_t>{0, 0, 0, 0}, {}, false, nullptr);  // far below the range
    WriteParameter(nullptr, key, 5, 117, -1, std::vector<uint8_t>(13), {}, false, nullptr);          // a band of no type
    WriteParameter(nullptr, key, 5, 119, -1, std::vector<uint8_t>(20), {}, false, nullptr);          // no band record
    SampleMachine::putPreset(otherPreset());

    const Client other;
    VXAPOHandle const second = VXAPOCOMAPI_GetEndpoint(other.api, machine.endpointId().c_str(), 0);
    VXAPOCOMAPI_SetLastError(other.api, 0);
    REQUIRE(VXAPOCOMAPI_SetAPOType(second, "EFX") == 1);
    CHECK(VXAPOCOMAPI_GetLastError(second) == 0);
    CHECK(VXAPOCOMAPI_GetUserParameter(second, USER_PARAM_ID_VOICE_LEVEL) == 0.25F);
    CHECK(VXAPOCOMAPI_GetUserParameter(second, USER_PARAM_ID_SURROUND_LEVEL) == 0.75F);
    CHECK(VXAPOCOMAPI_GetUserParameter(second, USER_PARAM_ID_EQ_BAND2_LEVEL) == 0.5F);
    CHECK(stored(key, 3, -12) == bytesOf(floatBytes(0.5F)));
    CHECK(stored(key, 2, -12) == bytesOf(floatBytes(0.5F)));
    CHECK(stored(key, 5, 117) == bytesOf(bandBytes({1, 100.0F, 2.0F, 3.0F})));
    CHECK(stored(key, 5, 119) == bytesOf(bandBytes({1, 100.0F, 2.0F, 3.0F})));
}

TEST_CASE_FIXTURE(OpenEndpoint, "a store without a preset's hash keeps the user parameters, too") {
    if (none()) return;
    const WideString key = SampleMachine::parametersPath();
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_BASS_LEVEL, 0.125F) == 1);
    for (const std::vector<uint8_t> &hash : {std::vector<uint8_t>(), std::vector<uint8_t>(31), std::vector<uint8_t>(33)}) {
        REQUIRE(SetRegBinary(key, store_name::presetHash, hash.empty() ? nullptr : hash.data(), hash.size()) == status::ok);
        const Client other;
        VXAPOHandle const second = VXAPOCOMAPI_GetEndpoint(other.api, machine.endpointId().c_str(), 0);
        REQUIRE(VXAPOCOMAPI_SetAPOType(second, "EFX") == 1);
        CHECK(VXAPOCOMAPI_GetUserParameter(second, USER_PARAM_ID_BASS_LEVEL) == 0.125F);
        CHECK(storedHash(key) == hashOf(test::endpointOf(second).PresetHash));
    }
}

TEST_CASE_FIXTURE(OpenEndpoint, "the store of an engine with two switches keeps those") {
    if (none()) return;
    SampleMachine::putPreset(novaraPreset());
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    REQUIRE(VXAPOCOMAPI_SetUserParameter(endpoint, USER_PARAM_ID_BYPASS_ALL, 1.0F) == 1);
    const WideString key = SampleMachine::parametersPath("KZNOVA");
    forgetPreset(key);
    const Client other;
    VXAPOHandle const second = VXAPOCOMAPI_GetEndpoint(other.api, machine.endpointId().c_str(), 0);
    REQUIRE(VXAPOCOMAPI_SetAPOType(second, "EFX") == 1);
    CHECK(VXAPOCOMAPI_GetUserParameter(second, USER_PARAM_ID_BYPASS_ALL) == 1.0F);
    CHECK(storedHash(key) != hashOf(kNoPreset));
}

TEST_CASE_FIXTURE(OpenEndpoint, "a slot without a preset is chosen all the same") {
    if (none()) return;
    CHECK(VXAPOCOMAPI_SetAPOType(endpoint, "GFX") == 1);
    CHECK(context().PresetFilePath.get().empty());
    CHECK(context().ParamRegKeyName.get().empty());
    CHECK(VXAPOCOMAPI_GetUserParameter(endpoint, USER_PARAM_ID_POWER_ON) == -1.0F);
    CHECK(VXAPOCOMAPI_GetLastError(endpoint) == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
}
