// SPDX-License-Identifier: MIT
//
// A host as the walks serve it: derived from CAPOPresetFile, with keys of the test's own in the store, the hooks filled, and its
// log caught.
#pragma once

#include <doctest/doctest.h>

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include "platform/registry.h"
#include "preset/apo_preset_file.h"
#include "tests/support/debug_capture.h"
#include "tests/support/process.h"

namespace test {

constexpr auto kMachine = vxcomn::RegistryRoot::localMachine;

struct Delivered {
    int32_t componentId, paramId;
    std::vector<uint8_t> data;
    bool isTransient = false;

    friend bool operator==(const Delivered &, const Delivered &) = default;
};

// What a walk has found, in the order of the map.
inline std::vector<Delivered> deliveredIn(const vxcomn::PendingChanges &changes) {
    std::vector<Delivered> list;
    for (const auto &[key, change] : changes) list.push_back({key.componentId, key.paramId, *change.data, change.isTransient});
    return list;
}

// The keys of one effect slot, which go with the fixture.
struct SlotKeys {
    vxcomn::WideString endpoint = vxcomn::toWide("VxcomnTest-" + std::to_string(processId()));
    vxcomn::WideString configuration = vxcomn::configurationKey(endpoint, VX_TEXT("EFX"));
    vxcomn::WideString clients = configuration + VX_TEXT("\\Clients");
    vxcomn::WideString parameters = configuration + VX_TEXT("\\Out\\GlobalProfile\\AnyContent\\Parameters");

    SlotKeys() = default;
    ~SlotKeys() {
        vxcomn::RegistryKey root;
        vxcomn::RegistryKey::open(kMachine, vxcomn::kStoreRoot, vxcomn::RegistryAccess::all, root);
        root.deleteTreeBelow(endpoint);
    }
    SlotKeys(const SlotKeys &) = delete;
    SlotKeys &operator=(const SlotKeys &) = delete;

    vxcomn::RegistryKey open(const vxcomn::WideString &path) const {
        vxcomn::RegistryKey key;
        REQUIRE(vxcomn::RegistryKey::create(kMachine, path, vxcomn::RegistryAccess::all, key) == vxcomn::status::ok);
        return key;
    }
    // A subkey of a component, "Data" say.
    vxcomn::RegistryKey part(const std::string &component, const std::string &name) const {
        return open(parameters + vxcomn::toWide("\\" + component + "\\" + name));
    }
    bool holds(const std::string &component, const std::string &part, const std::string &name) const {
        vxcomn::RegistryValue value;
        const auto path = parameters + vxcomn::toWide("\\" + component + "\\" + part);
        return vxcomn::RegistryKey::queryAt(kMachine, path, vxcomn::toWide(name), value) == vxcomn::status::ok;
    }
    // Makes the stamps of a component and of the parameter key new, as a write does at its end.
    void stamp(const std::string &component) const {
        open(parameters + vxcomn::toWide("\\" + component)).setU64(vxcomn::store_name::writeTime, vxcomn::freshStamp());
        open(parameters).setU64(vxcomn::store_name::writeTime, vxcomn::freshStamp());
    }
    // Writes a parameter without a source, as a preset's seeding does. Its stamp.
    uint64_t write(int32_t componentId, int32_t paramId, const std::vector<uint8_t> &data) const {
        return writeFrom({}, componentId, paramId, data, false);
    }
    uint64_t writeFrom(const vxcomn::ParameterSource &source, int32_t componentId, int32_t paramId,
                       const std::vector<uint8_t> &data, bool isTransient) const {
        uint64_t stamp = 0;
        REQUIRE(vxcomn::WriteParameter(nullptr, parameters, componentId, paramId, -1, data, source, isTransient, &stamp));
        return stamp;
    }
};

// A client of the slot, with its mark.
struct SlotClient : CInstanceIDBase {
    explicit SlotClient(const SlotKeys &keys) {
        const vxcomn::WideString nothing;
        REQUIRE(vxcomn::SetRegString(keys.clients, InstanceId, &nothing) == vxcomn::status::ok);
    }
    vxcomn::ParameterSource source() const { return {InstanceGuid, InstanceId}; }
};

// Catches what is logged under a tag, without tag, numbers and indentation.
class TaggedLog {
  public:
    explicit TaggedLog(DBG_TRACE &trace) {
        vxcomn::setTraceTag(trace, VX_TEXT("WALK"));
        trace.Enabled = 1;
    }
    std::vector<std::string> texts() const {
        std::vector<std::string> texts;
        for (const std::string &line : capture_.lines()) {
            if (line.rfind("WALK[", 0) != 0) continue;
            const size_t end = line.find("]: ");
            const size_t text = end == std::string::npos ? end : line.find_first_not_of(' ', end + 3);
            texts.push_back(text == std::string::npos ? "" : line.substr(text));
        }
        return texts;
    }
    size_t count(const std::string &text) const {
        const std::vector<std::string> all = texts();
        return static_cast<size_t>(std::count(all.begin(), all.end(), text));
    }
    bool has(const std::string &text) const { return count(text) != 0; }

  private:
    vxcomn::testing::DebugCapture capture_;
};

// What one round of the hooks has seen.
struct Poll {
    bool wokenByRegistry;
    vxcomn::PendingChanges changes;
};

struct WalkHost : CAPOPresetFile {
    explicit WalkHost(const SlotKeys &keys) {
        APOTypeRegKeyName.set(keys.configuration);
        ParamRegKeyName.set(keys.parameters);
    }

    void OnConfigurationPolled(const vxcomn::RegistryKey &root, bool wokenByRegistry) override {
        const std::lock_guard guard(mutex_);
        configurationPolls.push_back(wokenByRegistry);
        rootWasOpen = static_cast<bool>(root);
    }
    void OnParametersPolled(bool wokenByRegistry) override {
        const std::lock_guard guard(mutex_);
        polls.push_back({wokenByRegistry, ParamChanges});
        polled_.notify_all();
    }

    // One walk on this thread.
    std::vector<Delivered> walk(bool force = false) {
        UpdateParametersFromRegistry(true, force);
        return deliveredIn(ParamChanges);
    }
    // Waits until the rounds from `first` on have found something that satisfies the condition.
    template <class Condition>
    bool waitFor(Condition condition, size_t first = 0) {
        std::unique_lock lock(mutex_);
        return polled_.wait_for(lock, std::chrono::seconds(20), [&] {
            return std::any_of(polls.begin() + static_cast<std::ptrdiff_t>(std::min(first, polls.size())), polls.end(), condition);
        });
    }
    size_t pollCount() {
        const std::lock_guard guard(mutex_);
        return polls.size();
    }

    std::vector<Poll> polls;
    std::vector<bool> configurationPolls;
    bool rootWasOpen = false;

  private:
    std::mutex mutex_;
    std::condition_variable polled_;
};

}  // namespace test
