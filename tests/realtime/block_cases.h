// SPDX-License-Identifier: MIT
//
// The ways through VXDSPAPI_Process: each test signal, the filter, meters and analysers, both adapters, the second engine, the
// guards.
#pragma once

#include <vector>

#include "library_under_test.h"

namespace realtime {

struct BlockCase {
    const char *name;
    const char *platform = nullptr;
    const char *presetPath = nullptr;
    int32_t hostType = 0;
    int frames = 480;
    void (*prepare)(const LibraryUnderTest &library, VXHandle handle, LibraryContext &context) = nullptr;
};

std::vector<BlockCase> blockCases();

}  // namespace realtime
