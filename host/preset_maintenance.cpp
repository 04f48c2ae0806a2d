// SPDX-License-Identifier: MIT
#include "host/preset_maintenance.h"

#include <algorithm>
#include <memory>
#include <string_view>

#include "VXAPOCOMAPI.h"
#include "host/host_context.h"
#include "preset/module_version.h"
#include "preset/project_parameters.h"
#include "vxcomn/com_memory.h"

namespace vxcomn {
namespace {

constexpr int kHostTypeWithoutMirror = 1;
constexpr int64_t kFirstMirroredVersion = 0x0002000000050004;  // 2.0.5.4

struct ApiClose {
    void operator()(void *api) const noexcept { VXAPOCOMAPI_FreeAPI(api); }
};

// From behind the key, which may stand anywhere in the line, to the next blank.
std::string_view valueOf(std::string_view line, std::string_view key) noexcept {
    const size_t at = line.find(key);
    if (at == std::string_view::npos) return {};
    line.remove_prefix(at + key.size());
    return line.substr(0, line.find(' '));
}

VXWCHAR *copyWide(const VXWCHAR *text) {
    const WideView view(text);
    auto *copy = new VXWCHAR[view.size() + 1];
    *std::copy(view.begin(), view.end(), copy) = 0;
    return copy;
}

void nameEndpoint(VXAPOHandle api, std::string_view value, VXWCHAR *&id, VXWCHAR *&name) {
    if (value.empty()) return;
    id = copyWide(toWide(value).c_str());
    const VXAPOHandle endpoint = _VXAPOCOMAPI_GetEndpoint(api, id, 0, 0, nullptr);
    if (endpoint == nullptr) return;
    VARIANT property;
    VariantInit(&property);
    if (VXAPOCOMAPI_GetEndpointPropertyValue(endpoint, nullptr, VXAPOCOMAPI_EndpointPropID_DeviceID, &property) != 0 &&
        property.vt == VT_BSTR && property.bstrVal != nullptr) {
        name = copyWide(property.bstrVal);
    }
    VariantClear(&property);
    VXAPOCOMAPI_FreeEndpoint(endpoint);
}

// A part of a version as the messages have it: its low 8 bits.
int32_t lowByte(uint64_t version, int part) noexcept {
    return versionPart(version, part) & 0xFF;
}

void sayIncompatible(const LibraryContext &context) {
    const uint64_t apo = context.apoModuleVersion, own = context.thisModuleVersion;
    if (lowByte(apo, 0) == 0) return;
    if (context.hostType == kHostTypeWithoutMirror) {
        hostLog(context, VX_TEXT("Incompatible host! APO version %i.%i.%i.%i. Cannot modify preset file '%s'"), lowByte(apo, 0),
                lowByte(apo, 1), lowByte(apo, 2), lowByte(apo, 3), context.apoPresetPath);
    } else {
        hostLog(context, VX_TEXT("Incompatible APO version %i.%i.%i.%i. Must be %i.%i.%i.%i. Cannot modify preset file '%s'"),
                lowByte(apo, 0), lowByte(apo, 1), lowByte(apo, 2), lowByte(apo, 3), lowByte(own, 0), lowByte(own, 1),
                lowByte(own, 2), lowByte(own, 3), context.apoPresetPath);
    }
}

}  // namespace

void nameEndpoints(LibraryContext &context, const char *CommandLine) {
    if (CommandLine == nullptr) return;
    const std::string_view input = valueOf(CommandLine, "iepid:"), output = valueOf(CommandLine, "oepid:");
    if (input.empty() && output.empty()) return;
    const std::unique_ptr<void, ApiClose> api(VXAPOCOMAPI_InitializeAPI());
    if (!api) return;
    nameEndpoint(api.get(), input, context.inputEndpointId, context.inputEndpointName);
    nameEndpoint(api.get(), output, context.outputEndpointId, context.outputEndpointName);
}

void maintainPreset(LibraryContext &context) {
    if (context.apoPresetPath == nullptr) return;
    context.apoModuleVersion = GetAPOModuleVersion(*context.trace, systemFacts(), &context.thisModuleVersion, VersionLog::problems);
    if (context.hostType != kHostTypeWithoutMirror && static_cast<int64_t>(context.apoModuleVersion) >= kFirstMirroredVersion) {
        context.projectParameters = new BinProjectParameters(context, context.apoPresetPath, context.engineShortName,
                                                             context.engineDescription, context.apoModuleVersion);
    } else {
        sayIncompatible(context);
    }
}

void endPresetMaintenance(LibraryContext &context) noexcept {
    delete context.projectParameters;
    context.projectParameters = nullptr;
}

void mirrorParameter(const LibraryContext &context, int32_t componentId, int32_t paramId, uint32_t channel, const uint8_t *data,
                     uint32_t dataSize, int32_t transient) {
    if (context.projectParameters == nullptr) return;
    context.projectParameters->SetParameter(componentId, paramId, channel, data, dataSize, transient);
}

}  // namespace vxcomn
