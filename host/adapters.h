// SPDX-License-Identifier: MIT
//
// What stands between the host's block functions and the engine's: a pass-through for engines on f32, a converter for engines on
// 24-bit samples in 32-bit words. Each has the shape of the engine entry that it wraps, and calls it only if the module has it.
// Real-time safe; they touch only the context's own banks of buffers.
#pragma once

#include "measure/realtime.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// Sets processAdapter and recordAdapter by platform name, exact and with case. False for an unknown name. [control]
bool chooseAdapters(LibraryContext &context, const char *PlatformName) noexcept;

// Hand the adapter's arguments on unchanged. [render] and [capture]
VXCOMN_RT void passThroughProcess(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output);
void passThroughRecord(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format);

// Converts the first output->channels slots to words (x 8388608, truncated, clamped to 24 bits, shifted left by 8), has the engine
// work on them in place, and converts back. Without an engine entry the block is still quantised. [render]
VXCOMN_RT void fixedPointProcess(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *input, IOFormat *output);

// Converts the first format->channels slots to words of the record bank (shifted left by 6) and calls the engine's record entry.
// Kept: the engine is handed the process bank, and nothing is converted back. [capture]
void fixedPointRecord(VXEngineHandle handle, ProcessBuffers *buffers, IOFormat *format);

}  // namespace vxcomn
