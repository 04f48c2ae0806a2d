// SPDX-License-Identifier: MIT
//
// Which endpoint a command line means: by id, by the GUID in it, by endpoint index, or by a part of its name.
#pragma once

#include <string>
#include <vector>

#include "tools/vx_client/device_list.h"

namespace vx::client {

// Fails with the candidates if none or several fit. Where several fit, one that is active goes before those that are not.
const Device &chooseEndpoint(const std::vector<Device> &devices, const std::string &text);

// Lists and chooses.
Device findEndpoint(const std::string &text);

}  // namespace vx::client
