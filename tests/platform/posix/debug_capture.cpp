// SPDX-License-Identifier: MIT
//
// By way of a file that VXCOMN_DEBUG_OUTPUT names.
#include "tests/platform/debug_capture.h"

#include <cstdio>
#include <cstdlib>
#include <fstream>

namespace test {

std::vector<std::string> captureDebugOutput(const std::function<void()> &body) {
    const std::string file = std::string(std::getenv("VXCOMN_ROOT")) + "/debug-output";
    setenv("VXCOMN_DEBUG_OUTPUT", file.c_str(), 1);
    body();
    unsetenv("VXCOMN_DEBUG_OUTPUT");
    std::vector<std::string> lines;
    std::ifstream stream(file);
    for (std::string line; std::getline(stream, line);) lines.push_back(line);
    std::remove(file.c_str());
    return lines;
}

}  // namespace test
