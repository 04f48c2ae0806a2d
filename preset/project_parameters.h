// SPDX-License-Identifier: MIT
//
// BinProjectParameters: lets a host that is no effect module, a tuning tool say, act on the same store as the effect module. From
// the path of a preset alone it works out slot, endpoint, output and content, opens a control handle, and from then on mirrors
// every parameter that the host sets into the store, ahead of the engine. Talks to the control API by its exported functions only.
// Control threads; it blocks on the registry.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "VXAPOCOMAPI.h"
#include "platform/text.h"
#include "preset/instance_id.h"
#include "vxcomn/library_context.h"

namespace vxcomn {

// The last module version whose effect module doesn't keep its key in step with the endpoint: there a value goes to the key that
// the path tells, too.
inline constexpr uint64_t kDirectWriteVersion = 0x0002000000070046;  // 2.0.7.70

// What the path of a preset tells: ...\APO\<endpoint id>\<slot>\<output>\<content>\<file>.
struct PresetPathParts {
    std::string apoType = "?FX";  // in capitals
    bool hasType = false;
    std::string endpointId = "0";
    bool hasEndpointId = false;
    WideString output = VX_TEXT("AnyOutput");
    WideString content = VX_TEXT("AnyContent");
};
PresetPathParts readPresetPath(std::string_view path);

// The last values of one component, kept for a host; nothing here reads them.
struct RecordedParameters {
    std::map<int32_t, std::vector<uint8_t>> Values;
    int32_t Low = INT32_MAX;
    int32_t High = INT32_MIN;
    uint8_t Dirty = 0;

    void record(int32_t ParamId, const uint8_t *data, uint32_t size);
};

}  // namespace vxcomn

struct BinProjectParameters : CInstanceIDBase {
    static constexpr int32_t kComponents = 16;

    // `context` outlives the object; texts may be null. Logs to the context's logger.
    BinProjectParameters(const LibraryContext &context, const char *presetPath, const char *engineName,
                         const EngineConfig &engineConfig, uint64_t moduleVersion);
    ~BinProjectParameters() override;

    void SetParameter(int32_t ComponentId, int32_t ParamId, uint32_t channel, const uint8_t *data, uint32_t size,
                      int32_t IsTransient);

    vxcomn::RecordedParameters Global;                               // component -1
    std::array<vxcomn::RecordedParameters, kComponents> Components;  // components 0 to 15
    const std::string PresetPath;
    std::string EngineName;  // at most 511 bytes
    ::EngineConfig EngineDescription = {};
    vxcomn::PresetPathParts Path;
    vxcomn::WideString UserProfile;
    vxcomn::WideString ConfigurationKey, ParameterKey;
    VXAPOHandle ControlHandle = nullptr;  // owned, may be null
    const uint64_t ModuleVersion;

  private:
    void openControl();
    void formatKeys();

    const LibraryContext &context_;
    std::mutex records_;  // guards what is recorded: a host may set parameters on several threads
};
