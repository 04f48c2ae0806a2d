// SPDX-License-Identifier: MIT
//
// Modules by the system's own loader, and the library's entry point.
#include "platform/module.h"

#include "platform/windows/sdk.h"

namespace vxcomn {
namespace {

// Of this library; null in a program that links the rooms, which to the system means the program itself.
HMODULE ownModule = nullptr;

constexpr DWORD kMaxPathUnits = 1024;

}  // namespace

void ModuleTraits::close(Raw module) noexcept {
    freeModule(module);
}

Module loadModule(const char *name, Status *why) {
    HMODULE module = nullptr;
    DWORD error = ERROR_MOD_NOT_FOUND;
    if (name != nullptr && *name != '\0') {
        module = LoadLibraryW(toWide(name).c_str());
        if (module == nullptr) error = GetLastError();
    }
    if (why != nullptr) *why = module != nullptr ? status::ok : error;
    return Module(reinterpret_cast<void *>(module));
}

int freeModule(void *module) noexcept {
    return module != nullptr ? FreeLibrary(static_cast<HMODULE>(module)) : 0;
}

void *findExport(void *module, const char *name) noexcept {
    if (module == nullptr || name == nullptr) return nullptr;
    return reinterpret_cast<void *>(GetProcAddress(static_cast<HMODULE>(module), name));
}

WideString thisModulePath() {
    WideString path(kMaxPathUnits, L'\0');
    path.resize(GetModuleFileNameW(ownModule, path.data(), kMaxPathUnits));
    return path;
}

void setModuleDirectory(const WideString &folder) {
    SetDllDirectoryW(folder.c_str());
}

WideView moduleExtension() noexcept {
    return VX_TEXT(".dll");
}

}  // namespace vxcomn

// Records the library's own handle; does nothing else and always reports success.
extern "C" BOOL WINAPI DllMain(HINSTANCE instance, DWORD reason, LPVOID) {
    if (reason == DLL_PROCESS_ATTACH) vxcomn::ownModule = instance;
    return TRUE;
}
