// SPDX-License-Identifier: MIT
#include "host/engine_events.h"

#include <string>

#include "host/host_context.h"
#include "platform/debug_output.h"
#include "platform/thread_id.h"

namespace vxcomn {

void nullEngineCallback(LibraryContext *, int32_t, int32_t, const char *) noexcept {}

void engineTextCallback(LibraryContext *context, int32_t code, int32_t, const char *text) noexcept {
    if (code != 0 || context == nullptr || text == nullptr) return;
    try {
        const DBG_TRACE *trace = traceOf(*context);
        const std::string indent = trace == nullptr ? "" : trace->IndentA;
        debugOutput(std::to_string(currentThreadId()) + ": " + indent + text);
    } catch (const std::exception &) {
        return;  // a line that memory doesn't suffice for is lost
    }
}

}  // namespace vxcomn
