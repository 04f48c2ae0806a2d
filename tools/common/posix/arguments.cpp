// SPDX-License-Identifier: MIT
#include "tools/common/arguments.h"

namespace vxcomn {

std::vector<std::string> utf8Arguments(int argc, char **argv) {
    return argc > 1 ? std::vector<std::string>(argv + 1, argv + argc) : std::vector<std::string>();
}

}  // namespace vxcomn
