// SPDX-License-Identifier: MIT
//
// Memory for planes of floats that begins on a cache line, so that no vector straddles two. [control]
#pragma once

#include <cstddef>

namespace vxcomn {

// `count` zeros, all in memory already, or null if memory is out.
float *allocateFloats(size_t count) noexcept;

// Null is allowed.
void freeFloats(float *floats) noexcept;

}  // namespace vxcomn
