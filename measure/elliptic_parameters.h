// SPDX-License-Identifier: MIT
//
// What a filter design tells of its parameters: range, default, the scale of a control and the text of a value. Control calls only.
#pragma once

#include <cstdint>
#include <string>

namespace Dsp {

// The parameter ids of all designs of the family.
enum class ParamId : int32_t {
    sampleRate = 0,
    frequency = 1,
    q = 2,
    bandwidth = 3,  // octaves
    bandwidthHz = 4,
    gain = 5,
    slope = 6,
    order = 7,
    rippleDb = 8,
    stopDb = 9,
    rolloff = 10,
    poleDistance = 11,
    poleAngle = 12,
    zeroDistance = 13,
    zeroAngle = 14,
    poleReal = 15,
    zeroReal = 16
};

inline constexpr int kParamIds = 17;

struct ParamInfo {
    int32_t id;
    const char *shortName;
    const char *label;
    double minimum;
    double maximum;
    double defaultValue;
    double (*toControl)(const ParamInfo &info, double value);   // a value to a control's position, 0 to 1
    double (*toValue)(const ParamInfo &info, double position);  // and back
    std::string (*toText)(double value);
};

// What the family says of the id. Band designs call the frequency their centre.
ParamInfo familyParamInfo(ParamId id);
ParamInfo centerFrequencyInfo();

}  // namespace Dsp
