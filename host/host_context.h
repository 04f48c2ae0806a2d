// SPDX-License-Identifier: MIT
//
// Small helpers around LibraryContext that every host file needs: the context behind a handle and logging. measure/realtime.h says
// what a block may call, measure/shared_word.h how it meets words that a control call may write meanwhile.
#pragma once

#include "diag/debug_trace.h"
#include "measure/realtime.h"
#include "measure/shared_word.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// The context is the first word of what the handle points at. [any]
VXCOMN_RT_INLINE LibraryContext &contextOf(VXEngineHandle handle) noexcept {
    return **static_cast<LibraryContext **>(handle);
}

// Logs through the context's logger in use. [control]
template <class... Arguments>
void hostLog(const LibraryContext &context, const VXWCHAR *format, const Arguments &...arguments) {
    if (context.trace != nullptr) context.trace->log(format, arguments...);
}

// The logger that a trace scope of a host call writes to, or null. [control]
inline DBG_TRACE *traceOf(const LibraryContext &context) noexcept {
    return context.trace == nullptr ? nullptr : context.trace->TraceTarget;
}

}  // namespace vxcomn
