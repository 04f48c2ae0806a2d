// SPDX-License-Identifier: MIT
//
// A module for the tests of the module loader.
#include "vxcomn/types.h"

extern "C" VXCOMN_EXPORT int vxcomnTestModuleAnswer() {
    return 42;
}
