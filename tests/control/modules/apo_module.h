/* SPDX-License-Identifier: MIT
 *
 * What the stand-in for the effect module remembers of its calls, and how a test reaches it: by the exports below.
 */
#pragma once

#include <cstdint>

#include "vxcomn/com_types.h"

namespace test {

struct ApoCall {
    bool isFree;
    // Of VXAPOAPI_Initialize.
    int32_t kind;
    GUID guid;
    char guidText[64];
    void *properties;
    int32_t hardwareOnly;
    // What it gave out, or got back.
    void *handle;
};

struct ApoModuleCalls {
    int32_t count;
    ApoCall calls[16];  // later ones are only counted
    HRESULT result;     // what VXAPOAPI_Initialize is to come to
};

using GetApoModuleCalls = ApoModuleCalls *(*)();

}  // namespace test
