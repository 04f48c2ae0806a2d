// SPDX-License-Identifier: MIT
#include "platform/environment.h"

#include "platform/text.h"
#include "platform/windows/sdk.h"

namespace vxcomn {

std::optional<std::string> environmentVariable(const char *name) {
    const WideString wideName = toWide(name);
    WideString value(256, L'\0');
    for (;;) {  // another thread may lengthen it between two calls
        SetLastError(ERROR_SUCCESS);
        const DWORD length = GetEnvironmentVariableW(wideName.c_str(), value.data(), static_cast<DWORD>(value.size()));
        if (length == 0 && GetLastError() != ERROR_SUCCESS) return std::nullopt;
        if (length < value.size()) {
            value.resize(length);
            return toUtf8(value);
        }
        value.resize(length);
    }
}

}  // namespace vxcomn
