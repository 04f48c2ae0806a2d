// SPDX-License-Identifier: MIT
#include "tools/vx/engine_search.h"

#include <VXDSPAPI.h>

#include <filesystem>
#include <vector>

#include "tools/vx/failure.h"
#include "tools/vx/system.h"
#include "tools/vx/text.h"

namespace vx {
namespace fs = std::filesystem;

namespace {

constexpr int kHostTypeWithoutPlatform = 3;

}  // namespace

std::vector<fs::path> modulePlaces(const std::string &module) {
    std::vector<fs::path> folders;
    if (pathOf(module).has_parent_path()) {
        folders.emplace_back();
    } else {
        folders.push_back(programFolder());
        const fs::path library = fileOfCode(reinterpret_cast<const void *>(VXDSPAPI_GetProcessFuncAddress())).parent_path();
        if (library != programFolder()) folders.push_back(library);
        folders.push_back(moduleSystemFolder());
    }
    std::vector<fs::path> places;
    for (const fs::path &folder : folders)
        for (const std::string &name : moduleFileNames(module)) places.push_back(folder / pathOf(name));
    return places;
}

std::string engineModuleName(const std::string &engine, const std::optional<std::string> &platform, int hostType) {
    if (!platform || hostType == kHostTypeWithoutPlatform) return engine + ".dll";
    if (*platform == "HiFi2" || *platform == "iSST") return engine + ".DSP.HiFi2.dll";
    if (*platform == "AIC326x") return engine + ".DSP.AIC326x.dll";
    return engine + ".DSP.dll";
}

void failEngine(const std::string &engine, const std::optional<std::string> &platform, int hostType) {
    const std::string module = engineModuleName(engine, platform, hostType);
    std::string looked;
    for (const fs::path &place : modulePlaces(module)) {
        std::error_code ignored;
        if (!fs::exists(place, ignored)) {
            looked += "\n  " + utf8Of(place);
            continue;
        }
        const ModuleProbe probe = probeModule(place);
        const std::string found = "engine " + engine + ": " + utf8Of(place);
        if (!probe.loads)
            throw Failure(ExitStatus::input,
                          found + " cannot be loaded: " + probe.reason + "; expected an engine built for this system");
        if (!probe.hasInitialize)
            throw Failure(ExitStatus::input,
                          found + " is no engine: it does not export VXDSPAPI_Initialize; check the name given to --engine");
        throw Failure(
            ExitStatus::input,
            found + " declined to run; check --command-line, --hardware and --platform, or ask the engine's maker what it needs");
    }
    throw Failure(
        ExitStatus::input,
        "engine " + engine + ": there is no " + module + "; looked for" + looked +
            "\nand where the system looks for libraries. Put the engine beside vx, or give --engine a path without the .dll");
}

}  // namespace vx
