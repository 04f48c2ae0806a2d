// SPDX-License-Identifier: MIT
//
// What debugOutput wrote while something ran, one entry for each call's piece.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace test {

std::vector<std::string> captureDebugOutput(const std::function<void()> &body);

}  // namespace test
