// SPDX-License-Identifier: MIT
#include "preset/module_version.h"

#include <optional>

#include "platform/file_version.h"
#include "platform/last_error.h"
#include "platform/module.h"
#include "platform/system_folder.h"

namespace vxcomn {
namespace {

constexpr WideView kInstalledModule32 = VX_TEXT("\\VXCOMN32U.dll");
constexpr WideView kInstalledModule64 = VX_TEXT("\\VXCOMN64U.dll");

void logVersion(const CTraceFuncCallTarget &trace, const VXWCHAR *format, uint64_t version) {
    trace.log(format, versionPart(version, 0), versionPart(version, 1), versionPart(version, 2), versionPart(version, 3));
}

// What stands at the end of a path from its last full stop on; nothing if its name has none.
WideView extensionOf(WideView path) noexcept {
    const size_t at = path.find_last_of(VX_TEXT("./\\"));
    return at == WideView::npos || path[at] != VXWCHAR{'.'} ? WideView() : path.substr(at);
}

uint64_t versionOfThisModule(const CTraceFuncCallTarget &trace, uint64_t *out, VersionLog wanted) {
    const WideString path = thisModulePath();
    if (path.empty()) {
        trace.log(VX_TEXT("Failed to retrieve this module version, GetModuleFileName failed with error code %i.\n"), lastError());
        return 0;
    }
    if (wanted == VersionLog::all) trace.log(VX_TEXT("This module path = %s.\n"), path);
    const WideView extension = extensionOf(path);
    if (!equalIgnoringCase(extension, moduleExtension())) {
        trace.log(VX_TEXT("Invalid module extension '%s'.\n"), WideString(extension));
        return 0;
    }
    const std::optional<uint64_t> version = fileVersion(path);
    if (!version) return 0;
    if (wanted == VersionLog::all) logVersion(trace, VX_TEXT("This module version = { %i, %i, %i, %i }.\n"), *version);
    if (out != nullptr) *out = *version;
    return *version;
}

}  // namespace

uint64_t GetAPOModuleVersion(const CTraceFuncCallTarget &trace, const SystemFacts &facts, uint64_t *thisModuleVersion,
                             VersionLog wanted) {
    const TraceScope scope(wanted == VersionLog::all ? trace.TraceTarget : nullptr, VX_TEXT("GetAPOModuleVersion"));
    uint64_t version = versionOfThisModule(trace, thisModuleVersion, wanted);
    WideString installed = packageFolder(facts);
    installed += facts.nativeArchitecture == kArchitectureX86 ? kInstalledModule32 : kInstalledModule64;
    Status why = status::ok;
    if (const std::optional<uint64_t> found = fileVersion(installed, &why)) {
        version = *found;
    } else if (why == status::badExeFormat || why == status::resourceTypeNotFound) {
        version = 0;  // it is there, and tells none
    } else {
        trace.log(VX_TEXT("Couldn't access '%s' module file, error code = %i.\n"), installed, why);
    }
    if (wanted == VersionLog::all) logVersion(trace, VX_TEXT("Returning APO module version = { %i, %i, %i, %i }.\n"), version);
    return version;
}

}  // namespace vxcomn
