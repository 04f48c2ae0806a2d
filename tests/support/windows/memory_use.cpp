// SPDX-License-Identifier: MIT
#include "tests/support/memory_use.h"

#include <windows.h>

#include <psapi.h>

namespace vxcomn::testing {

uint64_t memoryInUse() {
    PROCESS_MEMORY_COUNTERS counters{};
    if (K32GetProcessMemoryInfo(GetCurrentProcess(), &counters, sizeof counters) == 0) return 0;
    return counters.WorkingSetSize;
}

}  // namespace vxcomn::testing
