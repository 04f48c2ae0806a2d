// SPDX-License-Identifier: MIT
#include "preset/project_parameters.h"

#include <algorithm>

#include "preset/parameter_store.h"
#include "preset/store_names.h"

namespace vxcomn {
namespace {

constexpr size_t kMaxEngineNameBytes = 511;
constexpr size_t kMaxEndpointIdUnits = 1024;
constexpr int32_t kGlobalComponentId = -1;
constexpr std::string_view kApoTypes[] = {"EFX", "MFX", "SFX", "GFX", "LFX"};
constexpr std::string_view kApoFolder = "\\APO\\";

char lowerCase(char c) noexcept {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

size_t findIgnoringCase(std::string_view text, std::string_view wanted) noexcept {
    const auto *const at = std::search(text.begin(), text.end(), wanted.begin(), wanted.end(),
                                       [](char left, char right) { return lowerCase(left) == lowerCase(right); });
    return at == text.end() ? std::string_view::npos : static_cast<size_t>(at - text.begin());
}

// Cuts the last component off a path and hands it out; false, and nothing changes, if no backslash stands before one.
bool takeLast(WideString &path, WideString &component) {
    const size_t at = path.rfind(VXWCHAR{'\\'});
    if (at == WideString::npos) return false;
    component = path.substr(at + 1);
    path.resize(at);
    return true;
}

// The text between the last APO folder ahead of the slot's and that.
void readEndpointId(std::string_view path, size_t typeAt, PresetPathParts &parts) {
    const size_t folder = path.rfind(kApoFolder, typeAt);
    if (folder == std::string_view::npos || folder + kApoFolder.size() >= typeAt) return;
    const size_t begin = folder + kApoFolder.size();
    WideString id = toWide(path.substr(begin, typeAt - begin));
    id.resize(std::min(id.size(), kMaxEndpointIdUnits));
    parts.endpointId = toUtf8(id);
    parts.hasEndpointId = true;
}

}  // namespace

PresetPathParts readPresetPath(std::string_view path) {
    PresetPathParts parts;
    for (const std::string_view type : kApoTypes) {
        const size_t at = findIgnoringCase(path, "\\" + std::string(type) + "\\");
        if (at == std::string_view::npos) continue;
        parts.apoType = type;
        parts.hasType = true;
        readEndpointId(path, at, parts);
        break;
    }
    WideString rest = toWide(path), fileName;
    if (takeLast(rest, fileName) && takeLast(rest, parts.content)) takeLast(rest, parts.output);
    return parts;
}

void RecordedParameters::record(int32_t ParamId, const uint8_t *data, uint32_t size) {
    Low = std::min(Low, ParamId);
    High = std::max(High, ParamId);
    Values[ParamId].assign(data, data + size);
    Dirty = 1;
}

}  // namespace vxcomn

using namespace vxcomn;

BinProjectParameters::BinProjectParameters(const LibraryContext &context, const char *presetPath, const char *engineName,
                                           const EngineConfig &engineConfig, uint64_t moduleVersion)
    : PresetPath(presetPath != nullptr ? presetPath : ""),
      EngineName(engineName != nullptr ? engineName : ""),
      EngineDescription(engineConfig),
      Path(readPresetPath(PresetPath)),
      UserProfile(kDefaultUserProfile),
      ModuleVersion(moduleVersion),
      context_(context) {
    TraceTarget = context.trace;
    const TraceScope scope(TraceTarget, VX_TEXT("BinProjectParameters"));
    EngineName.resize(std::min(EngineName.size(), kMaxEngineNameBytes));
    log(VX_TEXT("Detected APO type from the preset path as %s\n"), Path.apoType);
    log(VX_TEXT("Received engine name '%s'\n"), EngineName);
    log(VX_TEXT("Received engine config with %i component(s)\n"), EngineDescription.ComponentCount);
    if (Path.hasType) openControl();
    formatKeys();
}

BinProjectParameters::~BinProjectParameters() {
    const TraceScope scope(TraceTarget, VX_TEXT("~BinProjectParameters"));
    if (ControlHandle != nullptr) VXAPOCOMAPI_Free(ControlHandle);
}

void BinProjectParameters::openControl() {
    const VXWCHAR *const endpoint = context_.outputEndpointId != nullptr ? context_.outputEndpointId : context_.inputEndpointId;
    if (endpoint != nullptr) {
        const VXAPOHandle api = VXAPOCOMAPI_InitializeAPI();
        if (api != nullptr) {
            ControlHandle = _VXAPOCOMAPI_GetEndpoint(api, endpoint, 0, 0, nullptr);
            if (ControlHandle == nullptr) VXAPOCOMAPI_FreeAPI(api);
        }
    } else {
        if (Path.hasEndpointId) {
            log(VX_TEXT("Parsing endpoint id ...\n"));
        } else {
            log(VX_TEXT("Preset path doesn't contain endpoint id, set as '0'\n"));
        }
        log(VX_TEXT("Endpoint id = %i\n"), Path.endpointId);
        ControlHandle = VXAPOCOMAPI_InitializeEx(Path.endpointId.c_str(), nullptr, 0);
    }
    if (ControlHandle == nullptr) {
        log(VX_TEXT("VXAPOCOMAPI_InitializeEx failed with error code %i.\n"), VXAPOCOMAPI_GetLastError(nullptr));
        return;
    }
    log(VX_TEXT("VXAPOCOMAPI_InitializeEx succeded.\n"));
    // The endpoint derives its output by itself.
    VXAPOCOMAPI_SetAPOType(ControlHandle, Path.apoType.c_str());
    VXAPOCOMAPI_SetUserProfile(ControlHandle, toUtf8(UserProfile).c_str());
    VXAPOCOMAPI_SetContentType(ControlHandle, toUtf8(Path.content).c_str());
    VXAPOCOMAPI_SetEngine(ControlHandle, EngineName.c_str(), &EngineDescription);
}

void BinProjectParameters::formatKeys() {
    ConfigurationKey = configurationKey(toWide(Path.endpointId), toWide(Path.apoType));
    ParameterKey = parameterKey({ConfigurationKey, toWide(EngineName), Path.output, UserProfile, Path.content}, ModuleVersion);
    log(VX_TEXT("Resulting registry key: HKLM\\%s\n"), ParameterKey);
}

void BinProjectParameters::SetParameter(int32_t ComponentId, int32_t ParamId, uint32_t channel, const uint8_t *data, uint32_t size,
                                        int32_t IsTransient) {
    if (context_.apoPresetPath == nullptr) {
        log(VX_TEXT("APOPresetPath = NULL\n"));
        return;
    }
    if (data == nullptr) size = 0;
    const auto storeChannel = static_cast<int32_t>(channel);
    if (ControlHandle != nullptr) {
        VXAPOCOMAPI_SetParameterEx(ControlHandle, ComponentId, ParamId, storeChannel, data, size, 0, IsTransient, nullptr, nullptr);
    }
    if (ModuleVersion <= kDirectWriteVersion && !ParameterKey.empty()) {
        log(VX_TEXT("Setting parameter at HKLM\\%s. ComponentId = %i, ParamId = %i, Channel = %i, data[0] = 0x%X, DataSize = %i\n"),
            ParameterKey, ComponentId, ParamId, storeChannel, size != 0 ? data[0] : uint8_t{0}, size);
        WriteParameter(this, ParameterKey, ComponentId, ParamId, storeChannel, {data, size}, {InstanceGuid, InstanceId},
                       IsTransient != 0, nullptr);
    }
    if (IsTransient != 0) return;
    const std::lock_guard guard(records_);
    if (ComponentId == kGlobalComponentId) {
        Global.record(ParamId, data, size);
    } else if (ComponentId >= 0 && ComponentId < kComponents) {
        Components[static_cast<size_t>(ComponentId)].record(ParamId, data, size);
    }
}
