// SPDX-License-Identifier: MIT
//
// Presets and the parameter store: finding the preset of the present selection, loading it, and copying it into the store, which is
// the truth from then on. The store's hash says which preset seeded it.
#include <algorithm>
#include <mutex>
#include <optional>

#include "platform/last_error.h"
#include "platform/security.h"
#include "preset/apo_preset_file.h"
#include "preset/file_source.h"
#include "preset/package_reader.h"
#include "preset/preset_names.h"
#include "preset/trace_read_log.h"
#include "preset/value_text.h"

using namespace vxcomn;

namespace {

constexpr int32_t kPowerOnParam = -2;
constexpr int32_t kUpperBoundParam = -21, kLowerBoundParam = -20;
constexpr int32_t kUnsaidChannel = -1;

bool copy(const CTraceFuncCallTarget &trace, const WideString &key, int32_t componentId, int32_t paramId,
          std::span<const uint8_t> value) {
    return WriteParameter(&trace, key, componentId, paramId, kUnsaidChannel, value, {}, false, nullptr);
}

// Copies every value into the store, but for the bounds of the user parameters and, if it is to be kept, the power switch.
struct Seed final : PresetParameters {
    bool parameter(int32_t componentId, int32_t paramId, int32_t, std::span<const uint8_t> value) override {
        if (paramId == kUpperBoundParam || paramId == kLowerBoundParam) return true;
        if (keepPower && componentId == kGlobalComponent && paramId == kPowerOnParam) return true;
        copy(trace, key, componentId, paramId, value);
        return true;
    }

    Seed(const CTraceFuncCallTarget &traceTo, WideString keyTo, bool keep)
        : trace(traceTo), key(std::move(keyTo)), keepPower(keep) {}
    const CTraceFuncCallTarget &trace;
    const WideString key;
    const bool keepPower;
};

// Copies the one wanted value and ends the walk.
struct SeedOne final : PresetParameters {
    bool parameter(int32_t componentId, int32_t paramId, int32_t, std::span<const uint8_t> value) override {
        if (componentId != wantedComponent || paramId != wantedParam) return true;
        copy(trace, key, componentId, paramId, value);
        return false;
    }

    SeedOne(const CTraceFuncCallTarget &traceTo, WideString keyTo, int32_t componentId, int32_t paramId)
        : trace(traceTo), key(std::move(keyTo)), wantedComponent(componentId), wantedParam(paramId) {}
    const CTraceFuncCallTarget &trace;
    const WideString key;
    const int32_t wantedComponent, wantedParam;
};

void logHash(const CTraceFuncCallTarget &trace, const VXWCHAR *format, const PresetHash &words) {
    trace.log(format, words[0], words[1], words[2], words[3], words[4], words[5], words[6], words[7]);
}

std::span<const uint8_t> bytesOf(const PresetHash &words) noexcept {
    return {reinterpret_cast<const uint8_t *>(words.data()), sizeof words};
}

}  // namespace

OpenedPreset CAPOPresetFile::openPreset(const WideString &path) {
    const TraceScope scope(TraceTarget, VX_TEXT("OpenPresetFile"));
    TraceReadLog readLog(this);
    return OpenPresetFile({PresetZipPath.get(), path, SSID.get()}, openFileSource, &readLog);
}

void CAPOPresetFile::findPreset() {
    log(VX_TEXT("Updating binary preset file path ...\n"));
    const PresetKey key = {EndpointIndex.get(), APOTypeStr.get(), IOConfigName.get(), ContentTypeName.get()};
    const WideString archive = PresetZipPath.get();
    const WideString path = archive.empty() ? loosePresetPath(key) : packagePresetPath(key);
    log(VX_TEXT("Checking if preset file exists for IOConfig = %s\n"), key.ioConfig);
    if (const OpenedPreset opened = openPreset(path)) {
        log(VX_TEXT("Found preset at '%s', zip archive = '%s', zip entry = '%s'\n"), path, archive, opened.entryName);
        PresetZipEntry.set(toWide(opened.entryName));
        PresetFilePath.set(path);
        return;
    }
    log(VX_TEXT("Preset doesn't exist at '%s', zip archive = '%s'\n"), path, archive);
    PresetFilePath.set({});
    if (EngineLocked.get()) return;
    EngineConfig.set({});
    EngineShortName.set({});
}

// Under the state lock, since the hash and the engine are the object's own.
bool CAPOPresetFile::LoadPreset(uint32_t flags, PresetParameters *parameters) {
    const std::lock_guard guard(StateLock_);
    const WideString path = PresetFilePath.get();
    WideString arguments = VX_TEXT("PresetFilePath = ") + path + VX_TEXT(", LoadPresetFlags = 0x");
    appendHexadecimal(arguments, flags);
    const TraceScope scope(TraceTarget, VX_TEXT("LoadPreset"), std::move(arguments));
    TraceReadLog readLog(this);
    // In a package an empty path would be the beginning of any entry's name.
    if (path.empty()) {
        say(&readLog, VX_TEXT("Failed to open preset file.\n"));
        return true;
    }
    const OpenedPreset opened = openPreset(path);
    return !opened || loadPreset(*opened.stream, opened.size, flags, *this, parameters, &readLog).succeeded();
}

