// SPDX-License-Identifier: MIT
#include "diag/debug_trace.h"

#include <algorithm>
#include <atomic>
#include <cstring>

#include "platform/debug_output.h"
#include "platform/log_file.h"
#include "platform/registry.h"
#include "platform/thread_id.h"

namespace vxcomn {

namespace {

constexpr size_t kLineUnits = 4095;      // a line's buffer holds 4096 with its end
constexpr size_t kFileLineBytes = 8191;  // and that of a file line 8192
constexpr int32_t kMaxDepth = 1023;
constexpr int32_t kIndent = 2;

std::atomic<uint32_t> nextInstanceId{1};

template <class T>
T load(T &place) noexcept {
    return std::atomic_ref<T>(place).load(std::memory_order_relaxed);
}

template <class T>
void store(T &place, T value) noexcept {
    std::atomic_ref<T>(place).store(value, std::memory_order_relaxed);
}

// Fills the positions between two depths with blanks (going in) or ends (coming out).
void fillIndent(DBG_TRACE &trace, int32_t from, int32_t to, char unit) noexcept {
    for (int32_t i = from; i < to; ++i) {
        store(trace.IndentW[i], static_cast<VXWCHAR>(unit));
        store(trace.IndentA[i], unit);
    }
}

WideString indentation(DBG_TRACE &trace) {
    WideString blanks;
    for (VXWCHAR &unit : trace.IndentW) {
        const VXWCHAR value = load(unit);
        if (value == 0) break;
        blanks.push_back(value);
    }
    return blanks;
}

void writeToFile(const DBG_TRACE &trace, const WideString &line) {
    std::string text = toUtf8(line);
    text.resize(std::min(text.size(), kFileLineBytes));
    std::string entry = "[" + localTimeText() + "]\t" + text + "\r\n";
    entry.resize(std::min(entry.size(), kFileLineBytes));
    writeLogFile(trace.LogFile, entry);
}

}  // namespace

bool readLoggingSwitch(const VXWCHAR *subkey, const VXWCHAR *valueName) {
    const FormatArgument name(subkey);
    const WideString path = formatText(kLineUnits, VX_TEXT("Software\\Ondrevale\\Logging\\%s"), {&name, 1});
    RegistryKey key;
    if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) != status::ok) return false;
    uint32_t value = 0;
    return key.readU32(valueName, value) == RegistryRead::value && value != 0;
}

void setTraceTag(DBG_TRACE &trace, const VXWCHAR *tag) noexcept {
    if (trace.InstanceId == 0) trace.InstanceId = nextInstanceId.fetch_add(1, std::memory_order_relaxed);
    size_t length = 0;
    for (; tag[length] != 0 && length + 1 < std::size(trace.Tag); ++length) trace.Tag[length] = tag[length];
    trace.Tag[length] = 0;
}

void writeTraceLine(DBG_TRACE &trace, WideView format, std::span<const FormatArgument> arguments) noexcept {
    try {
        const WideString indent = indentation(trace);
        const FormatArgument prefix[] = {trace.Tag, static_cast<int32_t>(trace.InstanceId), static_cast<int32_t>(currentThreadId()),
                                         indent};
        WideString line = formatText(kLineUnits, VX_TEXT("%s[%i:%i]: %s"), prefix);
        line += formatText(kLineUnits, format, arguments);
        line.resize(std::min(line.size(), kLineUnits));
        if (trace.FileEnabled != 0 && trace.LogFile != nullptr) writeToFile(trace, line);
        debugOutput(line);
    } catch (const std::exception &) {
        return;  // a line that memory doesn't suffice for is lost; nothing else is
    }
}

void indentTrace(DBG_TRACE &trace) noexcept {
    const int32_t from = load(trace.Depth);
    const int32_t to = std::min(from + kIndent, kMaxDepth);
    fillIndent(trace, from, to, ' ');
    store(trace.IndentW[to], VXWCHAR{0});
    store(trace.IndentA[to], '\0');
    store(trace.Depth, to);
}

void outdentTrace(DBG_TRACE &trace) noexcept {
    const int32_t from = load(trace.Depth);
    const int32_t to = std::max(from - kIndent, 0);
    fillIndent(trace, to, from, '\0');
    store(trace.Depth, to);
}

TraceScope::TraceScope(DBG_TRACE *target, const VXWCHAR *name, WideString arguments) noexcept
    : target_(target), name_(name), arguments_(std::move(arguments)) {
    if (target_ == nullptr || target_->Enabled == 0) return;
    write(VX_TEXT("{ "));
    indentTrace(*target_);
}

TraceScope::~TraceScope() {
    if (target_ == nullptr || target_->Enabled == 0) return;
    outdentTrace(*target_);
    write(VX_TEXT("} "));
}

void TraceScope::write(const VXWCHAR *brace) const noexcept {
    try {
        WideString line(brace);
        line.append(name_).append(VX_TEXT("(")).append(arguments_).append(VX_TEXT(")\n"));
        writeTraceLine(*target_, line, {});
    } catch (const std::exception &) {
        return;
    }
}

}  // namespace vxcomn

CTraceFuncCallTarget::CTraceFuncCallTarget() noexcept : DBG_TRACE{}, TraceTarget(this) {}
