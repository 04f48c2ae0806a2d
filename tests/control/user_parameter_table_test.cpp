// SPDX-License-Identifier: MIT
#include "control/user_parameter_table.h"

#include <doctest/doctest.h>

#include <cmath>
#include <limits>

using namespace vxcomn;

namespace {

constexpr LevelRange kBass = {-54.0F, 6.0F}, kVoice = {-48.0F, 12.0F}, kEq = {-18.0F, 18.0F};
constexpr auto kOrlo = VX_TEXT("VXORLO"), kNovara = VX_TEXT("KZNOVA");

}  // namespace

TEST_CASE("the seventeen user parameters of VXORLO stand for these components, parameters and sizes") {
    const struct {
        int32_t component, param;
        uint32_t bytes;
    } expected[] = {{-1, -2, 1},  {3, -12, 4},  {2, -12, 4},  {0, -12, 4},  {1, -12, 4},  {5, 115, 1},
                    {5, 117, 13}, {5, 118, 13}, {5, 119, 13}, {5, 120, 13}, {5, 121, 13}, {5, 122, 13},
                    {5, 123, 13}, {5, 124, 13}, {5, 125, 13}, {5, 126, 13}, {-1, -18, 1}};
    for (uint32_t id = 0; id < 17; ++id) {
        INFO("id ", id);
        const UserParameter *parameter = findUserParameter(kOrlo, id);
        REQUIRE(parameter != nullptr);
        CHECK(parameter->id == static_cast<int32_t>(id));
        CHECK(parameter->component == expected[id].component);
        CHECK(parameter->param == expected[id].param);
        CHECK(parameter->bytes == expected[id].bytes);
    }
}

TEST_CASE("an id above sixteen is no user parameter") {
    for (const uint32_t id : {17U, 32U, 0x7FFFU, 0xFFFFFFFFU, 0x80000000U}) CHECK(findUserParameter(kOrlo, id) == nullptr);
}

TEST_CASE("KZNOVA has the power switch and the bypass only") {
    for (uint32_t id = 0; id < 17; ++id) CHECK((findUserParameter(kNovara, id) != nullptr) == (id == 0 || id == 16));
}

TEST_CASE("any other engine name, and the empty one, knows no user parameters") {
    for (const auto name : {VX_TEXT(""), VX_TEXT("vxorlo"), VX_TEXT("VXORLO2"), VX_TEXT("KZ.Novara")}) {
        for (uint32_t id = 0; id < 17; ++id) CHECK(findUserParameter(name, id) == nullptr);
    }
}

TEST_CASE("the bass slider at its lower end stands for the gain of -54 dB") {
    CHECK(gainOfSlider(kBass, 0.0F) == static_cast<float>(std::pow(10.0, -2.7)));
}

TEST_CASE("a slider above its end gives a level above the maximum") {
    CHECK(levelOfSlider(kEq, 1.5F) == 36.0F);
    CHECK(gainOfSlider(kVoice, 2.0F) > gainOfSlider(kVoice, 1.0F));
    CHECK(sliderOfGain(kVoice, gainOfSlider(kVoice, 2.0F)) == 2.0F);
}

TEST_CASE("a gain of zero or less lies below every range") {
    for (const float gain : {0.0F, -0.0F, -1.0F, -std::numeric_limits<float>::infinity()}) {
        const auto slider = sliderOfGain(kBass, gain);
        REQUIRE(slider);
        CHECK(*slider == std::round((-130.0F + 54.0F) / 60.0F * 100000.0F) / 100000.0F);
    }
}

TEST_CASE("what is no number has no slider") {
    const float nan = std::numeric_limits<float>::quiet_NaN(), infinity = std::numeric_limits<float>::infinity();
    CHECK_FALSE(sliderOfGain(kBass, nan));
    CHECK_FALSE(sliderOfGain(kBass, infinity));
    CHECK_FALSE(sliderOfLevel(kEq, nan));
    CHECK_FALSE(sliderOfLevel(kEq, -infinity));
    CHECK_FALSE(sliderOfLevel({3.0F, 3.0F}, 3.0F));
    CHECK_FALSE(sliderOfLevel({nan, 3.0F}, 1.0F));
}

TEST_CASE("a slider's place to five decimals survives the way through the gain and back") {
    for (int step = 0; step <= 100000; step += 7) {
        const float value = static_cast<float>(step) / 100000.0F;
        REQUIRE(sliderOfGain(kBass, gainOfSlider(kBass, value)) == value);
        REQUIRE(sliderOfGain(kVoice, gainOfSlider(kVoice, value)) == value);
        REQUIRE(sliderOfLevel(kEq, levelOfSlider(kEq, value)) == value);
    }
}

TEST_CASE("half a step is rounded away from zero") {
    CHECK(sliderOfLevel({0.0F, 100000.0F}, 0.5F) == 1.0F / 100000.0F);
    CHECK(sliderOfLevel({0.0F, 100000.0F}, -0.5F) == -1.0F / 100000.0F);
    CHECK(sliderOfLevel({0.0F, 100000.0F}, 1.5F) == 2.0F / 100000.0F);
}

TEST_CASE("a band record is thirteen bytes, little-endian and unaligned") {
    const auto bytes = bandBytes({1, 1600.0F, 1.44F, -18.0F});
    const std::array<uint8_t, 13> expected = {1, 0x00, 0x00, 0xC8, 0x44, 0xEC, 0x51, 0xB8, 0x3F, 0x00, 0x00, 0x90, 0xC1};
    CHECK(bytes == expected);
    const BandRecord record = bandFromBytes(bytes);
    CHECK(record.filterType == 1);
    CHECK(record.frequency == 1600.0F);
    CHECK(record.q == 1.44F);
    CHECK(record.gainDb == -18.0F);
}
