// SPDX-License-Identifier: MIT
#include "preset/parameter_store.h"

#include <algorithm>

#include "platform/last_error.h"
#include "platform/registry.h"
#include "platform/security.h"
#include "platform/unique_counter.h"
#include "preset/store_names.h"

namespace vxcomn {
namespace {

constexpr auto kMachine = RegistryRoot::localMachine;
constexpr auto kWrite = RegistryAccess::write;
constexpr size_t kMaxTextBytes = 65536;

// Writes or deletes a value and, where that went well, stamps the key: who took a value away tells watchers, too.
template <class Change>
Status changeValue(WideView keyPath, Change change) {
    if (keyPath.empty()) return kInvalidArgument;
    return inOneWrite([&] {
        RegistryKey key;
        Status status = RegistryKey::create(kMachine, keyPath, kWrite, key, nullptr, &registrySecurity());
        if (status == status::ok) status = change(key);
        if (status == status::ok) status = key.setU64(store_name::writeTime, freshStamp());
        return status;
    });
}

WideString textOf(const std::vector<uint8_t> &data) {
    WideString text(data.size() / sizeof(VXWCHAR), VXWCHAR{0});  // an odd byte at the end is no unit
    std::copy_n(data.data(), text.size() * sizeof(VXWCHAR), reinterpret_cast<uint8_t *>(text.data()));
    text.resize(std::min(text.find(VXWCHAR{0}), text.size()));
    return text;
}

// What became of the steps of a parameter's write. `key` is the one that nothing goes on without.
struct WriteSteps {
    Status key = status::ok, component = status::ok, data = status::ok, source = status::ok, time = status::ok,
           componentStamp = status::ok, keyStamp = status::ok;
};

// Makes a key of a component and writes the value into it.
Status setBelow(const RegistryKey &component, WideView subkey, WideView name, RegistryType type, std::span<const uint8_t> data) {
    RegistryKey key;
    const Status status = component.createBelow(subkey, kWrite, key, nullptr, &registrySecurity());
    return status == status::ok ? key.set(name, type, data) : status;
}

template <class Value>
std::span<const uint8_t> bytesOf(const Value &value) {
    return {reinterpret_cast<const uint8_t *>(&value), sizeof value};
}

// Who sees the stamp sees the value, so the stamps come last.
Status writeSteps(WideView parameterKey, WideView component, WideView name, std::span<const uint8_t> data, const GUID *source,
                  uint64_t &stamp, WriteSteps &steps) {
    steps = {};
    RegistryKey key, below;
    steps.key = RegistryKey::create(kMachine, parameterKey, kWrite, key, nullptr, &registrySecurity());
    if (steps.key != status::ok) return steps.key;
    stamp = freshStamp();
    steps.component = key.createBelow(component, RegistryAccess::write, below, nullptr, &registrySecurity());
    if (steps.component != status::ok) return steps.component;
    steps.data = setBelow(below, store_name::data, name, RegistryType::binary, data);
    if (source != nullptr) steps.source = setBelow(below, store_name::source, name, RegistryType::binary, bytesOf(*source));
    steps.time = setBelow(below, store_name::time, name, RegistryType::qword, bytesOf(stamp));
    steps.componentStamp = below.setU64(store_name::writeTime, stamp);
    steps.keyStamp = key.setU64(store_name::writeTime, stamp);
    return steps.keyStamp;
}

template <class... Arguments>
void logFailure(const CTraceFuncCallTarget *trace, Status status, const VXWCHAR *format, const Arguments &...arguments) {
    if (status != status::ok && trace != nullptr) trace->log(format, arguments..., static_cast<int32_t>(status));
}

// The bytes of a value, or its leading ones where there are more than fit and `cut` says so. 234 if there are.
Status queryParameter(WideView dataKey, WideView name, std::span<uint8_t> to, bool cut, size_t &size) {
    RegistryValue value;
    const Status status = RegistryKey::queryAt(kMachine, dataKey, name, value, cut ? kMaxParameterBytes : to.size());
    if (status != status::ok) return status;
    const size_t copied = std::min(value.data.size(), to.size());
    std::copy_n(value.data.begin(), copied, to.begin());
    size = value.data.size();
    return size > to.size() ? status::moreData : status::ok;
}

}  // namespace

uint64_t freshStamp() {
    return uniqueCounter();
}

Status SetRegString(WideView keyPath, WideView valueName, const WideString *text) {
    return changeValue(
        keyPath, [&](RegistryKey &key) { return text != nullptr ? key.setText(valueName, *text) : key.deleteValue(valueName); });
}

Status SetRegBinary(WideView keyPath, WideView valueName, const uint8_t *bytes, size_t size) {
    return changeValue(keyPath, [&](RegistryKey &key) {
        return bytes != nullptr ? key.setBytes(valueName, {bytes, size}) : key.deleteValue(valueName);
    });
}

Status GetRegString(WideView keyPath, WideView valueName, WideString &text) {
    RegistryValue value;
    const Status status = RegistryKey::queryAt(kMachine, keyPath, valueName, value, kMaxTextBytes);
    if (status != status::ok) return status;
    if (value.type != RegistryType::sz) return status::unsupportedType;
    text = textOf(value.data);
    return status::ok;
}

Status GetRegBinary(WideView keyPath, WideView valueName, uint8_t *buffer, uint32_t &size) {
    RegistryValue value;
    const Status status = RegistryKey::queryAt(kMachine, keyPath, valueName, value, size);
    if (status != status::ok) return status;
    if (value.type != RegistryType::binary) return status::unsupportedType;
    std::copy(value.data.begin(), value.data.end(), buffer);
    size = static_cast<uint32_t>(value.data.size());
    return status::ok;
}

bool WriteParameter(const CTraceFuncCallTarget *trace, WideView parameterKey, int32_t componentId, int32_t paramId, int32_t,
                    std::span<const uint8_t> data, const ParameterSource &source, bool isTransient, uint64_t *stamp) {
    if (parameterKey.empty()) {
        if (trace != nullptr) trace->log(VX_TEXT("Empty param reg key received\n"));
        setLastError(status::invalidParameter);
        return false;
    }
    // All that needs memory is made ahead of the write, so that who is told of none finds nothing written.
    const WideString path(parameterKey), component = decimalName(componentId);
    const WideString name = parameterValueName(paramId, isTransient ? source.id : WideView());
    const GUID *const guid = source.id.empty() ? nullptr : &source.guid;
    WriteSteps steps;
    uint64_t written = 0;
    Status whole = status::invalidParameter;
    if (data.size() > kMaxParameterBytes) {
        steps.data = whole;
    } else {
        whole = inOneWrite([&] { return writeSteps(parameterKey, component, name, data, guid, written, steps); });
        if (written == 0 && steps.key == status::ok) {
            steps.key = whole;  // it did not come to the first step
        } else if (steps.key == status::ok && steps.component == status::ok && steps.keyStamp == status::ok) {
            if (whole != status::ok) steps.componentStamp = whole;  // each step went well, and yet all together did not
        }
    }
    logFailure(trace, steps.key, VX_TEXT("Failed to open reg key: %s with error code %i\n"), path);
    logFailure(trace, steps.component, VX_TEXT("Failed to create reg value: %s with error code %i\n"), component);
    logFailure(trace, steps.data, VX_TEXT("Failed to create 'Data' reg value with error code %i\n"));
    logFailure(trace, steps.source, VX_TEXT("Failed to create 'Source' reg value with error code %i\n"));
    logFailure(trace, steps.time, VX_TEXT("Failed to create 'Time' reg value with error code %i\n"));
    logFailure(trace, steps.componentStamp, VX_TEXT("Failed to create 'WriteTime' reg value with error code %i\n"));
    if (stamp != nullptr && written != 0) *stamp = written;
    if (whole != status::ok) setLastError(whole);
    return whole == status::ok;
}

Status ReadParameterValue(WideView parameterKey, int32_t componentId, int32_t paramId, uint8_t *buffer, uint32_t &size,
                          GUID *source, uint64_t *stamp) {
    WideString dataKey(parameterKey);
    dataKey += VXWCHAR{'\\'};
    dataKey += decimalName(componentId);
    dataKey += VXWCHAR{'\\'};
    dataKey += store_name::data;
    const WideString name = parameterValueName(paramId);
    size_t found = 0;
    Status status = queryParameter(dataKey, name, {buffer, size}, false, found);
    if (status == status::ok) size = static_cast<uint32_t>(found);
    const auto leading = [&](void *to, size_t bytes) {
        status = queryParameter(dataKey, name, {static_cast<uint8_t *>(to), bytes}, true, found);
    };
    if (source != nullptr) leading(source, sizeof *source);
    if (stamp != nullptr) leading(stamp, sizeof *stamp);
    if (status != status::ok) setLastError(status);
    return status;
}

void deleteParameterValue(WideView parameterKey, WideView component, WideView valueName) {
    inOneWrite([&] {
        RegistryKey key;
        if (RegistryKey::open(kMachine, parameterKey, RegistryAccess::read, key) != status::ok) return status::fileNotFound;
        for (const WideView subkey : {store_name::data, store_name::time, store_name::source}) {
            WideString path(component);
            path += VXWCHAR{'\\'};
            path += subkey;
            RegistryKey below;
            if (key.openBelow(path, kWrite, below) == status::ok) below.deleteValue(valueName);
        }
        return status::ok;
    });
}

}  // namespace vxcomn
