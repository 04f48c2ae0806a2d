// SPDX-License-Identifier: MIT
#include "tools/vx_client/user_parameters.h"

#include <cmath>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

constexpr int32_t kLevel = -12;
// Kept: band 10 lies at 1600 Hz, behind 8 kHz; control panels are calibrated with it.
constexpr std::array<UserParameter, kUserParameters> kParameters = {{
    {0, "power", true, -1, -2, "the effects as a whole; for all configurations of the slot"},
    {1, "bass", false, 3, kLevel, "low frequencies"},
    {2, "detail", false, 2, kLevel, "high frequencies"},
    {3, "voice", false, 0, kLevel, "the octaves of speech"},
    {4, "surround", false, 1, kLevel, "width"},
    {5, "eq", true, 5, 115, "the equaliser"},
    {6, "eq1", false, 5, 117, "equaliser, 31 Hz unless the preset says otherwise"},
    {7, "eq2", false, 5, 118, "62 Hz"},
    {8, "eq3", false, 5, 119, "125 Hz"},
    {9, "eq4", false, 5, 120, "250 Hz"},
    {10, "eq5", false, 5, 121, "500 Hz"},
    {11, "eq6", false, 5, 122, "1 kHz"},
    {12, "eq7", false, 5, 123, "2 kHz"},
    {13, "eq8", false, 5, 124, "4 kHz"},
    {14, "eq9", false, 5, 125, "8 kHz"},
    {15, "eq10", false, 5, 126, "1.6 kHz"},
    {16, "bypass", true, -1, -18, "the input, untouched"},
}};

}  // namespace

const std::array<UserParameter, kUserParameters> &userParameters() {
    return kParameters;
}

const UserParameter &userParameter(const std::string &name) {
    std::string names;
    for (const UserParameter &parameter : kParameters) {
        if (lowered(name) == parameter.name) return parameter;
        names += std::string(names.empty() ? "" : " ") + parameter.name;
    }
    throw Failure(ExitStatus::usage, "there is no user parameter \"" + name + "\"; there are: " + names);
}

const UserParameter *userParameterAt(int32_t componentId, int32_t paramId) {
    for (const UserParameter &parameter : kParameters)
        if (parameter.componentId == componentId && parameter.paramId == paramId) return &parameter;
    return nullptr;
}

float parseUserValue(const UserParameter &parameter, const std::string &text) {
    const std::string word = lowered(text);
    if (parameter.isSwitch) {
        if (word == "on" || word == "1" || word == "true") return 1.0F;
        if (word == "off" || word == "0" || word == "false") return 0.0F;
        throw Failure(ExitStatus::usage, std::string(parameter.name) + " " + text + ": expected on or off");
    }
    const auto number = parseNumber(text);
    if (!number || *number < 0.0 || *number > 1.0)
        throw Failure(ExitStatus::usage, std::string(parameter.name) + " " + text + ": expected a level from 0 to 1");
    return static_cast<float>(*number);
}

double userValueNumber(float value) {
    constexpr double kSteps = 100000.0;
    return std::round(static_cast<double>(value) * kSteps) / kSteps;
}

std::string userValueText(const UserParameter &parameter, float value) {
    if (parameter.isSwitch) return value != 0.0F ? "on" : "off";
    return textf("%.5g", static_cast<double>(value));
}

std::string userParameterHelp() {
    std::string lines;
    for (const UserParameter &parameter : kParameters)
        lines += textf("  %-9s %-9s %s\n", parameter.name, parameter.isSwitch ? "on off" : "0 to 1", parameter.meaning);
    return lines;
}

}  // namespace vx::client
