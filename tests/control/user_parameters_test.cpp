// SPDX-License-Identifier: MIT
//
// The seventeen user parameters through the exported functions.
#include "tests/control/open_slot.h"

#include <cmath>
#include <limits>
#include <thread>

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();

Bytes bytesOf(const auto &array) {
    return {array.begin(), array.end()};
}

Bytes gainBytes(float gain) {
    return bytesOf(floatBytes(gain));
}

// The slot has two configurations.
struct TwoConfigurations : OpenSlot {
    TwoConfigurations() { SampleMachine::putPreset(orloPreset(), "EFX", "Headphones"); }
    static WideString lineOut() { return SampleMachine::parametersPath(); }
    static WideString headphones() { return SampleMachine::parametersPath("VXORLO", "Headphones"); }
};

// A preset that says nothing of the equaliser's bands.
struct NoBands : OpenSlot {
    NoBands() : OpenSlot(nullptr) {
        SampleValues values;
        SampleMachine::putPreset(orloPreset(values.add(-1, -2, {1})));
        REQUIRE(VXAPOCOMAPI_SetAPOType(handle(), "EFX") == 1);
    }
};

struct Novara : OpenSlot {
    Novara() : OpenSlot(nullptr) {
        SampleMachine::putPreset(novaraPreset());
        REQUIRE(VXAPOCOMAPI_SetAPOType(handle(), "EFX") == 1);
    }
};

}  // namespace

TEST_CASE_FIXTURE(TwoConfigurations, "id 0x8003 writes the voice level to all keys of the slot, id 3 to the current key only") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 0x8003, 0.5F) == 1);
    const Bytes half = gainBytes(gainOfSlider({-48.0F, 12.0F}, 0.5F));
    CHECK(storedAt(lineOut(), 0, -12) == half);
    CHECK(storedAt(headphones(), 0, -12) == half);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 3, 0.25F) == 1);
    CHECK(storedAt(lineOut(), 0, -12) == gainBytes(gainOfSlider({-48.0F, 12.0F}, 0.25F)));
    CHECK(storedAt(headphones(), 0, -12) == half);
}

TEST_CASE_FIXTURE(TwoConfigurations, "power with 0.5 stores 0 and with 1.0 stores 1, with or without bit 15 to all keys") {
    for (const uint32_t id : {0U, 0x8000U}) {
        INFO("id ", id);
        for (const float value : {0.5F, 1.0F, 0.999999F, 1.0F, 2.0F, 1.0F, 0.0F}) {
            INFO("value ", value);
            CHECK(VXAPOCOMAPI_SetUserParameter(handle(), id, value) == 1);
            const Bytes expected = {static_cast<uint8_t>(value == 1.0F ? 1 : 0)};
            CHECK(storedAt(lineOut(), -1, -2) == expected);
            CHECK(storedAt(headphones(), -1, -2) == expected);
            CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 0) == (value == 1.0F ? 1.0F : 0.0F));
        }
    }
}

TEST_CASE_FIXTURE(OpenSlot, "the bass at 0.0 stores the gain of -54 dB") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL, 0.0F) == 1);
    CHECK(stored(3, -12) == gainBytes(static_cast<float>(std::pow(10.0, -2.7))));
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL) == 0.0F);
}

TEST_CASE_FIXTURE(OpenSlot, "a stored linear level of 0 lies below the range, so reading fails with -4") {
    store(3, -12, gainBytes(0.0F));
    float value = 0;
    const auto lines = linesOf([&] { value = VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL); });
    CHECK(value == -1.0F);
    CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
    CHECK(contains(lines, "Error: -4"));
    CHECK(contains(lines, "VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE, Exiting with -1"));
}

TEST_CASE_FIXTURE(Novara, "on KZNOVA the bass fails with -3 and the bypass works") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL, 0.5F) == 0);
    CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_BASS_LEVEL) == -1.0F);
    CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_BYPASS_ALL, 0.5F) == 1);
    CHECK(error() == 0);
    CHECK(stored(-1, -18) == Bytes{1});
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_BYPASS_ALL) == 1.0F);
}

