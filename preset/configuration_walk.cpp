// SPDX-License-Identifier: MIT
//
// The walk over the configuration key, and what both walks are asked for from outside.
#include "platform/registry.h"
#include "preset/apo_preset_file.h"
#include "preset/forced_selection.h"
#include "preset/parameter_walk.h"

namespace vxcomn {
namespace {

// Reads what the key forces; the setter's life is looked at with each.
void readConfiguration(const RegistryKey &key, PendingConfiguration &pending) {
    pending.EngineName = readForcedEngineName(key);
    pending.PendingEngineName = !pending.EngineName.empty();
    pending.EngineConfig = readForcedEngineConfig(key);
    pending.PendingEngineConfig = pending.EngineConfig.ComponentCount != 0;
    readForcedIOConfig(key, pending.IOConfig);
    pending.PendingIOConfig = !pending.IOConfig.empty();
    pending.UserProfile = readUserProfile(key);
    pending.PendingUserProfile = !pending.UserProfile.empty();
    pending.ContentType = readContentType(key);
    pending.PendingContentType = !pending.ContentType.empty();
}

WideString walkArguments(const VXWCHAR *format, const WideString &path, const GlobalMutex &mutex) {
    const FormatArgument arguments[] = {path, reinterpret_cast<uintptr_t>(&mutex)};
    return formatText(SIZE_MAX, format, arguments);
}

constexpr auto kConfigurationArguments = VX_TEXT("APOTypeRegKeyName = %s, GlobalMutex = 0x%llX");

}  // namespace
}  // namespace vxcomn

void CAPOPresetFile::UpdateFromRegistry(const vxcomn::RegistryKey &root, bool wokenByRegistry, bool force) {
    using namespace vxcomn;
    const WideString path = APOTypeRegKeyName.get();
    if (path.empty()) return;
    Pending = {};
    RegistryKey key;
    if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) != status::ok) {
        const TraceScope scope(TraceTarget, VX_TEXT("UpdateFromRegistry"), walkArguments(kConfigurationArguments, path, Mutex));
        log(VX_TEXT("Failed to open registry key HKLM\\%s to check for new Engine, IOConfig, ContentType and ContentType\n"), path);
    }
    const std::lock_guard guard(StateLock_);
    const GlobalMutexLock lock(Mutex);
    uint64_t stamp = 0;
    if (key.readU64(store_name::writeTime, stamp) == RegistryRead::value && (force || stamp != Walk_.configurationStamp)) {
        const TraceScope scope(TraceTarget, VX_TEXT("UpdateFromRegistry"), walkArguments(kConfigurationArguments, path, Mutex));
        log(VX_TEXT("New write timestamp = %i\n"), stamp);
        Walk_.configurationStamp = stamp;
        readConfiguration(key, Pending);
    }
    key.close();
    OnConfigurationPolled(root, wokenByRegistry);
}

void CAPOPresetFile::UpdateParametersFromRegistry(bool wokenByRegistry, bool force) {
    using namespace vxcomn;
    if (StampsLapsed_.exchange(false, std::memory_order_acq_rel)) Walk_.forgetParameters();
    ParamChanges.clear();
    const WideString parameterKey = ParamRegKeyName.get();
    if (!parameterKey.empty()) {
        ParameterWalk walk(*this, Walk_, ParamChanges, force);
        walk.lookAtClients(APOTypeRegKeyName.get());
        walk.lookAtParameters(parameterKey, &Mutex);
    }
    OnParametersPolled(wokenByRegistry);
}

void CAPOPresetFile::CleanProcBuffers() {
    using namespace vxcomn;
    const TraceScope scope(TraceTarget, VX_TEXT("CAPOPresetFile::CleanProcBuffers"));
    const WideString parameterKey = ParamRegKeyName.get();
    if (parameterKey.empty()) return;
    const uint8_t on = 1;
    WriteParameter(this, parameterKey, kGlobalComponent, kCleanBuffersParam, kAllChannels, {&on, 1}, {}, false, nullptr);
}

void CAPOPresetFile::ResetLastParamTime() {
    using namespace vxcomn;
    const TraceScope scope(TraceTarget, VX_TEXT("CAPOPresetFile::ResetLastParamTime"));
    StampsLapsed_.store(true, std::memory_order_release);
}
