// SPDX-License-Identifier: MIT
//
// What the options --param and --set send to an engine: parameters by number with typed values, and the sliders and switches of an
// application by name. A slider runs from 0 to 1 over its range in decibels and is sent as a linear gain, as an application's is.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace vx {

struct ParameterWrite {
    std::string text;  // as asked for
    int32_t componentId = 0;
    int32_t paramId = 0;
    uint32_t channel = 0;
    std::vector<uint8_t> data;
    bool isInputGain = false;  // goes to VXDSPAPI_SetInputGain; data is the f32
};

// "COMPONENT,ID[,CHANNEL]=TYPE:VALUE[,TYPE:VALUE...]" with the types u8, u16, u32, i32, f32 and hex.
ParameterWrite parseParameter(const std::string &text);

// "NAME=VALUE": see settingNames.
ParameterWrite parseSetting(const std::string &text);

// What --set takes, a line each, for --help.
std::string settingNames();

}  // namespace vx
