// SPDX-License-Identifier: MIT
//
// Loading modules by name: LoadLibraryA, GetProcAddress, FreeLibrary, GetModuleFileNameW and SetDllDirectoryW, or their stand-ins.
// Control threads.
//
// On Linux a name `X.dll` is looked up, in this order: as a path if it holds a separator; in the folder that setModuleDirectory
// named; in the folder of the executable; in drive C:'s \Windows\System32; by the dynamic linker. In each place under its own name
// first and then with `.dll` replaced by `.so`. A module loaded twice is one module with two references.
#pragma once

#include "platform/status.h"
#include "platform/text.h"
#include "platform/unique.h"

namespace vxcomn {

struct ModuleTraits {
    using Raw = void *;
    static constexpr Raw none = nullptr;
    static void close(Raw module) noexcept;
};
using Module = Unique<ModuleTraits>;

// Loads a module by its UTF-8 name. Null if it is not there, is no module, or refuses to load; `why` (if given) then holds the
// status: 126 not found, 193 no module, else the system's.
Module loadModule(const char *name, Status *why = nullptr);

// Releases one reference to a module. Nonzero for success; FreeLibrary's result.
int freeModule(void *module) noexcept;

// Looks an export up by name; null if the module has none of that name.
void *findExport(void *module, const char *name) noexcept;

// The full path of this library's own file (in a test program that links the rooms, of that program). Empty if the system does not
// tell. At most 1024 units.
WideString thisModulePath();

// Adds a folder to the module search; it stays in force for the process and replaces an earlier one.
void setModuleDirectory(const WideString &folder);

// The extension that this platform's modules bear: ".dll" or ".so".
WideView moduleExtension() noexcept;

}  // namespace vxcomn
