// SPDX-License-Identifier: MIT
//
// The measuring objects of a context: made for a format, disposed with it. Control threads, while no block runs.
#pragma once

#include "vxcomn/library_context.h"

namespace vxcomn {

// Makes all of them anew for the context's two sample rates.
void createMeasuringObjects(LibraryContext &context);

// Disposes what they own. Harmless where nothing was made.
void disposeMeasuringObjects(LibraryContext &context);

}  // namespace vxcomn
