// SPDX-License-Identifier: MIT
//
// What this process holds of the system beside memory: handles (open files on Linux) and threads.
#pragma once

#include <cstdint>

namespace vxcomn::testing {

struct ResourceUse {
    uint64_t handles = 0;
    uint64_t threads = 0;
};

ResourceUse resourcesInUse();

}  // namespace vxcomn::testing
