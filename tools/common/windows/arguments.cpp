// SPDX-License-Identifier: MIT
#include "tools/common/arguments.h"

#include "platform/text.h"
#include "platform/windows/sdk.h"

#include <shellapi.h>

namespace vxcomn {

std::vector<std::string> utf8Arguments(int, char **) {
    SetConsoleOutputCP(CP_UTF8);
    int count = 0;
    LPWSTR *list = CommandLineToArgvW(GetCommandLineW(), &count);
    std::vector<std::string> arguments;
    for (int i = 1; i < count; ++i) arguments.push_back(toUtf8(list[i]));
    LocalFree(reinterpret_cast<HLOCAL>(list));
    return arguments;
}

}  // namespace vxcomn
