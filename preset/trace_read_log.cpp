// SPDX-License-Identifier: MIT
#include "preset/trace_read_log.h"

#include <cstdio>

namespace vxcomn {

bool TraceReadLog::listens() const {
    return trace_ != nullptr && trace_->TraceTarget != nullptr && trace_->TraceTarget->Enabled != 0;
}

void TraceReadLog::line(WideView text) {
    if (trace_ != nullptr) trace_->log(VX_TEXT("%s"), WideString(text));
}

void TraceReadLog::standardError(std::string_view text) {
    std::fwrite(text.data(), 1, text.size(), stderr);
}

}  // namespace vxcomn
