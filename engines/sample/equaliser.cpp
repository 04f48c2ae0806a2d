// SPDX-License-Identifier: MIT
//
// Bounds of a band: the record may hold any numbers, the filter must stay one that can be heard and computed.
#include "equaliser.h"

#include <algorithm>

#include "deterministic_math.h"

namespace sample_engine {
namespace {

constexpr double kLowestHz = 5.0;
constexpr double kHighestShareOfRate = 0.49;  // above it the bell would be squeezed against half the sample rate
constexpr double kLowestQuality = 0.1;
constexpr double kHighestQuality = 30.0;
constexpr double kMostDecibels = 36.0;  // twice the slider's range

}  // namespace

FilterShape designBand(const EqualiserBand &band, double sampleRate) {
    const bool heard =
        band.type == kBellType && band.frequencyHz >= kLowestHz && band.frequencyHz <= kHighestShareOfRate * sampleRate;
    if (!heard || band.gainDecibels == 0.0) return {};
    const double gain = decibelsToGain(std::clamp(band.gainDecibels, -kMostDecibels, kMostDecibels));
    return designBell(band.frequencyHz, std::clamp(band.quality, kLowestQuality, kHighestQuality), gain, sampleRate);
}

}  // namespace sample_engine
