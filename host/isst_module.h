// SPDX-License-Identifier: MIT
//
// The iSST module: a second engine instance, on fixed-point samples, in series behind the main engine. Loaded and unloaded by
// parameter -25. Control threads, with VXDSPAPI_Process held up.
#pragma once

#include "vxcomn/library_context.h"

namespace vxcomn {

// Loads the module, starts it with the main context's format and creates its six components. Reasons for a failure appear in the
// log only; the main engine goes on alone.
int LoadISSTModule(LibraryContext &context);

// Disposes the components and the instance, and frees the module's context. The module file itself stays loaded.
void UnloadISSTModule(LibraryContext &context);

}  // namespace vxcomn
