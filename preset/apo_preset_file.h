// SPDX-License-Identifier: MIT
//
// CAPOPresetFile: everything that follows from one audio endpoint and one effect slot. Its properties hang together in a chain:
// each handler computes what the next property needs and links the next handler, so that a change high up recomputes what lies
// below.
//
//     DevicePropertyStore -> DeviceID, SSID, package, index -> DeviceIDAndEndpointIndex    (chain_device.cpp)
//     ModuleVersion -> DeviceIDAndEndpointIndex -> APOTypeStr -> IOConfigName -> ContentTypeName
//         -> UserProfileName -> EngineConfig -> EngineShortName -> ParamRegKeyName        (chain.cpp)
//
// and from there the store is the truth: seeded from the preset (seeding.cpp), overruled by what applications force
// (forced_selection.cpp), and walked for what is new (configuration_walk.cpp, parameter_walk.cpp).
//
// Control threads, never the block path: a handler may wait for the registry and up to 5 s for the slot's mutex. Locks: the state
// lock first, then Mutex. The parameter walk, and with it the stamps, the pending changes and the known clients, belongs to one
// thread at a time.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <cstring>
#include <map>
#include <memory>
#include <vector>

#include "platform/com_ptr.h"
#include "platform/registry.h"
#include "preset/change_record.h"
#include "preset/global_mutex.h"
#include "preset/instance_id.h"
#include "preset/package_reader.h"
#include "preset/parameter_store.h"
#include "preset/preset_reader.h"
#include "preset/reactive_property.h"
#include "preset/store_names.h"

namespace vxcomn {

class CUpdateFromRegistryThread;

inline constexpr int32_t kLowestComponent = -4, kHighestComponent = 31;
inline constexpr int32_t kLowestParam = -64, kHighestParam = 256;
inline constexpr size_t kComponentCount = kHighestComponent - kLowestComponent + 1;  // 36
inline constexpr size_t kParamCount = kHighestParam - kLowestParam + 1;              // 321

// In a parameter's slot: to be read again.
inline constexpr uint64_t kStampUnread = uint64_t{1} << 63;

struct GuidLess {
    bool operator()(const GUID &left, const GUID &right) const noexcept { return std::memcmp(&left, &right, sizeof(GUID)) < 0; }
};

// For each running client, component and parameter the stamp that was delivered last.
using KnownClients = std::map<GUID, std::map<int32_t, std::map<int32_t, uint64_t>>, GuidLess>;

// What the walks have seen. One thread's at a time.
struct WalkMemory {
    uint64_t configurationStamp = 0;  // last WriteTime of the configuration key
    uint64_t parametersStamp = 0;     // last WriteTime of the parameter key
    std::array<uint64_t, kComponentCount> componentStamps = {};
    std::array<std::array<uint64_t, kParamCount>, kComponentCount> parameterStamps = {};  // with kStampUnread
    KnownClients clients;

    // Every parameter counts as new again, those of the clients as well.
    void forgetParameters() {
        parametersStamp = 0;
        componentStamps.fill(0);
        for (auto &stamps : parameterStamps) stamps.fill(0);
        for (auto &[client, stamps] : clients) stamps.clear();
    }
};

// Stops and deletes the polling thread (update_thread.cpp).
struct UpdateThreadDeleter {
    void operator()(CUpdateFromRegistryThread *thread) const noexcept;
};

// The configuration that UpdateFromRegistry found, and which of it has not been served yet, in this order.
struct PendingConfiguration {
    WideString EngineName, IOConfig, UserProfile, ContentType;
    ::EngineConfig EngineConfig = {};
    bool PendingEngineName = false, PendingEngineConfig = false, PendingIOConfig = false, PendingUserProfile = false,
         PendingContentType = false;
};

}  // namespace vxcomn

struct CAPOPresetFile : CInstanceIDBase, protected vxcomn::PresetOwner {
    template <class T>
    using Property = vxcomn::ReactiveProperty<T>;
    using Text = Property<vxcomn::WideString>;

    CAPOPresetFile();
    ~CAPOPresetFile() override;

    // Hooks for a host; empty here. `root` is the open key of the store's root.
    virtual void OnConfigurationPolled(const vxcomn::RegistryKey &root, bool wokenByRegistry);
    virtual void OnParametersPolled(bool wokenByRegistry);
    virtual void OnGradualMute();

    // Sets ModuleVersion and VersionBytes from the installed module.
    void InitializeAPOPresetFile();

    // Pull what the store forces into the properties.
    void UpdateIOConfig(bool GraduallyMute);
    void UpdateEngine();
    void UpdateUserProfile();
    void UpdateContentType();

    // Seeding. ResetParameters deletes the parameter key (or, for the whole tree, everything below the root), copies every value of
    // the preset into it and notes the preset's hash; with keepPower the power parameter is not copied. Always true. The caller
    // that keeps the power switches it on again.
    bool ResetParameters(bool wholeTree, bool keepPower);
    // Copies the preset's one value back. Always true.
    bool ResetParameter(int32_t ComponentId, int32_t ParamId, bool globally);
    // Resets if the store's hash is not the preset's; whether it had to.
    bool EnsureParametersAreInRegistry();
    // What that calls in place of ResetParameters, for an owner with settings to keep; under the state lock and Mutex.
    vxcomn::PropertyHandler Reseeding;
    bool GetPresetHash(vxcomn::PresetHash &words);
    // The parameter keys of every configuration and content that exists for a slot; duplicates are kept.
    void GetAllParamRegKeysForAPOType(vxcomn::WideView apoType, std::vector<vxcomn::WideString> &keys);
    // Loads the preset at PresetFilePath; true also if there is none.
    bool LoadPreset(uint32_t flags, vxcomn::PresetParameters *parameters);
    // Reads a parameter, and seeds the store first if it isn't there. False sets the thread's last error (platform/last_error.h).
    bool GetParameter(int32_t ComponentId, int32_t ParamId, int32_t channel, uint8_t *data, uint32_t &size, GUID *source,
                      uint64_t *stamp);

