// SPDX-License-Identifier: MIT
//
// As a debugger gets it: the system raises an exception that carries the text. Some systems raise one that carries wide text first;
// others turn wide text into the code page of the day and raise the narrow one.
#include "tests/platform/debug_capture.h"

#include <iterator>

#include "platform/text.h"
#include "platform/windows/sdk.h"

namespace test {
namespace {

std::vector<std::string> *captured = nullptr;

constexpr DWORD kNarrowText = 0x40010006, kWideText = 0x4001000A;

void keep(std::string text) {
    if (text.ends_with('\n')) text.pop_back();
    captured->push_back(text);
}

LONG CALLBACK onException(EXCEPTION_POINTERS *pointers) {
    const EXCEPTION_RECORD &record = *pointers->ExceptionRecord;
    if (record.ExceptionCode == kNarrowText) {
        const auto *text = reinterpret_cast<const char *>(record.ExceptionInformation[1]);
        wchar_t wide[256];
        MultiByteToWideChar(CP_ACP, 0, text, -1, wide, static_cast<int>(std::size(wide)));
        keep(vxcomn::toUtf8(wide));
    } else if (record.ExceptionCode == kWideText) {
        keep(vxcomn::toUtf8(reinterpret_cast<const wchar_t *>(record.ExceptionInformation[1])));
    } else {
        return EXCEPTION_CONTINUE_SEARCH;
    }
    return EXCEPTION_CONTINUE_EXECUTION;
}

}  // namespace

std::vector<std::string> captureDebugOutput(const std::function<void()> &body) {
    std::vector<std::string> lines;
    captured = &lines;
    void *handler = AddVectoredExceptionHandler(1, onException);
    body();
    RemoveVectoredExceptionHandler(handler);
    captured = nullptr;
    return lines;
}

}  // namespace test
