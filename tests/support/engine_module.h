// SPDX-License-Identifier: MIT
//
// Loads an engine module from the folder of the test program, the way a customer without the library would, and binds its fourteen
// exports. Stands apart from platform/module.h so that an engine is judged without the code that will load it.
#pragma once

#include <vxcomn/engine.h>

#include <filesystem>
#include <stdexcept>
#include <string>

#if defined(__MINGW32__)
#include <windows.h>
#else
#include <dlfcn.h>
#endif

class EngineModule {
  public:
    // `name` without an extension.
    explicit EngineModule(const std::string &name) : path_(folder() / (name + kExtension)) {
#if defined(__MINGW32__)
        module_ = LoadLibraryW(path_.c_str());
#else
        module_ = dlopen(path_.c_str(), RTLD_NOW | RTLD_LOCAL);
#endif
        if (module_ == nullptr) throw std::runtime_error("cannot load " + path_.string());
        bind(initialize, "VXDSPAPI_Initialize");
        bind(free, "VXDSPAPI_Free");
        bind(isInputFormatSupported, "VXDSPAPI_IsInputFormatSupported");
        bind(isOutputFormatSupported, "VXDSPAPI_IsOutputFormatSupported");
        bind(setIOFormat, "VXDSPAPI_SetIOFormat");
        bind(setInputGain, "VXDSPAPI_SetInputGain");
        bind(createComponent, "VXDSPAPI_CreateComponent");
        bind(disposeComponent, "VXDSPAPI_DisposeComponent");
        bind(clear, "VXDSPAPI_Clear");
        bind(setParameter, "VXDSPAPI_SetParameter");
        bind(readWriteData, "VXDSPAPI_ReadWriteData");
        bind(process, "VXDSPAPI_Process");
        bind(record, "VXDSPAPI_Record");
        bind(onIdle, "VXDSPAPI_OnIdle");
    }
    EngineModule(const EngineModule &) = delete;
    EngineModule &operator=(const EngineModule &) = delete;
    ~EngineModule() {
#if defined(__MINGW32__)
        FreeLibrary(module_);
#else
        dlclose(module_);
#endif
    }

    const std::filesystem::path &path() const {
        return path_;
    }

    VXEngineInitialize initialize = nullptr;
    VXEngineFree free = nullptr;
    VXEngineIsInputFormatSupported isInputFormatSupported = nullptr;
    VXEngineIsOutputFormatSupported isOutputFormatSupported = nullptr;
    VXEngineSetIOFormat setIOFormat = nullptr;
    VXEngineSetInputGain setInputGain = nullptr;
    VXEngineCreateComponent createComponent = nullptr;
    VXEngineDisposeComponent disposeComponent = nullptr;
    VXEngineClear clear = nullptr;
    VXEngineSetParameter setParameter = nullptr;
    VXEngineReadWriteData readWriteData = nullptr;
    VXEngineProcess process = nullptr;
    VXEngineRecord record = nullptr;
    VXEngineOnIdle onIdle = nullptr;

  private:
    template <class Function>
    void bind(Function &function, const char *name) {
#if defined(__MINGW32__)
        function = reinterpret_cast<Function>(reinterpret_cast<void *>(GetProcAddress(module_, name)));
#else
        function = reinterpret_cast<Function>(dlsym(module_, name));
#endif
        if (function == nullptr) throw std::runtime_error(path_.string() + " does not export " + name);
    }

    static std::filesystem::path folder() {
#if defined(__MINGW32__)
        wchar_t path[1024];
        GetModuleFileNameW(nullptr, path, 1024);
        return std::filesystem::path(path).parent_path();
#else
        return std::filesystem::read_symlink("/proc/self/exe").parent_path();
#endif
    }

#if defined(__MINGW32__)
    static constexpr const char *kExtension = ".dll";
    HMODULE module_ = nullptr;
#else
    static constexpr const char *kExtension = ".so";
    void *module_ = nullptr;
#endif
    std::filesystem::path path_;
};
