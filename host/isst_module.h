// SPDX-License-Identifier: MIT
//
// The iSST module: a second engine instance, on fixed-point samples, in series behind the main engine. Loaded and unloaded by
// parameter -25. Control threads, with VXDSPAPI_Process held up.
//
// Whoever calls the module holds controlLock (host/handshake.h), so that it does not go away meanwhile.
#pragma once

#include "measure/shared_word.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// Loads the module, starts it with the main context's format and creates its six components. Reasons for a failure appear in the
// log only; the main engine goes on alone.
int LoadISSTModule(LibraryContext &context);

// Disposes the components and the instance, and frees the module's context. The module file itself stays loaded.
void UnloadISSTModule(LibraryContext &context);

// Whether the module takes part. The module's own event may end that from any thread.
inline bool isstInUse(const LibraryContext &context) noexcept {
    return loadShared(context.isstLoaded) != 0;
}

}  // namespace vxcomn
