// SPDX-License-Identifier: MIT
#include <dlfcn.h>

#include <stdexcept>

#include "tests/realtime/library_under_test.h"

namespace realtime {

void *loadLibrary(const char *path) {
    void *library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
    if (library == nullptr) throw std::runtime_error(dlerror());
    return library;
}

void *findFunction(void *library, const char *name) {
    return dlsym(library, name);
}

}  // namespace realtime
