// SPDX-License-Identifier: MIT
//
// Keeps the two engine instances of a context in step: which of them runs a component, and which of them applies the input and the
// output gain, so that along the chain each is applied once. Control threads.
#pragma once

#include "vxcomn/library_context.h"

namespace vxcomn {

// Tells both engines whether they run a component: the module if it is placed there, else the main engine.
void UpdateComponentEnable(VXEngineHandle handle, int32_t componentId);

// Tells both engines which gains they leave out.
void UpdateDisableInputOutputGains(VXEngineHandle handle);

// Whether some enabled component still runs in the main engine. [control, under controlLock]
bool mainEngineHasWork(const LibraryContext &context) noexcept;

}  // namespace vxcomn