    // The walks. UpdateFromRegistry looks at the configuration key, UpdateParametersFromRegistry at the parameter key; `force`
    // ignores the stamps.
    void UpdateFromRegistry(const vxcomn::RegistryKey &root, bool wokenByRegistry, bool force);
    void UpdateParametersFromRegistry(bool wokenByRegistry, bool force);
    // Asks the engine to clean its buffers, by way of the store.
    void CleanProcBuffers();
    // Everything counts as new again.
    void ResetLastParamTime();

    // The push path, for a host: starts the polling thread, or stops it and waits. False if it could not be started.
    bool StartUpdateThread(bool isClient, bool hardwareOnly);
    void StopUpdateThread();

    vxcomn::StateLock &stateLock() { return StateLock_; }

  private:
    vxcomn::PresetHash &presetHash() override { return PresetHash; }
    const vxcomn::WideString &engineShortName() const override { return EngineShortName.underLock(); }
    const ::EngineConfig &engineConfig() const override { return EngineConfig.underLock(); }
    bool engineLocked() const override { return EngineLocked.get(); }
    void setEngineShortName(const vxcomn::WideString &name) override { EngineShortName.set(name); }
    void setEngineConfig(const ::EngineConfig &config) override { EngineConfig.set(config); }

    // Ahead of the properties, which hold references to it.
    vxcomn::StateLock StateLock_;

  public:
    vxcomn::PendingConfiguration Pending;
    vxcomn::PendingChanges ParamChanges;
    vxcomn::GlobalMutex Mutex;

    Property<vxcomn::ComRef<IMMDevice>> Device{StateLock_};
    Property<vxcomn::ComRef<IAudioClient>> AudioClient{StateLock_};
    Property<vxcomn::ComRef<IPropertyStore>> DevicePropertyStore{StateLock_};
    Property<int32_t> EndpointIndex{StateLock_, -1};
    Text IOConfigName{StateLock_};
    Text APOTypeRegKeyName{StateLock_};
    Text PresetZipPath{StateLock_};
    Text PresetFilePath{StateLock_};
    Text PresetZipEntry{StateLock_};
    Text ParamRegKeyName{StateLock_};
    Text PresetSwitchMuteKey{StateLock_};
    Text EndpointGuidText{StateLock_};
    Property<GUID> EndpointGuid{StateLock_};
    Text APOTypeStr{StateLock_};
    Text EngineShortName{StateLock_};
    Property<::EngineConfig> EngineConfig{StateLock_};
    Text UserProfileName{StateLock_};
    Text ContentTypeName{StateLock_};
    Text PresetPackageName{StateLock_};
    Text DeviceID{StateLock_};
    Text SSID{StateLock_};
    Text DeviceIDAndEndpointIndex{StateLock_, VX_TEXT("0")};
    Property<uint64_t> ModuleVersion{StateLock_};  // major, minor, build, revision, 16 bits each, major highest
    std::array<uint8_t, 4> VersionBytes = {};      // the low byte of each
    vxcomn::PresetHash PresetHash = {};
    Property<bool> EngineLocked{StateLock_};

  private:
    // The rows of the chain, top to bottom (chain_device.cpp, chain.cpp).
    void DevicePropertyStore_Changing();
    void DevicePropertyStore_Changed();
    void ModuleVersion_Changing();
    void ModuleVersion_Changed();
    void DeviceIDAndEndpointIndex_Changing();
    void DeviceIDAndEndpointIndex_Changed();
    void APOTypeStr_Changing();
    void APOTypeStr_Changed();
    void IOConfigName_Changing();
    void IOConfigName_Changed();
    void ContentTypeName_Changing();
    void ContentTypeName_Changed();
    void UserProfileName_Changing();
    void UserProfileName_Changed();
    void EngineConfig_Changing();
    void EngineConfig_Changed();
    void EngineShortName_Changing();
    void EngineShortName_Changed();

    template <auto changing, auto changed, class Link>
    void link(Link &property);
    template <auto changing, auto changed, class Link>
    void unlink(Link &property);
    void deriveDeviceIdentity(IPropertyStore *store);
    void deriveEndpointIndex(IPropertyStore *store);
    void findPreset();
    vxcomn::OpenedPreset openPreset(const vxcomn::WideString &path);
    void savePresetHash(const vxcomn::WideString &keyPath);

    // Sets a property to what the store forces, unless that is nothing or stands already.
    void adopt(Text &property, const vxcomn::WideString &value, const VXWCHAR *traceName, const VXWCHAR *format);
    void writeDerivedIOConfig(const vxcomn::WideString &keyPath, vxcomn::WideView name);
    void restorePresetEngine();

    vxcomn::WideString parameterKeyFor(vxcomn::WideView apoType, vxcomn::WideView ioConfig, vxcomn::WideView contentType) const;
    bool addKeysOfPackage(const vxcomn::WideString &archive, vxcomn::WideView apoType, std::vector<vxcomn::WideString> &keys);
    void addKeysOfLooseTree(vxcomn::WideView apoType, std::vector<vxcomn::WideString> &keys);

    bool EngineForced_ = false;  // the engine in force is, or was, an application's choice

    vxcomn::WalkMemory Walk_;
    // Set on any thread; the parameter walk then forgets its stamps before it begins.
    std::atomic<bool> StampsLapsed_{false};
    std::unique_ptr<vxcomn::CUpdateFromRegistryThread, vxcomn::UpdateThreadDeleter> UpdateThread_;
};
