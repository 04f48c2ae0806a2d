// SPDX-License-Identifier: MIT
//
// The debugger output raises an exception that a debugger would take; a vectored handler in this process takes it instead.
#include "tests/support/debug_capture.h"

#include <mutex>

#include "platform/windows/sdk.h"

namespace vxcomn::testing {

namespace {

constexpr DWORD kPrintAnsi = 0x40010006;
constexpr DWORD kPrintWide = 0x4001000A;

std::mutex linesLock;
std::vector<std::string> caught;

void keep(std::string text) {
    if (!text.empty() && text.back() == '\n') text.pop_back();
    const std::lock_guard lock(linesLock);
    caught.push_back(std::move(text));
}

LONG CALLBACK take(EXCEPTION_POINTERS *exception) {
    const EXCEPTION_RECORD &record = *exception->ExceptionRecord;
    if (record.ExceptionCode == kPrintWide) {
        keep(toUtf8(reinterpret_cast<const wchar_t *>(record.ExceptionInformation[1])));
        return EXCEPTION_CONTINUE_EXECUTION;
    }
    if (record.ExceptionCode == kPrintAnsi) {
        keep(reinterpret_cast<const char *>(record.ExceptionInformation[1]));
        return EXCEPTION_CONTINUE_EXECUTION;
    }
    return EXCEPTION_CONTINUE_SEARCH;
}

}  // namespace

struct DebugCapture::Impl {
    void *handler;
};

DebugCapture::DebugCapture() : impl_(new Impl) {
    caught.clear();
    impl_->handler = AddVectoredExceptionHandler(1, take);
}

DebugCapture::~DebugCapture() {
    RemoveVectoredExceptionHandler(impl_->handler);
    delete impl_;
}

std::vector<std::string> DebugCapture::lines() const {
    const std::lock_guard lock(linesLock);
    return caught;
}

}  // namespace vxcomn::testing
