// SPDX-License-Identifier: MIT
#include "control/preset_tables.h"

#include "preset/preset_format.h"

namespace vxcomn {

namespace {

constexpr int32_t kMinimumParam = -20, kMaximumParam = -21;
constexpr size_t kBandShapeBytes = 9;  // of the band record, what stands ahead of the gain

}  // namespace

bool PresetTables::parameter(int32_t componentId, int32_t paramId, int32_t /*channel*/, std::span<const uint8_t> value) {
    if (componentId == kGlobalComponent && paramId == kBypassAllParam) {
        if (!value.empty()) endpoint_.BypassAllInPreset = value[0] != 0 ? 1 : 0;
    } else if (componentId == kBandComponent && paramId >= kFirstBandParam && paramId <= kLastBandParam) {
        takeBand(static_cast<size_t>(paramId - kFirstBandParam), value);
    } else if (paramId == kMinimumParam || paramId == kMaximumParam) {
        LevelRange *const range = rangeOf(componentId);
        if (range == nullptr || value.size() < sizeof(float)) return true;
        (paramId == kMinimumParam ? range->minimum : range->maximum) = floatFromBytes(value);
    }
    return true;
}

// The effects by component.
LevelRange *PresetTables::rangeOf(int32_t componentId) noexcept {
    switch (componentId) {
        case 0:
            return &endpoint_.VoiceRange;
        case 1:
            return &endpoint_.SurroundRange;
        case 2:
            return &endpoint_.DetailRange;
        case 3:
            return &endpoint_.BassRange;
        default:
            return nullptr;
    }
}

void PresetTables::takeBand(size_t band, std::span<const uint8_t> value) noexcept {
    if (value.size() < kBandShapeBytes) return;
    endpoint_.EqBandType[band] = value[0];
    endpoint_.EqBandFrequency[band] = floatFromBytes(value.subspan(1));
    endpoint_.EqBandQ[band] = floatFromBytes(value.subspan(5));
}

}  // namespace vxcomn
