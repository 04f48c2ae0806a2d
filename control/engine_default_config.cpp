// SPDX-License-Identifier: MIT
#include "VXAPOCOMAPI.h"
#include "preset/engine_table.h"

const EngineConfig *VXAPOCOMAPI_GetEngineDefaultConfig(const char *name) {
    return &vxcomn::engineDescription(name != nullptr ? name : "");
}
