// SPDX-License-Identifier: MIT
//
// A machine with one device, and an object of the property graph on it: the device's properties, presets where the object looks for
// them, the store below its root, applications that force something. What was there is taken away at both ends of a test.
#pragma once

#include <doctest/doctest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>

#include "platform/system_folder.h"
#include "preset/apo_preset_file.h"
#include "preset/endpoint_properties.h"
#include "preset/package_discovery.h"
#include "preset/preset_names.h"
#include "tests/preset/mock_property_store.h"
#include "tests/preset/package_files.h"
#include "tests/support/debug_capture.h"
#include "tests/support/sample_machine.h"

namespace vxcomn::testing {

inline constexpr uint64_t kVersionWithEngine = 0x0002000100000000;     // 2.1.0.0
inline constexpr uint64_t kVersionWithoutEngine = 0x0002000000070049;  // 2.0.7.73
inline const std::string kDevice = "VXTEST\\GRAPH";
inline const std::string kHardwareKey = "{1}." + kDevice + "&SUBSYS_1234ABCD&REV_1\\5&1a";

inline void putFile(const WideString &path, const Bytes &bytes) {
    const std::filesystem::path place = hostPath(path);
    std::filesystem::create_directories(place.parent_path());
    std::ofstream(place, std::ios::binary)
        .write(reinterpret_cast<const char *>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

// The object as a host derives it, which logs and, once it is told to, loads the presets that it is pointed at.
struct Host : CAPOPresetFile {
    Host() {
        setTraceTag(*this, VX_TEXT("GRAPH"));
        Enabled = 1;
    }
    ~Host() override { StopUpdateThread(); }
    void OnGradualMute() override { ++gradualMutes; }

    void followPreset() {
        PresetFilePath.addChanged(handlerOf<&Host::loadPreset>(this));
        loadPreset();
    }
    void loadPreset() {
        if (!PresetFilePath.get().empty()) LoadPreset(LOAD_PRESET_ENGINE | LOAD_PRESET_PARAMETERS, &received);
    }

    // As an endpoint is opened and given its effect slot.
    void open(IPropertyStore *store, const char *apoType, uint64_t version = kVersionWithEngine) {
        ModuleVersion.set(version);
        DevicePropertyStore.set(ComRef<IPropertyStore>(store));
        APOTypeStr.set(toWide(apoType));
        followPreset();
    }

    int gradualMutes = 0;
    RecordingReceiver received;
};

// An application that forces a selection: alive as long as this.
struct Setter {
    explicit Setter(const char *name) : id(toWide(std::string("Global\\") + name)) {
        REQUIRE(NamedMutex::create(id, mutex) == status::ok);
    }
    WideString id;
    NamedMutex mutex;
};

struct Graph {
    Graph() {
        clean();
        store.text(kEndpointHidKey, kHardwareKey);
        store.number(kEndpointIndexProperty, 7);
        store.number(kFormFactorProperty, 2);  // "LineOut"
        host = std::make_unique<Host>();
    }
    ~Graph() {
        host.reset();
        CHECK(store.references == 1);
        clean();
    }
    Graph(const Graph &) = delete;
    Graph &operator=(const Graph &) = delete;

    void open(const char *apoType = "EFX", uint64_t version = kVersionWithEngine) { host->open(&store, apoType, version); }

    // Presets of this device: loose ones, or a package with these entries.
    static WideString loosePath(const char *apoType, const char *ioConfig, const char *content = "AnyContent") {
        return loosePresetPath({7, toWide(apoType), toWide(ioConfig), toWide(content)});
    }
    static void putPreset(const PresetDocument &document, const char *apoType = "EFX", const char *ioConfig = "LineOut",
                          const char *content = "AnyContent") {
        putFile(loosePath(apoType, ioConfig, content), writePreset(document));
    }
    static WideString packagePath() { return packageFolder(systemFacts()) + VX_TEXT("\\VXAPODATU.VXTEST.GRAPH.zip"); }
    static void putPackage(const Package &package) { putFile(packagePath(), package.archive()); }

    static RegistryKey key(const WideString &path) {
        RegistryKey opened;
        REQUIRE(RegistryKey::create(RegistryRoot::localMachine, path, RegistryAccess::all, opened) == status::ok);
        return opened;
    }
    static bool keyExists(const WideString &path) {
        RegistryKey opened;
        return RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, opened) == status::ok;
    }
    // The configuration key of a slot of this device.
    static WideString configurationPath(const char *apoType = "EFX") {
        return toWide("Software\\Ondrevale\\APO\\" + kDevice + "\\7\\" + apoType);
    }
    RegistryKey configuration(const char *apoType = "EFX") const { return key(configurationPath(apoType)); }
    // The names below Data of a component of the parameter key in force.
    std::vector<std::string> stored(int component) const {
        std::vector<std::string> texts;
        RegistryKey data;
        const WideString path = host->ParamRegKeyName.get() + toWide("\\" + std::to_string(component) + "\\Data");
        if (RegistryKey::open(RegistryRoot::localMachine, path, RegistryAccess::read, data) != status::ok) return texts;
        std::vector<WideString> names;
        data.values(names);
        for (const WideString &name : names) texts.push_back(toUtf8(name));
        std::sort(texts.begin(), texts.end());
        return texts;
    }
    Bytes value(int32_t component, int32_t param) const {
        uint32_t size = 0x10000;
        Bytes bytes(size);
        if (ReadParameterValue(host->ParamRegKeyName.get(), component, param, bytes.data(), size, nullptr, nullptr) != status::ok)
            size = 0;
        bytes.resize(size);
        return bytes;
    }
    void write(int32_t component, int32_t param, const Bytes &bytes) const {
        REQUIRE(WriteParameter(nullptr, host->ParamRegKeyName.get(), component, param, -1, bytes, {}, false, nullptr));
    }

    static void clean() {
        RegistryKey root;
        if (RegistryKey::open(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::all, root) == status::ok)
            root.deleteTreeBelow({});
        std::error_code ignored;
        std::filesystem::remove_all(hostPath(VX_TEXT("C:\\ProgramData\\Ondrevale\\APO\\7")), ignored);
        std::filesystem::remove_all(hostPath(VX_TEXT("C:\\ProgramData\\Ondrevale\\APO\\0")), ignored);
        std::filesystem::remove(hostPath(packagePath()), ignored);
    }

    MockPropertyStore store;  // outlives the object
    std::unique_ptr<Host> host;
};

// What the object says while this lives, without tag, numbers and indentation.
class GraphLog {
  public:
    std::vector<std::string> texts() const {
        std::vector<std::string> texts;
        for (const std::string &line : capture_.lines()) {
            if (line.rfind("GRAPH[", 0) != 0) continue;
            const size_t end = line.find("]: ");
            const size_t text = end == std::string::npos ? end : line.find_first_not_of(' ', end + 3);
            texts.push_back(text == std::string::npos ? "" : line.substr(text));
        }
        return texts;
    }
    bool has(const std::string &text) const { return count(text) != 0; }
    size_t count(const std::string &text) const {
        const std::vector<std::string> all = texts();
        return static_cast<size_t>(std::count(all.begin(), all.end(), text));
    }
    // Whether these stand in the log one behind the other, with others in between or not.
    bool inOrder(const std::vector<std::string> &wanted) const {
        auto next = wanted.begin();
        for (const std::string &text : texts()) {
            if (next != wanted.end() && text == *next) ++next;
        }
        if (next != wanted.end()) MESSAGE("not in the log, or not there: " << *next);
        return next == wanted.end();
    }

  private:
    DebugCapture capture_;
};

// Writes down the values that a property moves to, in the order in which all watched ones move.
template <class Property>
struct Moves {
    Moves(Property &watched, const char *label, std::vector<std::string> &list) : property(watched), name(label), moves(list) {
        property.addChanged({this, &Moves::note});
    }
    ~Moves() { property.removeChanged({this, &Moves::note}); }
    Moves(const Moves &) = delete;
    Moves &operator=(const Moves &) = delete;

    static std::string shown(const WideString &text) { return toUtf8(text); }
    static std::string shown(const ::EngineConfig &config) { return std::to_string(config.Size); }
    static std::string shown(const GUID &guid) { return guid == GUID{} ? "zero" : "guid"; }
    static std::string shown(std::integral auto number) { return std::to_string(number); }
    static void note(void *self) {
        auto &moved = *static_cast<Moves *>(self);
        moved.moves.push_back(std::string(moved.name) + "=" + shown(moved.property.get()));
    }

    Property &property;
    const char *const name;
    std::vector<std::string> &moves;
};

}  // namespace vxcomn::testing
