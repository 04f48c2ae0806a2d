// SPDX-License-Identifier: MIT
#include "platform/error_text.h"

#include "platform/windows/sdk.h"

namespace vxcomn {

WideString errorText(Status error) {
    constexpr DWORD flags = FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS;
    constexpr DWORD usersLanguage = 0x400;
    wchar_t *buffer = nullptr;
    const DWORD length = FormatMessageW(flags, nullptr, error, usersLanguage, reinterpret_cast<LPWSTR>(&buffer), 0, nullptr);
    WideString text(buffer != nullptr ? buffer : L"", length);
    LocalFree(buffer);
    return text;
}

}  // namespace vxcomn