TEST_CASE_FIXTURE(NoBands, "band 10 on a default table goes to parameter 126 with a frequency of 1600 Hz") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_EQ_BAND10_LEVEL, 1.0F) == 1);
    CHECK(stored(5, 126) == bytesOf(bandBytes({1, 1600.0F, 1.44F, 18.0F})));
    CHECK(stored(5, 125).empty());
}

TEST_CASE_FIXTURE(OpenSlot, "band numbers in the log run from 1 for id 6 to 10 for id 15") {
    for (uint32_t band = 1; band <= 10; ++band) {
        const std::string name = "USER_PARAM_ID_EQ_BAND" + std::to_string(band) + "_LEVEL";
        const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 5 + band, 0.5F) == 1); });
        CHECK(contains(lines, "Setting " + name + " parameter..."));
        CHECK(contains(lines, "Done."));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "each parameter's line in the log has its name") {
    const struct {
        uint32_t id;
        const char *line;
    } expected[] = {
        {0, "Setting USER_PARAM_ID_POWER_ON parameter... (always global for backward compatibility)"},
        {1, "Setting USER_PARAM_ID_BASS_LEVEL parameter..."},
        {2, "Setting USER_PARAM_ID_DETAIL_LEVEL parameter..."},
        {3, "Setting USER_PARAM_ID_VOICE_LEVEL parameter..."},
        {4, "Setting USER_PARAM_ID_SURROUND_LEVEL parameter..."},
        {5, "Setting USER_PARAM_ID_ENABLE_EQ parameter..."},
        {16, "Setting USER_PARAM_ID_BYPASS_ALL parameter..."},
    };
    for (const auto &parameter : expected) {
        CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), parameter.id, 1.0F) == 1); }), parameter.line));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "every user parameter reads back what was set") {
    for (int32_t id = 1; id <= 15; ++id) {
        if (id == USER_PARAM_ID_ENABLE_EQ) continue;
        for (const float value : {0.0F, 0.12345F, 0.5F, 0.99999F, 1.0F}) {
            INFO("id ", id, " value ", value);
            CHECK(VXAPOCOMAPI_SetUserParameter(handle(), static_cast<uint32_t>(id), value) == 1);
            CHECK(VXAPOCOMAPI_GetUserParameter(handle(), id) == value);
            CHECK(error() == 0);
        }
    }
    for (const int32_t id : {0, 5, 16}) {
        for (const float value : {1.0F, 0.0F}) {
            CHECK(VXAPOCOMAPI_SetUserParameter(handle(), static_cast<uint32_t>(id), value) == 1);
            CHECK(VXAPOCOMAPI_GetUserParameter(handle(), id) == value);
        }
    }
}

TEST_CASE_FIXTURE(OpenSlot, "there is no upper bound: a level above the range reads back above 1.0") {
    for (const int32_t id : {1, 2, 3, 4, 6, 15}) {
        CHECK(VXAPOCOMAPI_SetUserParameter(handle(), static_cast<uint32_t>(id), 1.25F) == 1);
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), id) == 1.25F);
    }
}

TEST_CASE_FIXTURE(NoSlot, "without a slot setting and reading fail with -9") {
    auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 1, -1.0F) == 0); });
    CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    CHECK(contains(lines, "Error: -9"));
    lines = linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 99) == -1.0F); });
    CHECK(error() == VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET);
    CHECK(contains(lines, "Error: -9"));
    CHECK(contains(lines, "VXAPOCOMAPI_GetUserParameter: VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET, Exiting with -1"));
}

TEST_CASE_FIXTURE(OpenSlot, "a negative value, and one that is no number, fails with -4 ahead of a bad id") {
    for (const float value : {-0.5F, -std::numeric_limits<float>::denorm_min(), -std::numeric_limits<float>::infinity(), kNaN}) {
        for (const uint32_t id : {1U, 99U}) {
            const Bytes before = stored(3, -12);
            CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), id, value) == 0); }), "Error: -4"));
            CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
            CHECK(stored(3, -12) == before);
        }
    }
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 1, -0.0F) == 1);
}

