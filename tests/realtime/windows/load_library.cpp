// SPDX-License-Identifier: MIT
#include <windows.h>

#include <stdexcept>
#include <string>

#include "tests/realtime/library_under_test.h"

namespace realtime {

void *loadLibrary(const char *path) {
    HMODULE library = LoadLibraryA(path);
    if (library == nullptr) throw std::runtime_error(std::string("no library at ") + path);
    return library;
}

void *findFunction(void *library, const char *name) {
    return reinterpret_cast<void *>(GetProcAddress(static_cast<HMODULE>(library), name));
}

}  // namespace realtime
