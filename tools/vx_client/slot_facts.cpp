// SPDX-License-Identifier: MIT
#include "tools/vx_client/slot_facts.h"

#include "platform/named_mutex.h"
#include "platform/registry.h"
#include "preset/store_names.h"
#include "tools/vx/text.h"
#include "tools/vx_client/preset_facts.h"

namespace vx::client {

namespace {

using namespace vxcomn;

constexpr size_t kHashBytes = 32;
constexpr size_t kMostClients = 4096;
constexpr const char *kGlobal = "Global\\";

std::string storedText(const RegistryKey &key, const VXWCHAR *name) {
    WideString text;
    if (!key || key.readText(name, text) != RegistryRead::value) return {};
    return toUtf8(text);
}

// A value that counts only while the mutex of its setter exists.
Selection forcedSelection(const RegistryKey &key, const VXWCHAR *valueName, const VXWCHAR *setterName) {
    Selection selection;
    const std::string value = storedText(key, valueName);
    WideString setter;
    if (key) key.readText(setterName, setter);
    selection.setter = toUtf8(setter);
    if (selection.setter.starts_with(kGlobal)) selection.setter.erase(0, std::string(kGlobal).size());
    if (value.empty()) return selection;
    if (!setter.empty() && NamedMutex::exists(setter)) {
        selection.value = value;
        selection.origin = Origin::forced;
    } else if (!setter.empty()) {
        selection.ignored = value;
    }
    return selection;
}

Selection storedSelection(const RegistryKey &key, const VXWCHAR *valueName, const VXWCHAR *standard) {
    const std::string value = storedText(key, valueName);
    if (!value.empty()) return {value, Origin::stored, {}, {}};
    return {toUtf8(standard), Origin::derived, {}, {}};
}

void fallBack(Selection &selection, const std::string &value, Origin origin) {
    if (selection.origin == Origin::forced || value.empty()) return;
    selection.value = value;
    selection.origin = origin;
}

std::vector<Client> readClients(const RegistryKey &configuration) {
    std::vector<Client> clients;
    RegistryKey key;
    std::vector<WideString> names;
    if (!configuration || configuration.openBelow(store_name::clients, RegistryAccess::read, key) != status::ok) return clients;
    if (key.values(names) != status::ok) return clients;
    for (const WideString &name : names) {
        if (name.empty() || name.front() != VX_TEXT('{') || clients.size() == kMostClients) continue;
        clients.push_back({toUtf8(name), NamedMutex::exists(WideString(VX_TEXT("Global\\")) + name)});
    }
    return clients;
}

std::optional<bool> storedSwitch(const RegistryKey &parameters, int32_t paramId) {
    RegistryKey data;
    if (parameters.openBelow(VX_TEXT("-1\\Data"), RegistryAccess::read, data) != status::ok) return std::nullopt;
    RegistryValue value;
    if (data.query(parameterValueName(paramId), value) != status::ok || value.data.empty()) return std::nullopt;
    return value.data[0] != 0;
}

void readParameters(const WideString &path, SlotFacts &facts) {
    constexpr int32_t kPower = -2, kBypass = -18;
    RegistryKey key;
    if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, key) != status::ok) return;
    facts.parametersThere = true;
    std::vector<uint8_t> hash;
    if (key.readBytes(store_name::presetHash, hash, kHashBytes) == RegistryRead::value && hash.size() == kHashBytes)
        facts.storedDigest = digestText(hash.data());
    facts.power = storedSwitch(key, kPower);
    facts.bypass = storedSwitch(key, kBypass);
}

}  // namespace

const char *originName(Origin origin) {
    switch (origin) {
        case Origin::derived:
            return "derived";
        case Origin::preset:
            return "preset";
        case Origin::forced:
            return "forced";
        case Origin::stored:
            return "stored";
        default:
            return "none";
    }
}

SlotFacts readSlot(const Device &device, const std::string &apo, uint64_t moduleVersion) {
    SlotFacts facts;
    facts.apo = apo;
    const WideString configuration = configurationKey(device.storeName, toWide(apo));
    facts.configurationKey = toUtf8(configuration);
    RegistryKey key;
    facts.keyThere = RegistryKey::open(RegistryRoot::localMachine, configuration, RegistryAccess::read, key) == status::ok;

    facts.ioConfig = forcedSelection(key, store_name::ioConfig, store_name::ioConfigSetter);
    fallBack(facts.ioConfig, toUtf8(device.derivedIoConfig), Origin::derived);
    facts.content = storedSelection(key, store_name::contentType, kDefaultContentType);
    facts.profile = storedSelection(key, store_name::userProfile, kDefaultUserProfile);
    facts.engine = forcedSelection(key, store_name::engineName, store_name::engineSetter);
    facts.preset = findPreset(device, apo, facts.ioConfig.value, facts.content.value);
    fallBack(facts.engine, facts.preset.engine, Origin::preset);

    facts.clients = readClients(key);
    facts.receiverRuns = NamedMutex::exists(syncMutexName(configuration));
    if (facts.ioConfig.value.empty() || facts.engine.value.empty()) return facts;
    const WideString engine = toWide(facts.engine.value), ioConfig = toWide(facts.ioConfig.value);
    const WideString profile = toWide(facts.profile.value), content = toWide(facts.content.value);
    const WideString parameters = parameterKey({configuration, engine, ioConfig, profile, content}, moduleVersion);
    facts.parameterKey = toUtf8(parameters);
    readParameters(parameters, facts);
    return facts;
}

}  // namespace vx::client
