// SPDX-License-Identifier: MIT
//
// How often the crash tests go round. VXCOMN_CRASH_ROUNDS says how many writers are killed; there are a tenth as many killed owners
// and half as many rounds of notification.
#pragma once

#include <cstdlib>

#include "tests/platform/rounds.h"

namespace test {

inline int crashRounds() {
    const char *const text = std::getenv("VXCOMN_CRASH_ROUNDS");
    const int wanted = text != nullptr ? std::atoi(text) : 0;
    return wanted > 0 ? wanted : kDearProcesses ? 20 : kSanitized ? 100 : 400;
}

// The system's registry on Windows writes a parameter value by value, so what belongs together may be seen apart there.
inline constexpr bool kWholeWrites = !kDearProcesses;

}  // namespace test
