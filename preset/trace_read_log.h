// SPDX-License-Identifier: MIT
//
// Passes what the readers say on to an object's logger. A local object around one call of a reader; control threads.
#pragma once

#include "diag/debug_trace.h"
#include "preset/read_log.h"

namespace vxcomn {

class TraceReadLog final : public ReadLog {
  public:
    // `trace` may be null, and outlives this.
    explicit TraceReadLog(const CTraceFuncCallTarget *trace) noexcept : trace_(trace) {}

    bool listens() const override;
    void line(WideView text) override;
    void standardError(std::string_view text) override;

  private:
    const CTraceFuncCallTarget *const trace_;
};

}  // namespace vxcomn
