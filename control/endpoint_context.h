// SPDX-License-Identifier: MIT
//
// VXAPOCOMAPI_EndpointContext: one audio endpoint that a client has opened. It is the endpoint's preset state (CAPOPresetFile) and
// what the control functions need of their own: the slot that was chosen, the direct line to the effect module, the level ranges
// and equaliser tables that turn sliders into engine values, and the state of the receive calls. Endpoint handles (handles.h) are
// pointers to it.
//
// Control threads. The state lock of CAPOPresetFile guards subscriptions and property stores.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

#include "control/api_context.h"
#include "control/user_parameter_table.h"
#include "platform/change_signal.h"
#include "platform/event.h"
#include "platform/module.h"
#include "preset/apo_preset_file.h"

namespace vxcomn {

// The effect slots by number.
enum class ApoType : int32_t { none = 0, efx = 1, mfx = 2, sfx = 3, gfx = 4, lfx = 5 };

// What the effect module VXAPO64U.dll exports. kind: 3 for EFX, 2 for MFX and GFX, 1 for SFX and LFX. A negative result is a
// failure.
using VXAPOAPIInitialize = HRESULT (*)(int32_t kind, void **apoHandle, const VXWCHAR *endpointGuidText, const GUID *endpointGuid,
                                       IPropertyStore *properties, int32_t hardwareOnly);
using VXAPOAPIFree = void (*)(void *apoHandle);

// A signal of changes below an open key.
struct StoreWatch {
    RegistryKey root;
    ChangeSignal signal;
};

inline constexpr const char *kApoModuleName = "VXAPO64U.dll";

}  // namespace vxcomn

struct VXAPOCOMAPI_EndpointContext final : CAPOPresetFile {
    explicit VXAPOCOMAPI_EndpointContext(VXAPOCOMAPI_APIContext &api);
    ~VXAPOCOMAPI_EndpointContext() override;

    // Opens the device and its properties, which derives the preset paths and keys, and subscribes. False if there is no such
    // device; nothing has been changed then.
    bool Initialize(const VXWCHAR *endpointId, bool hardwareOnly, bool hostsAPO);

    // Keeps a silent stream open, or lets go of it (activation.cpp). Under the state lock.
    bool ActivateEndpoint();
    void DeactivateEndpoint();

    uint32_t HandleSignature = vxcomn::kHandleSignature;
    VXAPOCOMAPI_APIContext *const ApiContext;  // not owned

    // Results of the last receive calls; they live until the next.
    std::shared_ptr<const std::vector<uint8_t>> ParamChangeBlob;
    uint32_t ParamChangeSize = 0, ParamChangeCount = 0;
    const VXWCHAR *ConfigChangeName = nullptr;
    const void *ConfigChangeData = nullptr;
    uint32_t ConfigChangeSize = 0;
    std::vector<uint8_t> ConfigChangeCopy;  // what ConfigChangeData points to
    vxcomn::StoreWatch ConfigWatch;         // of the last wait for a selection

    int32_t HardwareOnly = 0;
    int32_t HostsAPO = 0;  // talks to the effect module directly
    vxcomn::Module ApoModule;
    void *ApoHandle = nullptr;  // what ApoInitialize made
    vxcomn::VXAPOAPIInitialize ApoInitialize = nullptr;
    vxcomn::VXAPOAPIFree ApoFree = nullptr;

    Property<int32_t> APOType{stateLock()};  // vxcomn::ApoType

    // In dB. Initialize stores defaults; the preset may change them, and the bands' tables.
    vxcomn::LevelRange VoiceRange, SurroundRange, DetailRange, BassRange, EqRange;
    std::array<uint8_t, vxcomn::kBandCount> EqBandType = {};     // 0: not supported
    std::array<float, vxcomn::kBandCount> EqBandFrequency = {};  // Hz
    std::array<float, vxcomn::kBandCount> EqBandQ = {};

    // Re-entry checks. Against recursion, not against other threads: read and written apart.
    std::atomic<uint8_t> InGetUserParameterEx{0}, InSetUserParameterEx{0}, InGetUserParameter{0}, InSetUserParameter{0},
        InReceiveParamChange{0}, InReceiveConfigChange{0};
    std::atomic<uint8_t> BypassAllInPreset{0};

    // What the getters reported last, under ReportLock, a leaf.
    std::mutex ReportLock;
    vxcomn::WideString LastEngineName, LastIOConfig, LastUserProfile, LastContentType;
    vxcomn::WideString EndpointID;

    // What receive calls wait on. Idle: clear while a thread is inside. Shutdown: set by the destructor.
    vxcomn::Event ConfigIdle{vxcomn::EventReset::manual, true};
    vxcomn::Event ConfigShutdown{vxcomn::EventReset::manual};
    vxcomn::Event ConfigCancel{vxcomn::EventReset::automatic};
    vxcomn::Event ParamIdle{vxcomn::EventReset::manual, true};
    vxcomn::Event ParamShutdown{vxcomn::EventReset::manual};
    vxcomn::Event ParamCancel{vxcomn::EventReset::automatic};
    vxcomn::Event AudioEvent{vxcomn::EventReset::automatic};  // given to the audio client

  private:
    // By id; -1.0 for what couldn't be read.
    using UserSettings = std::array<float, vxcomn::kUserParameterCount>;

    void openPropertyStore(IMMDevice &device);
    void storeDefaults();
    void loadApoModule();
    void subscribe();
    void unsubscribe();

    // Subscribers.
    void takeClientMark();
    void setClientMark();
    void APOType_Changing();
    void APOType_Changed();
    void PresetFilePath_Changing() {}
    void PresetFilePath_Changed();
    void ParamRegKeyName_Changing() {}
    void ParamRegKeyName_Changed();

    void initializeApo(int32_t type);
    bool storeFitsPreset(const vxcomn::RegistryKey &key) const;
    bool storeHoldsSetting(const vxcomn::WideString &key, const vxcomn::UserParameter &parameter) const;
    bool storeHoldsSettings() const;
    UserSettings readUserSettings();
    void resetKeepingSettings();
    void reseed();
};
