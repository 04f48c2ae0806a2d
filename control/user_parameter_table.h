// SPDX-License-Identifier: MIT
//
// The seventeen user parameters, as the store keeps them: which component and parameter of the engine each one is, how its value
// is laid out, and how a slider from 0 to 1 turns into the engine's number and back. Pure; any thread.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "platform/text.h"

namespace vxcomn {

enum class UserParameterKind : uint8_t {
    power,  // one byte, 1 for exactly 1.0
    level,  // 32-bit float, linear gain
    flag,   // one byte, 0 for 0.0, else 1
    band,   // band record
};

inline constexpr int32_t kUserParameterCount = 17;
inline constexpr int kBandCount = 10;
inline constexpr int32_t kFirstBand = 6;         // id of band 1
inline constexpr int32_t kFirstBandParam = 117;  // and its parameter
inline constexpr int32_t kLastBandParam = kFirstBandParam + kBandCount - 1;
inline constexpr int32_t kBandComponent = 5;
inline constexpr uint32_t kBandRecordBytes = 13;
inline constexpr uint32_t kLargestUserParameter = kBandRecordBytes;

struct UserParameter {
    int32_t id = 0;
    const VXWCHAR *name = nullptr;  // in the log; a band's name takes its number from 1 on
    UserParameterKind kind = UserParameterKind::flag;
    int32_t component = 0;
    int32_t param = 0;
    uint32_t bytes = 0;

    // 0 to 9; a band's only.
    size_t band() const noexcept { return static_cast<size_t>(id - kFirstBand); }
};

// The parameter of that id on an engine; null if the engine doesn't have it.
const UserParameter *findUserParameter(WideView engineShortName, uint32_t id) noexcept;

// A range of levels in dB.
struct LevelRange {
    float minimum = 0;
    float maximum = 0;
};

// Little-endian, unaligned: FilterType, Frequency in Hz, Q, GainDb.
struct BandRecord {
    uint8_t filterType = 0;
    float frequency = 0;
    float q = 0;
    float gainDb = 0;
};
std::array<uint8_t, kBandRecordBytes> bandBytes(const BandRecord &record) noexcept;
// Of at least kBandRecordBytes.
BandRecord bandFromBytes(std::span<const uint8_t> bytes) noexcept;

std::array<uint8_t, 4> floatBytes(float value) noexcept;
float floatFromBytes(std::span<const uint8_t> bytes) noexcept;

// A slider's level in dB, and the linear gain of that level. There is no upper limit.
float levelOfSlider(const LevelRange &range, float value) noexcept;
float gainOfSlider(const LevelRange &range, float value) noexcept;

// Back again, to five decimals; below -130 dB counts as -130 dB. Negative for a level below the range, and nothing if no number
// comes out of what is stored.
std::optional<float> sliderOfLevel(const LevelRange &range, float decibels) noexcept;
std::optional<float> sliderOfGain(const LevelRange &range, float gain) noexcept;

}  // namespace vxcomn
