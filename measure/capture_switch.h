// SPDX-License-Identifier: MIT
//
// The two bytes that say whether the capture rings run, `captureRequested` and `captureArmed`. They are written together and read
// together, in one 16-bit access: a reader that took one after the other could see both up although they never were at once.
#pragma once

#include <cstddef>

#include "vxcomn/library_context.h"

namespace vxcomn {

static_assert(offsetof(LibraryContext, captureArmed) == offsetof(LibraryContext, captureRequested) + 1 &&
                  offsetof(LibraryContext, captureRequested) % 2 == 0,
              "the two bytes are one aligned 16-bit word");

// Both bytes as one word, which the compiler is to take for what it is.
using CaptureWord [[gnu::may_alias]] = uint16_t;

// [control]
inline void setCaptureSwitch(LibraryContext &context, bool requested, bool armed) noexcept {
    const auto word = static_cast<uint16_t>((requested ? 1 : 0) | (armed ? 0x100 : 0));
    __atomic_store_n(reinterpret_cast<CaptureWord *>(&context.captureRequested), word, __ATOMIC_SEQ_CST);
}

// Whether both bytes are up. [capture]
inline bool capturesRun(const LibraryContext &context) noexcept {
    const uint16_t word = __atomic_load_n(reinterpret_cast<const CaptureWord *>(&context.captureRequested), __ATOMIC_SEQ_CST);
    return (word & 0xFF) != 0 && (word >> 8) != 0;
}

}  // namespace vxcomn