TEST_CASE_FIXTURE(OpenSlot, "an id that the engine doesn't have fails with -3") {
    for (const int32_t id : {17, 255, 0x4000, 0x10000, -1, INT32_MIN}) {
        INFO("id ", id);
        CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), static_cast<uint32_t>(id), 0.5F) == 0); }),
                       "Error: -3"));
        CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
        VXAPOCOMAPI_SetLastError(handle(), 0);
        const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameter(handle(), id) == -1.0F); });
        CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID);
        CHECK(contains(lines, "VXAPOCOMAPI_GetUserParameter(" + std::to_string(id) +
                                  "): VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID, Exiting with -1"));
    }
    // Bit 15 is no part of an id to be read.
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 0x8003) == -1.0F);
}

TEST_CASE_FIXTURE(OpenSlot, "a bad handle sets nothing, reads -1.0 and leaves the errors as they were") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    int something = 0;
    for (VXAPOHandle bad : {static_cast<VXAPOHandle>(nullptr), static_cast<VXAPOHandle>(&something), client->api}) {
        CHECK(VXAPOCOMAPI_SetUserParameter(bad, 1, 0.5F) == 0);
        CHECK(VXAPOCOMAPI_GetUserParameter(bad, 1) == -1.0F);
    }
    CHECK(error() == -2);
}

TEST_CASE_FIXTURE(OpenSlot, "a band whose filter type is 0 can neither be set nor read") {
    store(5, 119, bytesOf(bandBytes({0, 250.0F, 2.0F, 3.0F})));
    const auto silent = linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_EQ_BAND3_LEVEL) == -1.0F); });
    CHECK(error() == VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED);
    CHECK(silent.empty());
    VXAPOCOMAPI_SetLastError(handle(), 0);
    const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_EQ_BAND3_LEVEL, 0.5F) == 0); });
    CHECK(error() == VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED);
    CHECK(contains(lines,
                   "VXAPOCOMAPI_SetUserParameter(USER_PARAM_ID_EQ_BAND3_LEVEL): "
                   "VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED, Exiting with -1"));
    CHECK(stored(5, 119) == bytesOf(bandBytes({0, 250.0F, 2.0F, 3.0F})));
}

TEST_CASE_FIXTURE(OpenSlot, "reading a band refreshes what writing it will send") {
    store(5, 120, bytesOf(bandBytes({7, 333.0F, 0.5F, -9.0F})));
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_EQ_BAND4_LEVEL) == 0.25F);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_EQ_BAND4_LEVEL, 0.5F) == 1);
    CHECK(stored(5, 120) == bytesOf(bandBytes({7, 333.0F, 0.5F, 0.0F})));
}

TEST_CASE_FIXTURE(NoBands, "a parameter that neither store nor preset holds fails with -256") {
    const struct {
        int32_t id;
        const char *name;
    } parameters[] = {{1, "BASS_LEVEL"}, {5, "ENABLE_EQ"}, {6, "EQ_BAND1_LEVEL"}, {15, "EQ_BAND10_LEVEL"}};
    for (const auto &parameter : parameters) {
        VXAPOCOMAPI_SetLastError(handle(), 0);
        const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameter(handle(), parameter.id) == -1.0F); });
        CHECK(error() == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
        CHECK(VXAPOCOMAPI_GetWindowsLastError(handle()) == 2);
        CHECK(contains(lines, std::string("VXAPOCOMAPI_GetUserParameter(USER_PARAM_ID_") + parameter.name +
                                  "): VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE, Exiting with -1"));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a parameter that has gone from the store is healed from the preset") {
    CHECK(DeleteRegKeyTree(context().ParamRegKeyName.get(), false));
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == 0.8F);
    CHECK(error() == 0);
}

