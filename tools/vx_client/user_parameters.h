// SPDX-License-Identifier: MIT
//
// The seventeen user parameters by name, in the order of their ids.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

namespace vx::client {

struct UserParameter {
    uint32_t id;
    const char *name;
    bool isSwitch;  // else a level from 0 to 1
    int32_t componentId;
    int32_t paramId;
    const char *meaning;
};

inline constexpr size_t kUserParameters = 17;
const std::array<UserParameter, kUserParameters> &userParameters();

// By name, without regard to case; fails with the names that there are.
const UserParameter &userParameter(const std::string &name);

// Null where the triple is none of the seventeen.
const UserParameter *userParameterAt(int32_t componentId, int32_t paramId);

// A level from 0 to 1, or on and off.
float parseUserValue(const UserParameter &parameter, const std::string &text);

// The five decimals that the library keeps, for documents.
double userValueNumber(float value);
std::string userValueText(const UserParameter &parameter, float value);

// A line each, for --help.
std::string userParameterHelp();

}  // namespace vx::client
