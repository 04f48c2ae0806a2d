// SPDX-License-Identifier: MIT
//
// Small helpers around LibraryContext that every host file needs: the context behind a handle, the block path's view of words that
// a control call may write meanwhile, logging, and the strings that a context owns. measure/realtime.h says what a block may call.
#pragma once

#include <atomic>

#include "diag/debug_trace.h"
#include "measure/realtime.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// The context is the first word of what the handle points at. [any]
VXCOMN_RT_INLINE LibraryContext &contextOf(VXEngineHandle handle) noexcept {
    return **static_cast<LibraryContext **>(handle);
}

// Words of a context that a block touches even while a control call holds it up (formats' frames, silence count, rates): relaxed,
// so that neither side sees a torn or stale-forever value. [any]
template <class T>
VXCOMN_RT_INLINE T loadShared(const T &word) noexcept {
    return std::atomic_ref<T>(const_cast<T &>(word)).load(std::memory_order_relaxed);
}
template <class T>
VXCOMN_RT_INLINE void storeShared(T &word, T value) noexcept {
    std::atomic_ref<T>(word).store(value, std::memory_order_relaxed);
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
