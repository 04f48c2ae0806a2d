// SPDX-License-Identifier: MIT
//
// What an endpoint context takes out of its preset: the ranges of the level sliders, the equaliser's bands, and whether the preset
// bypasses everything. Everything else passes by. Control threads, under the state lock.
#pragma once

#include "control/endpoint_context.h"
#include "preset/preset_reader.h"

namespace vxcomn {

class PresetTables final : public PresetParameters {
  public:
    explicit PresetTables(VXAPOCOMAPI_EndpointContext &endpoint) noexcept : endpoint_(endpoint) {}

    bool parameter(int32_t componentId, int32_t paramId, int32_t channel, std::span<const uint8_t> value) override;

  private:
    LevelRange *rangeOf(int32_t componentId) noexcept;
    void takeBand(size_t band, std::span<const uint8_t> value) noexcept;

    VXAPOCOMAPI_EndpointContext &endpoint_;
};

}  // namespace vxcomn
