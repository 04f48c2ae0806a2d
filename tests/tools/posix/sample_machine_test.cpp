// SPDX-License-Identifier: MIT
//
// The sample machine, laid out by its script: what its description says stands in the registry, and every endpoint and effect slot
// finds its preset.
#include <fstream>
#include <nlohmann/json.hpp>

#include "tests/platform/posix/endpoint_keys.h"
#include "tests/preset/graph_fixture.h"
#include "tests/support/process.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const std::filesystem::path kSample = std::filesystem::path(VXCOMN_SOURCE_DIR) / "examples" / "sample_machine";

struct LaidOutMachine : test::EndpointKeys {
    explicit LaidOutMachine(const std::string &ssid = {}) {
        std::vector<std::string> arguments = {(kSample / "install.sh").string()};
        if (!ssid.empty()) arguments.push_back(ssid);
        const test::Outcome outcome =
            test::run("/bin/sh", arguments, {}, {{"VX", test::builtProgram("vx")}, {"VXREG", test::builtProgram("vxreg")}});
        INFO(outcome.output << outcome.errors);
        REQUIRE(outcome.status == 0);
    }
    ~LaidOutMachine() {
        std::filesystem::remove(hostPath(VX_TEXT("C:\\Windows\\System32\\VXAPODATU.HDAUDIO.FUNC_01&VEN_5A17&DEV_0001.zip")));
        Graph::clean();
    }

    // An object on one of the endpoints, with a slot chosen.
    std::unique_ptr<Host> open(const char *id, const char *slot) {
        ComPtr<IMMDeviceEnumerator> enumerator;
        REQUIRE(createDeviceEnumerator(enumerator) == S_OK);
        ComPtr<IMMDevice> device;
        REQUIRE(enumerator->GetDevice(toWide(id).c_str(), device.put()) == S_OK);
        ComPtr<IPropertyStore> store;
        REQUIRE(device->OpenPropertyStore(STGM_READ, store.put()) == S_OK);
        auto host = std::make_unique<Host>();
        host->Enabled = 0;
        host->open(store.get(), slot);
        return host;
    }
};

// One value of a key as the description writes it.
void checkValue(const RegistryKey &key, const std::string &name, const nlohmann::json &wanted) {
    INFO(name);
    if (wanted.at("type") == "REG_DWORD") {
        uint32_t number = 0;
        CHECK(key.readU32(toWide(name), number) == RegistryRead::value);
        CHECK(number == wanted.at("data").get<uint32_t>());
        return;
    }
    WideString text;
    CHECK(key.readText(toWide(name), text) == RegistryRead::value);
    CHECK(toUtf8(text) == wanted.at("data").get<std::string>());
}

constexpr const char *kSlots[] = {"EFX", "MFX", "SFX", "GFX", "LFX"};
constexpr const char *kSpeakers = "{0.0.0.00000000}.{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B001}";

}  // namespace

TEST_CASE("the sample machine's script writes what its description says, and nothing else") {
    const LaidOutMachine machine;
    const auto description = nlohmann::json::parse(std::ifstream(kSample / "endpoints.json"));
    for (const auto &endpoint : description.at("endpoints")) {
        const auto path = endpoint.at("key").get<std::string>().substr(5);  // behind HKLM\.
        RegistryKey key, properties;
        REQUIRE(RegistryKey::open(RegistryRoot::localMachine, toWide(path), RegistryAccess::read, key) == status::ok);
        REQUIRE(key.openBelow(VX_TEXT("Properties"), RegistryAccess::read, properties) == status::ok);
        for (const auto &[name, value] : endpoint.at("values").items()) checkValue(key, name, value);
        for (const auto &[name, value] : endpoint.at("properties").items()) checkValue(properties, name, value);
        std::vector<WideString> names;
        properties.values(names);
        CHECK(names.size() == endpoint.at("properties").size());
    }
}

TEST_CASE("every endpoint of the sample machine has a preset for each of its effect slots") {
    LaidOutMachine machine;
    const std::pair<const char *, const char *> endpoints[] = {
        {kSpeakers, "0/%/AnyOutput"},
        {"{0.0.0.00000000}.{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B002}", "1/%/Headphones"},
        {"{0.0.1.00000000}.{5D9A1C70-3B52-4E0F-9C41-0A6E27D1B003}", "3/%/Microphone"},
    };
    for (const auto &[id, pattern] : endpoints) {
        for (const char *slot : kSlots) {
            const std::unique_ptr<Host> host = machine.open(id, slot);
            std::string path = pattern;
            path.replace(path.find('%'), 1, slot);
            CHECK(toUtf8(host->PresetZipEntry.get()) == "0/" + path + "/AnyContent/Preset.bin");
            CHECK_FALSE(host->EngineShortName.get().empty());
            CHECK(Graph::keyExists(host->ParamRegKeyName.get() + VX_TEXT("\\-1\\Data")));
        }
    }
}

TEST_CASE("the sample machine's second model has presets of its own") {
    LaidOutMachine machine("SUBSYS_5A170002");
    const std::unique_ptr<Host> host = machine.open(kSpeakers, "EFX");
    CHECK(toUtf8(host->SSID.get()) == "SUBSYS_5A170002");
    CHECK(toUtf8(host->PresetZipEntry.get()) == "1/0/EFX/AnyOutput/AnyContent/Preset.bin");
}
