// SPDX-License-Identifier: MIT
#include "control/user_parameter_table.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <iterator>

namespace vxcomn {
namespace {

using enum UserParameterKind;

constexpr UserParameter bandParameter(int32_t number) {
    return {kFirstBand + number - 1, VX_TEXT("EQ_BAND%i_LEVEL"),   band,
            kBandComponent,          kFirstBandParam + number - 1, kBandRecordBytes};
}

// By id.
constexpr UserParameter kTable[] = {
    {0, VX_TEXT("POWER_ON"), power, -1, -2, 1},
    {1, VX_TEXT("BASS_LEVEL"), level, 3, -12, 4},
    {2, VX_TEXT("DETAIL_LEVEL"), level, 2, -12, 4},
    {3, VX_TEXT("VOICE_LEVEL"), level, 0, -12, 4},
    {4, VX_TEXT("SURROUND_LEVEL"), level, 1, -12, 4},
    {5, VX_TEXT("ENABLE_EQ"), flag, kBandComponent, 115, 1},
    bandParameter(1),
    bandParameter(2),
    bandParameter(3),
    bandParameter(4),
    bandParameter(5),
    bandParameter(6),
    bandParameter(7),
    bandParameter(8),
    bandParameter(9),
    bandParameter(10),
    {16, VX_TEXT("BYPASS_ALL"), flag, -1, -18, 1},
};
static_assert(std::size(kTable) == 17 && kTable[16].id == 16);

constexpr double kQuietestDecibels = -130.0;
constexpr float kSliderSteps = 100000.0F;  // five decimals

}  // namespace

const UserParameter *findUserParameter(WideView engineShortName, uint32_t id) noexcept {
    if (id >= std::size(kTable)) return nullptr;
    const UserParameter &parameter = kTable[id];
    if (engineShortName == VX_TEXT("VXORLO")) return &parameter;
    // A chain of one component has the two switches of the whole engine only.
    if (engineShortName == VX_TEXT("KZNOVA") && parameter.component == -1) return &parameter;
    return nullptr;
}

std::array<uint8_t, 4> floatBytes(float value) noexcept {
    const auto word = std::bit_cast<uint32_t>(value);
    return {static_cast<uint8_t>(word), static_cast<uint8_t>(word >> 8), static_cast<uint8_t>(word >> 16),
            static_cast<uint8_t>(word >> 24)};
}

float floatFromBytes(std::span<const uint8_t> bytes) noexcept {
    uint32_t word = 0;
    for (size_t at = 0; at < 4; ++at) word |= uint32_t{bytes[at]} << (8 * at);
    return std::bit_cast<float>(word);
}

std::array<uint8_t, kBandRecordBytes> bandBytes(const BandRecord &record) noexcept {
    std::array<uint8_t, kBandRecordBytes> bytes{record.filterType};
    size_t at = 1;
    for (const float field : {record.frequency, record.q, record.gainDb}) {
        for (const uint8_t byte : floatBytes(field)) bytes[at++] = byte;
    }
    return bytes;
}

BandRecord bandFromBytes(std::span<const uint8_t> bytes) noexcept {
    return {bytes[0], floatFromBytes(bytes.subspan(1)), floatFromBytes(bytes.subspan(5)), floatFromBytes(bytes.subspan(9))};
}

float levelOfSlider(const LevelRange &range, float value) noexcept {
    return (range.maximum - range.minimum) * value + range.minimum;
}

float gainOfSlider(const LevelRange &range, float value) noexcept {
    return static_cast<float>(std::pow(10.0, static_cast<double>(levelOfSlider(range, value)) / 20.0));
}

std::optional<float> sliderOfLevel(const LevelRange &range, float decibels) noexcept {
    const float position = (decibels - range.minimum) / (range.maximum - range.minimum);
    const float rounded = std::round(position * kSliderSteps) / kSliderSteps;
    if (!std::isfinite(rounded)) return std::nullopt;
    return rounded;
}

std::optional<float> sliderOfGain(const LevelRange &range, float gain) noexcept {
    if (std::isnan(gain)) return std::nullopt;
    // A gain below zero has no level, like none at all.
    const double decibels =
        gain > 0.0F ? std::max(kQuietestDecibels, 20.0 * std::log10(static_cast<double>(gain))) : kQuietestDecibels;
    return sliderOfLevel(range, static_cast<float>(decibels));
}

}  // namespace vxcomn
