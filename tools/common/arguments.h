// SPDX-License-Identifier: MIT
//
// The command line as UTF-8 on both platforms. On Windows the arguments that main gets are in the code page of the day and have
// lost what it cannot spell, so they are taken from the system again, and the console is told that what is printed is UTF-8. Called
// once at the beginning of main.
#pragma once

#include <string>
#include <vector>

namespace vxcomn {

// Without the program's own name.
std::vector<std::string> utf8Arguments(int argc, char **argv);

}  // namespace vxcomn
