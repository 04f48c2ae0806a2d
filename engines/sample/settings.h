// SPDX-License-Identifier: MIT
//
// What applications have set, in the units that they set it in, and the reader of parameter data. Control threads only, under the
// engine's lock; the render thread sees the Targets made of it (targets.h).
#pragma once

#include <array>
#include <cstdint>

#include "equaliser.h"

namespace sample_engine {

// The components by the id that parameters address them with.
enum ComponentId : int32_t {
    kGlobal = -1,
    kVoice = 0,
    kSurround = 1,
    kDetail = 2,
    kBass = 3,
    kLimiter = 4,
    kEqualiser = 5,
};
inline constexpr int kComponents = 6;

enum ParameterId : int32_t {
    kOutputGainOff = -30,    // global: u8
    kInputGainOff = -29,     // global: u8
    kBypass = -18,           // global: u8
    kLevel = -12,            // components 0 to 3 and global: f32, linear gain
    kComponentEnable = -6,   // any component: u8
    kPower = -2,             // global: u8
    kEqualiserEnable = 115,  // component 5: u8
    kFirstBand = 117,        // component 5: band record, one parameter a band
    kLastBand = 126,
};

struct Component {
    bool present = true;  // stands from the start; disposing takes it away, creating brings it back
    bool enabled = true;
    double level = 0.0;  // linear gain; 0 is neutral
};

struct Settings {
    Settings();

    bool power = true;
    bool bypass = false;
    bool inputGainOff = false;
    bool outputGainOff = false;
    double inputGain = 1.0;
    double outputGain = 1.0;
    bool equaliserOn = true;
    std::array<Component, kComponents> components;
    std::array<EqualiserBand, kEqualiserBands> bands;
};

// Stores a gain, held to 0 to 16. False, and nothing changed, if it is not a number.
bool storeGain(double &gain, float value);

// Carries out one parameter. Returns the bytes read from `data`; 0, with nothing changed, for a parameter that the engine does not
// have, data that is too short and numbers that are none.
uint32_t applyParameter(Settings &settings, int32_t componentId, int32_t paramId, const uint8_t *data, uint32_t size);

}  // namespace sample_engine
