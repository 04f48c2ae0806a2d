// SPDX-License-Identifier: MIT
//
// The logger. Every object that has something to say carries a DBG_TRACE through its base class CTraceFuncCallTarget and logs
// through TraceTarget, which is itself unless another object's log is shared. A line names the module tag, the object's number and
// the thread, is indented by the call depth and goes to the debugger output. Off unless the registry switches it on for the module.
//
// Control threads; never the block path. Threads may share a logger without a lock: lines stay whole, and only their indentation
// may interleave.
#pragma once

#include <array>
#include <cstdint>

#include "diag/format_text.h"
#include "platform/text.h"

// State of one logger. Zero-filled at construction.
struct DBG_TRACE {
    uint32_t InstanceId;    // number in the process, 0 until a tag is set
    int32_t Depth;          // indentation in characters, 0 to 1023
    VXWCHAR IndentW[1024];  // Depth blanks, terminated
    char IndentA[1024];     // the same
    VXWCHAR Tag[256];       // module tag
    uint8_t FileEnabled;    // file sink on
    void *LogFile;          // file sink; a LogFileHandle's raw value, not owned
    VXWCHAR LogPath[2048];  // path of the log file
    uint8_t Enabled;        // every call site and the tracer test this
};

struct CTraceFuncCallTarget : DBG_TRACE {
    CTraceFuncCallTarget() noexcept;
    virtual ~CTraceFuncCallTarget() = default;
    CTraceFuncCallTarget(const CTraceFuncCallTarget &) = delete;
    CTraceFuncCallTarget &operator=(const CTraceFuncCallTarget &) = delete;

    // Writes a line if logging is on.
    template <class... Arguments>
    void log(const VXWCHAR *format, const Arguments &...arguments) const;

    CTraceFuncCallTarget *TraceTarget;  // receives this object's lines
};

struct CTraceFuncCallTargetAndTypeID : CTraceFuncCallTarget {
    int32_t TypeID = 0;
};

namespace vxcomn {

// Whether logging is to be on: the 4-byte value `valueName` under HKLM "Software\Ondrevale\Logging\<subkey>" is there and not 0.
bool readLoggingSwitch(const VXWCHAR *subkey, const VXWCHAR *valueName);

// Gives the logger its number, if it has none yet, and its tag, cut to 255 characters.
void setTraceTag(DBG_TRACE &trace, const VXWCHAR *tag) noexcept;

// Writes a line, whether logging is on or not: call sites test Enabled.
void writeTraceLine(DBG_TRACE &trace, WideView format, std::span<const FormatArgument> arguments) noexcept;

// One level in, one level out: two blanks, held to 0 and 1023.
void indentTrace(DBG_TRACE &trace) noexcept;
void outdentTrace(DBG_TRACE &trace) noexcept;

// Logs the entry and the exit of a function and moves the indentation between. Inert if the logger is null or off.
class TraceScope {
  public:
    TraceScope(DBG_TRACE *target, const VXWCHAR *name) noexcept : TraceScope(target, name, WideString()) {}
    TraceScope(DBG_TRACE *target, const VXWCHAR *name, WideString arguments) noexcept;
    ~TraceScope();
    TraceScope(const TraceScope &) = delete;
    TraceScope &operator=(const TraceScope &) = delete;

  private:
    // Kept: the line is the format, so a percent sign in a name or an argument text is read as a directive.
    void write(const VXWCHAR *brace) const noexcept;

    DBG_TRACE *target_;
    const VXWCHAR *name_;
    WideString arguments_;
};

}  // namespace vxcomn

template <class... Arguments>
void CTraceFuncCallTarget::log(const VXWCHAR *format, const Arguments &...arguments) const {
    if (TraceTarget == nullptr || TraceTarget->Enabled == 0) return;
    const std::array<vxcomn::FormatArgument, sizeof...(Arguments)> list{vxcomn::FormatArgument(arguments)...};
    vxcomn::writeTraceLine(*TraceTarget, format, list);
}