bool CAPOPresetFile::ResetParameters(bool wholeTree, bool keepPower) {
    const TraceScope scope(TraceTarget, VX_TEXT("ResetParameters"));
    // Properties are read below, and whoever holds the state lock may be waiting for the mutex.
    const std::lock_guard guard(StateLock_);
    const GlobalMutexLock lock(Mutex);
    const WideString key = ParamRegKeyName.get();
    if (key.empty()) return true;
    if (wholeTree) {
        log(VX_TEXT("Deleting content of 'HKLM\\Software\\Ondrevale\\APO' registry key\n"));
        DeleteRegKeyTree(kStoreRoot, true);
    } else {
        log(VX_TEXT("Deleting of 'HKLM\\%s' registry key\n"), key);
        DeleteRegKeyTree(key, false);
    }
    Seed seed(*this, key, keepPower);
    if (LoadPreset(LOAD_PRESET_PARAMETERS, &seed))
        savePresetHash(key);
    else
        log(VX_TEXT("Couldn't open preset file.\n"));
    return true;
}

void CAPOPresetFile::savePresetHash(const WideString &keyPath) {
    log(VX_TEXT("Saving preset hash in the registry under: %s...\n"), keyPath);
    RegistryKey key;
    if (RegistryKey::create(RegistryRoot::localMachine, keyPath, RegistryAccess::write, key, nullptr, &registrySecurity()) !=
        status::ok) {
        log(VX_TEXT("Failed to save preset hash in the registry. Couldn't create registry key.\n"));
    } else if (key.setBytes(store_name::presetHash, bytesOf(PresetHash)) != status::ok) {
        log(VX_TEXT("Failed to save preset hash in the registry.\n"));
    }
}

// Kept: whether the reset is global is not looked at.
bool CAPOPresetFile::ResetParameter(int32_t ComponentId, int32_t ParamId, bool) {
    const WideString key = ParamRegKeyName.get();
    if (key.empty()) return true;
    SeedOne seed(*this, key, ComponentId, ParamId);
    if (!LoadPreset(LOAD_PRESET_PARAMETERS, &seed)) log(VX_TEXT("Couldn't open preset file.\n"));
    return true;
}

bool CAPOPresetFile::EnsureParametersAreInRegistry() {
    const std::lock_guard guard(StateLock_);
    const GlobalMutexLock lock(Mutex);
    logHash(*this, VX_TEXT("Preset file hash = %X%X%X%X%X%X%X%X\n"), PresetHash);
    if (vxcomn::PresetHash stored = {}; GetPresetHash(stored) && stored == PresetHash) return false;
    if (Reseeding.call != nullptr) {
        Reseeding.call(Reseeding.object);
    } else {
        ResetParameters(false, false);
    }
    return true;
}

bool CAPOPresetFile::GetPresetHash(vxcomn::PresetHash &words) {
    const TraceScope scope(TraceTarget, VX_TEXT("GetPresetHash"));
    const WideString keyPath = ParamRegKeyName.get();
    RegistryKey key;
    if (RegistryKey::open(RegistryRoot::localMachine, keyPath, RegistryAccess::read, key) != status::ok) {
        log(VX_TEXT("Failed to read preset hash from the registry. Couldn't open registry key 'HKLM\\%s'\n"), keyPath);
        return false;
    }
    log(VX_TEXT("Reading preset file hash from the registry at %s\n"), keyPath);
    std::vector<uint8_t> bytes;
    if (key.readBytes(store_name::presetHash, bytes, sizeof words) != RegistryRead::value || bytes.size() != sizeof words) {
        log(VX_TEXT("Failed to read preset hash from the registry.\n"));
        return false;
    }
    std::memcpy(words.data(), bytes.data(), sizeof words);
    logHash(*this, VX_TEXT("Preset hash in the regitry = %X%X%X%X%X%X%X%X\n"), words);
    return true;
}

bool CAPOPresetFile::GetParameter(int32_t ComponentId, int32_t ParamId, int32_t channel, uint8_t *data, uint32_t &size,
                                  GUID *source, uint64_t *stamp) {
    const WideString key = ParamRegKeyName.get();
    if (key.empty()) return false;
    const uint32_t room = size;
    const auto read = [&] {
        size = room;
        return ReadParameterValue(key, ComponentId, ParamId, data, size, source, stamp);
    };
    // A value that does not fit is there: seeding would cost the user all others and change nothing.
    const auto isThere = [](Status found) { return found == status::ok || found == status::moreData; };
    Status status = read();
    std::unique_lock<StateLock> state(StateLock_, std::defer_lock);
    std::optional<GlobalMutexLock> slot;
    if (!isThere(status)) {
        state.lock();
        slot.emplace(Mutex);
        // Whoever had the mutex may have been filling the store.
        status = read();
    }
    if (!isThere(status)) {
        WideString arguments = VX_TEXT("ComponentId = ");
        appendValue(arguments, ComponentId);
        arguments += VX_TEXT(", ParamId = ");
        appendValue(arguments, ParamId);
        arguments += VX_TEXT(", Channel = ");
        appendValue(arguments, channel);
        const TraceScope scope(TraceTarget, VX_TEXT("GetParameter"), std::move(arguments));
        log(VX_TEXT("Looks like preset hasn't been loaded in the registry, load it.\n"));
        setLastError(status::ok);
        ResetParameters(false, false);
        status = read();
    }
    if (status != status::ok) setLastError(status);
    return status == status::ok;
}
