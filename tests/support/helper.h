// SPDX-License-Identifier: MIT
//
// Helpers: what a test program does when a test starts it again as a child process, with `--helper NAME ARGUMENT...`. A test file
// registers its helpers beside its tests:
//
//     const test::Helper writer("write-values", [](const std::vector<std::string> &arguments) { ...; return 0; });
#pragma once

#include <string>
#include <vector>

namespace test {

using HelperFunction = int (*)(const std::vector<std::string> &arguments);

struct Helper {
    Helper(const char *name, HelperFunction function);
};

// Runs the helper that the command line names and says so; its result is the process's.
bool runHelper(int argc, char **argv, int &result);

// Prints a line in one piece, past all buffers: once it returns, the parent gets the line even if the helper is killed then.
void sayLine(const std::string &line);

}  // namespace test
