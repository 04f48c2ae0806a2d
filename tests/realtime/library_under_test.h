// SPDX-License-Identifier: MIT
//
// The library under proof, loaded by its file name, so that one program serves the shipped library and those with an injected
// fault.
#pragma once

#include "VXDSPAPI.h"

namespace realtime {

struct LibraryUnderTest {
    explicit LibraryUnderTest(const char *path);

    decltype(&VXDSPAPI_InitializeLibrary) initializeLibrary;
    decltype(&VXDSPAPI_FreeLibrary) freeLibrary;
    decltype(&VXDSPAPI_SetIOFormat) setIOFormat;
    decltype(&VXDSPAPI_SetParameter) setParameter;
    decltype(&VXDSPAPI_Process) process;
};

// Loads a library for good and finds an export. Throws std::runtime_error. Of the platform's own file.
void *loadLibrary(const char *path);
void *findFunction(void *library, const char *name);

}  // namespace realtime
