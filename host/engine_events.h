// SPDX-License-Identifier: MIT
//
// The callbacks that engines receive at VXDSPAPI_Initialize. Any control thread of the engine.
#pragma once

#include "vxcomn/engine.h"

namespace vxcomn {

// Takes no notice.
void nullEngineCallback(LibraryContext *context, int32_t code, int32_t subCode, const char *text) noexcept;

// Code 0: writes "<thread>: <indentation><text>" to the debugger output, whether logging is on or not. Anything else: nothing.
void engineTextCallback(LibraryContext *context, int32_t code, int32_t subCode, const char *text) noexcept;

}  // namespace vxcomn
