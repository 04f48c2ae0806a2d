// SPDX-License-Identifier: MIT
//
// What opening a host instance does beyond the engine: it turns the endpoint ids of the command line into names, and decides by
// module version whether parameters are mirrored into the preset store. Control threads.
#pragma once

#include "vxcomn/library_context.h"

namespace vxcomn {

// Takes the endpoint ids of a command line ("iepid:" and "oepid:") into the context, and asks for the endpoints' names.
void nameEndpoints(LibraryContext &context, const char *CommandLine);

// Reads the module versions and makes the mirror, or says why there is none. Nothing without a preset path.
void maintainPreset(LibraryContext &context);

// Ends the mirror, if there is one.
void endPresetMaintenance(LibraryContext &context) noexcept;

// Hands a parameter to the mirror, if there is one.
void mirrorParameter(const LibraryContext &context, int32_t componentId, int32_t paramId, uint32_t channel, const uint8_t *data,
                     uint32_t dataSize, int32_t transient);

}  // namespace vxcomn
