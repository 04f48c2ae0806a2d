// SPDX-License-Identifier: MIT
#include "library_under_test.h"

#include <stdexcept>
#include <string>

namespace realtime {
namespace {

template <class Function>
void find(void *library, const char *name, Function &function) {
    function = reinterpret_cast<Function>(findFunction(library, name));
    if (function == nullptr) throw std::runtime_error(std::string("the library lacks ") + name);
}

}  // namespace

LibraryUnderTest::LibraryUnderTest(const char *path) {
    void *library = loadLibrary(path);
    find(library, "VXDSPAPI_InitializeLibrary", initializeLibrary);
    find(library, "VXDSPAPI_FreeLibrary", freeLibrary);
    find(library, "VXDSPAPI_SetIOFormat", setIOFormat);
    find(library, "VXDSPAPI_SetParameter", setParameter);
    find(library, "VXDSPAPI_Process", process);
}

}  // namespace realtime