TEST_CASE_FIXTURE(OpenSlot, "stored values of a wrong size, and stored numbers that are none, are refused") {
    for (const size_t size : {size_t{0}, size_t{3}, size_t{5}, size_t{65536}}) {
        INFO("size ", size);
        store(0, -12, Bytes(size, 0x3F));
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == -1.0F);
        CHECK(error() == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
    }
    store(5, 117, Bytes(12, 1));
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_EQ_BAND1_LEVEL) == -1.0F);
    CHECK(error() == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
    for (const float number : {kNaN, std::numeric_limits<float>::infinity(), -1.0F}) {
        store(0, -12, gainBytes(number));
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_VOICE_LEVEL) == -1.0F);
        CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
        store(5, 117, bytesOf(bandBytes({1, 31.0F, 1.0F, number * 1000.0F})));
        CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_EQ_BAND1_LEVEL) == -1.0F);
        CHECK(error() == VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE);
    }
}

TEST_CASE_FIXTURE(OpenSlot, "the preset's bounds are the sliders' ends") {
    SampleValues values = SampleValues::usual();
    values.add(2, -21, gainBytes(3.0F)).add(2, -20, gainBytes(-7.0F));
    SampleMachine::putPreset(orloPreset(values), "MFX");
    CHECK(VXAPOCOMAPI_SetAPOType(handle(), "MFX") == 1);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), USER_PARAM_ID_DETAIL_LEVEL) == 0.7F);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), USER_PARAM_ID_DETAIL_LEVEL, 1.0F) == 1);
    CHECK(stored(2, -12) == gainBytes(gainOfSlider({-7.0F, 3.0F}, 1.0F)));
    CHECK(stored(2, -20).empty());
    CHECK(stored(2, -21).empty());
}

TEST_CASE_FIXTURE(OpenSlot, "a call inside another of its kind is turned away without an error") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    context().InSetUserParameter = 1;
    CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 1, 0.5F) == 0); }),
                   "Triggered re-entry check, exiting..."));
    context().InSetUserParameter = 0;
    context().InGetUserParameter = 1;
    CHECK(contains(linesOf([&] { CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 1) == 0.0F); }),
                   "Triggered re-entry check, exiting with 0"));
    context().InGetUserParameter = 0;
    CHECK(error() == -2);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 1, 0.5F) == 1);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 1) == 0.5F);
}

TEST_CASE_FIXTURE(OpenSlot, "the re-entry marks are gone behind every way out") {
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 99, 0.5F) == 0);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 1, -1.0F) == 0);
    CHECK(context().InSetUserParameter == 0);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 99) == -1.0F);
    CHECK(context().InGetUserParameter == 0);
}

TEST_CASE_FIXTURE(OpenSlot, "setting is traced with its arguments, reading is not") {
    const auto set = linesOf([&] { VXAPOCOMAPI_SetUserParameter(handle(), 0x8003, 0.5F); });
    REQUIRE_FALSE(set.empty());
    CHECK(set.front().rfind("{ VXAPOCOMAPI_SetUserParameter(apoComHandle = 0x", 0) == 0);
    CHECK(set.front().find(", ParamId = 3, Value = 0.5, IsGlobal = 1") != std::string::npos);
    CHECK(linesOf([&] { VXAPOCOMAPI_GetUserParameter(handle(), 3); }).empty());
}

TEST_CASE_FIXTURE(OpenSlot, "threads that set and read at once lose answers but no value") {
    constexpr int kRounds = 200;
    std::atomic<int> wrong{0};
    const auto worker = [&](uint32_t id) {
        for (int round = 0; round < kRounds; ++round) {
            VXAPOCOMAPI_SetUserParameter(handle(), id, 0.75F);
            const float value = VXAPOCOMAPI_GetUserParameter(handle(), static_cast<int32_t>(id));
            if (value != 0.0F && value != 0.75F && value != 0.8F && value != 0.9F && value != 0.5F) ++wrong;
        }
    };
    std::thread first(worker, 1), second(worker, 3), third(worker, 7);
    for (std::thread *thread : {&first, &second, &third}) thread->join();
    CHECK(wrong == 0);
    CHECK(VXAPOCOMAPI_SetUserParameter(handle(), 3, 0.125F) == 1);
    CHECK(VXAPOCOMAPI_GetUserParameter(handle(), 3) == 0.125F);
}
