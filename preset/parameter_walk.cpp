// SPDX-License-Identifier: MIT
#include "preset/parameter_walk.h"

#include <algorithm>
#include <cstring>
#include <optional>
#include <string>
#include <utility>

#include "preset/store_value_name.h"

namespace vxcomn {
namespace {

constexpr auto kMachine = RegistryRoot::localMachine;
constexpr int32_t kNoNumber = INT32_MIN;
constexpr int kMostReadings = 16;  // of one value, while others write it

bool isOpaque(const RegistryValue &value, size_t size) {
    return (value.type == RegistryType::qword || value.type == RegistryType::binary) && value.data.size() == size;
}

std::optional<uint64_t> stampOf(const RegistryValue &value) {
    uint64_t stamp = 0;
    if (!isOpaque(value, sizeof stamp)) return std::nullopt;
    std::memcpy(&stamp, value.data.data(), sizeof stamp);
    return stamp;
}

// The stamp of a parameter, without the bit that a slot's mark needs.
std::optional<uint64_t> parameterStampOf(const RegistryValue &value) {
    const std::optional<uint64_t> stamp = stampOf(value);
    return stamp ? std::optional(*stamp & ~kStampUnread) : stamp;
}

const RegistrySubkey *find(const std::vector<RegistrySubkey> &keys, WideView name) {
    const auto key = std::find_if(keys.begin(), keys.end(),
                                  [&](const RegistrySubkey &candidate) { return equalIgnoringCase(candidate.name, name); });
    return key != keys.end() && key->key ? &*key : nullptr;
}

}  // namespace

uint64_t &ParameterWalk::slot(int32_t componentId, int32_t paramId) {
    return memory_
        .parameterStamps[static_cast<size_t>(componentId - kLowestComponent)][static_cast<size_t>(paramId - kLowestParam)];
}

void ParameterWalk::lookAtParameters(const WideString &parameterKey, const void *mutex) {
    parameterKey_ = parameterKey;
    uint64_t stamp = 0;
    if (!keyStamp(stamp)) {
        RegistryKey key;
        if (RegistryKey::open(kMachine, parameterKey_, RegistryAccess::read, key) != status::ok) {
            const TraceScope scope(trace_.TraceTarget, VX_TEXT("UpdateParamsFromRegistry"));
            trace_.log(VX_TEXT("Failed to open registry key HKLM\\%s to check for new parameters\n"), parameterKey_);
            return;
        }
    } else if (isNew(memory_.parametersStamp, stamp)) {
        const FormatArgument arguments[] = {parameterKey_, reinterpret_cast<uintptr_t>(mutex)};
        const TraceScope scope(trace_.TraceTarget, VX_TEXT("UpdateParametersFromRegistry"),
                               formatText(SIZE_MAX, VX_TEXT("ParamRegKeyName = %s, GlobalMutex = 0x%llX"), arguments));
        trace_.log(VX_TEXT("ParamRegKeyName = %s\n"), parameterKey_);
        trace_.log(VX_TEXT("Receiving new parameters from the registry with timestamp %llu (previous timestamp %llu)...\n"), stamp,
                   memory_.parametersStamp);
        memory_.parametersStamp = stamp;
        walkComponents();
    }
    trace_.log(VX_TEXT("Done\n"));
}

bool ParameterWalk::keyStamp(uint64_t &stamp) const {
    RegistryValue value;
    if (RegistryKey::queryAt(kMachine, parameterKey_, store_name::writeTime, value, sizeof stamp) != status::ok) return false;
    const std::optional<uint64_t> read = stampOf(value);
    if (read) stamp = *read;
    return read.has_value();
}

void ParameterWalk::walkComponents() {
    RegistryKey key;
    std::vector<RegistrySubkey> components;
    if (RegistryKey::open(kMachine, parameterKey_, RegistryAccess::read, key) != status::ok ||
        key.openSubkeys(RegistryAccess::read, store_name::writeTime, sizeof(uint64_t), components) != status::ok) {
        memory_.parametersStamp = 0;  // it has gone meanwhile
        return;
    }
    for (RegistrySubkey &component : components) walkComponent(component);
}

void ParameterWalk::walkComponent(RegistrySubkey &key) {
    const int32_t id = parseDecimal(key.name).value_or(kNoNumber);
    if (id < kLowestComponent || id > kHighestComponent) {
        trace_.log(VX_TEXT("Component id is out of range (%i)!\n"), id);
        return;
    }
    if (!key.key) {
        trace_.log(VX_TEXT("Failed to open registry key HKLM\\%s\\%s to check for new parameters\n"), parameterKey_, key.name);
        return;
    }
    const std::optional<uint64_t> written = key.value ? stampOf(*key.value) : std::nullopt;
    uint64_t &seen = memory_.componentStamps[static_cast<size_t>(id - kLowestComponent)];
    if (!written || !isNew(seen, *written)) return;
    seen = *written;

    std::vector<RegistrySubkey> parts;
    std::vector<RegistryEntry> times;
    const Status opened = key.key.openSubkeys(RegistryAccess::read, store_name::writeTime, 0, parts);
    const RegistrySubkey *const time = find(parts, store_name::time);
    // Without Source nobody has said who wrote, which is as good as a source.
    if (opened != status::ok || time == nullptr || find(parts, store_name::data) == nullptr ||
        time->key.entries(sizeof(uint64_t), times) != status::ok) {
        trace_.log(VX_TEXT("Failed to  retrieve parameter Time/Data values under registry key HKLM\\%s\\%s\n"), parameterKey_,
                   key.name);
        return;
    }
    const WalkedComponent component{id, key};
    Marked marked;
    for (const RegistryEntry &entry : times) {
        const std::optional<uint64_t> stamp = parameterStampOf(entry.value);
        if (!stamp) continue;
        if (entry.name.find(VXWCHAR{','}) == WideString::npos) {
            walkSharedValue(component, entry, *stamp, marked);
        } else {
            walkPrivateValue(component, entry, *stamp, marked);
        }
    }
    deliverMarked(component, marked);
}

void ParameterWalk::walkSharedValue(const WalkedComponent &component, const RegistryEntry &time, uint64_t stamp, Marked &marked) {
    const int32_t paramId = parseDecimal(time.name).value_or(kNoNumber);
    if (paramId < kLowestParam || paramId > kHighestParam) {
        trace_.log(VX_TEXT("Parameter id is out of range (%s)!\n"), time.name);
        return;
    }
    if (isNew(slot(component.id, paramId), stamp)) mark(component.id, paramId, stamp, marked);
}

void ParameterWalk::walkPrivateValue(const WalkedComponent &component, const RegistryEntry &time, uint64_t stamp, Marked &marked) {
    const StoreValueName name = parseValueName(time.name);
    const bool isKnown = name.client && (memory_.clients.contains(*name.client) || hasJoined(*name.client));
    if (!isKnown) deleteParameterValue(parameterKey_, component.key.name, time.name);
    const int32_t paramId = name.paramId.value_or(kNoNumber);
    if (paramId < kLowestParam || paramId > kHighestParam) {
        trace_.log(VX_TEXT("Parameter id is out of range (%s)!\n"), time.name);
        return;
    }
    if (!isKnown) {
        // The shared value holds again, whatever its stamp.
        mark(component.id, paramId, 0, marked);
        return;
    }
    uint64_t &seen = memory_.clients[*name.client][component.id][paramId];
    if (!isNew(seen, stamp)) return;
    Reading reading = read(component.key.key, time.name, stamp);
    reading.source = *name.client;
    seen = reading.stamp;
    DeliverParameter(component, paramId, time.name, std::move(reading), true);
}

void ParameterWalk::mark(int32_t componentId, int32_t paramId, uint64_t stamp, Marked &marked) {
    slot(componentId, paramId) = stamp | kStampUnread;
    marked.low = std::min(marked.low, paramId);
    marked.high = std::max(marked.high, paramId);
}

void ParameterWalk::deliverMarked(const WalkedComponent &component, const Marked &marked) {
    for (int32_t paramId = marked.low; paramId <= marked.high; ++paramId) {
        uint64_t &seen = slot(component.id, paramId);
        if ((seen & kStampUnread) == 0) continue;
        const WideString name = parameterValueName(paramId);
        Reading reading = read(component.key.key, name, seen & ~kStampUnread);
        seen = reading.stamp;
        DeliverParameter(component, paramId, name, std::move(reading), false);
    }
}

ParameterWalk::Reading ParameterWalk::read(const RegistryKey &component, const WideString &name, uint64_t stamp) {
    Reading reading;
    for (int i = 0; i < kMostReadings; ++i) {
        reading = {};
        std::vector<RegistrySubkey> parts;
        reading.status = component.openSubkeys(RegistryAccess::read, name, kMaxParameterBytes, parts);
        if (reading.status != status::ok) return reading;
        const RegistrySubkey *const data = find(parts, store_name::data);
        const RegistrySubkey *const time = find(parts, store_name::time);
        const RegistrySubkey *const source = find(parts, store_name::source);
        reading.status = status::fileNotFound;
        if (data == nullptr || time == nullptr) return reading;
        if (!data->value) {
            // Not there, or longer than a parameter may be. One that has come just now has a stamp of its own.
            RegistryValue value;
            reading.status = data->key.query(name, value, kMaxParameterBytes);
            if (reading.status != status::ok) return reading;
            continue;
        }
        if (data->value->type != RegistryType::binary) {
            reading.status = status::unsupportedType;
            return reading;
        }
        const std::optional<uint64_t> now = time->value ? parameterStampOf(*time->value) : std::nullopt;
        if (!now) return reading;
        if (source != nullptr && source->value && isOpaque(*source->value, sizeof(GUID))) {
            std::memcpy(&reading.source, source->value->data.data(), sizeof(GUID));
        }
        if (std::exchange(stamp, *now) != *now) continue;
        reading.status = status::ok;
        reading.stamp = stamp;
        reading.data = data->value->data;
        return reading;
    }
    // Others write faster than it can be read; each write raises the stamps, so it is met again.
    reading.status = status::sharingViolation;
    return reading;
}

void ParameterWalk::DeliverParameter(const WalkedComponent &component, int32_t paramId, const WideString &name, Reading reading,
                                     bool isTransient) {
    if (reading.status != status::ok) {
        trace_.log(VX_TEXT("Failed to read param data from the registry with error code %i (%s)\n"), reading.status, name);
        return;
    }
    const ChangeKey key{changePriority(component.id, paramId), static_cast<int32_t>(reading.data.size()), component.id, paramId,
                        kChangeAllChannels};
    addChange(changes_, key,
              {reading.source, reading.stamp, isTransient, std::make_shared<const std::vector<uint8_t>>(std::move(reading.data))});
    if (component.id == kGlobalComponent && paramId == kCleanBuffersParam) {
        deleteParameterValue(parameterKey_, component.key.name, name);  // a command, and done
    }
}

}  // namespace vxcomn
