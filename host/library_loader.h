// SPDX-License-Identifier: MIT
//
// Loads an engine module and makes the LibraryContext for it. Serves the main engine and the iSST module. Control threads.
#pragma once

#include "vxcomn/library_context.h"

namespace vxcomn {

// Loads the module `fileName`, as the system looks for it and then beside this library, makes a context, chooses the adapters by
// platform name and binds the module's exports. The context logs to `trace`, or to a logger of its own if that is null.
// Null, with nothing left behind, if there is no such module or the platform name is unknown.
LibraryContext *LoadDSPLibrary(CTraceFuncCallTarget *trace, const char *fileName, const char *PlatformName, int HostType);

// Ends a context's logger and frees its memory. The module stays as it is.
void destroyContext(LibraryContext *context) noexcept;

// A copy of a text, owned by a context; null for null. freeText releases it and nulls the pointer.
char *copyText(const char *text);
template <class Unit>
void freeText(Unit *&text) noexcept {
    delete[] text;
    text = nullptr;
}

}  // namespace vxcomn
