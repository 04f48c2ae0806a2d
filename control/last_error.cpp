// SPDX-License-Identifier: MIT
#include "control/last_error.h"

#include <atomic>

#include "platform/error_text.h"

namespace vxcomn {

namespace {

std::atomic<int32_t> GlobalLastError{0};
std::atomic<uint32_t> GlobalWindowsLastError{0};

}  // namespace

int32_t globalLastError() noexcept {
    return GlobalLastError;
}

uint32_t globalWindowsLastError() noexcept {
    return GlobalWindowsLastError;
}

void storeLastError(VXAPOCOMAPI_APIContext &api, int32_t code) noexcept {
    api.LastError = code;
    GlobalLastError = code;
}

void storeGlobalLastError(int32_t code) noexcept {
    GlobalLastError = code;
}

int32_t failWith(VXAPOCOMAPI_APIContext &api, const CTraceFuncCallTarget &trace, int32_t code) noexcept {
    storeLastError(api, code);
    trace.log(VX_TEXT("Error: %i\n"), code);
    return 0;
}

int32_t failWithWindowsError(VXAPOCOMAPI_APIContext &api, Status error) noexcept {
    storeLastError(api, VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
    api.WindowsLastError = error;
    GlobalWindowsLastError = error;
    if (api.TraceTarget == nullptr || api.TraceTarget->Enabled == 0) return 0;
    try {
        constexpr int32_t code = VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE;
        api.log(VX_TEXT("Error: %i. Windows error: (%i) %s\n"), code, error, errorText(error));
    } catch (const std::exception &) {
        return 0;  // the line is lost, not the error
    }
    return 0;
}

}  // namespace vxcomn
