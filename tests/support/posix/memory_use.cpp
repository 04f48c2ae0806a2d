// SPDX-License-Identifier: MIT
#include "tests/support/memory_use.h"

#include <unistd.h>

#include <fstream>

namespace vxcomn::testing {

uint64_t memoryInUse() {
    uint64_t size = 0;
    uint64_t resident = 0;
    std::ifstream("/proc/self/statm") >> size >> resident;
    return resident * static_cast<uint64_t>(::sysconf(_SC_PAGESIZE));
}

}  // namespace vxcomn::testing
