// SPDX-License-Identifier: MIT
#include "tests/support/sample_machine.h"

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <stdexcept>

#include "control/user_parameter_table.h"
#include "platform/endpoints.h"
#include "platform/file.h"
#include "platform/module.h"
#include "preset/endpoint_class.h"
#include "preset/endpoint_properties.h"
#include "preset/package_discovery.h"
#include "preset/preset_names.h"
#include "preset/store_names.h"
#include "tests/support/process.h"

namespace vxcomn::testing {

namespace {

namespace fs = std::filesystem;

constexpr int32_t kIndex = 7;
const WideString kDevice = VX_TEXT("VXTEST\\CONTROL");

void require(bool done, const char *what) {
    if (!done) throw std::runtime_error(std::string("the sample machine: ") + what);
}

void setProperty(IPropertyStore &store, const PROPERTYKEY &key, uint32_t number) {
    PROPVARIANT value = {};
    value.vt = VT_UI4;
    value.ulVal = number;
    require(store.SetValue(key, value) == S_OK, "a number can't be set");
}

void setProperty(IPropertyStore &store, const PROPERTYKEY &key, WideString text) {
    PROPVARIANT value = {};
    value.vt = VT_LPWSTR;
    value.pwszVal = text.data();
    require(store.SetValue(key, value) == S_OK, "a text can't be set");
}

// The endpoint as the product's device driver describes it.
void describeEndpoint(const WideString &id) {
    initializeCom();
    ComPtr<IMMDeviceEnumerator> enumerator;
    ComPtr<IMMDevice> device;
    ComPtr<IPropertyStore> store;
    require(createDeviceEnumerator(enumerator) == S_OK, "no enumerator");
    require(enumerator->GetDevice(id.c_str(), device.put()) == S_OK, "no device");
    require(device->OpenPropertyStore(STGM_READWRITE, store.put()) == S_OK, "no property store");
    setProperty(*store.get(), kEndpointHidKey, VX_TEXT("{1}.") + kDevice + VX_TEXT("&SUBSYS_1234ABCD&REV_1\\5&1a"));
    setProperty(*store.get(), kEndpointIndexProperty, static_cast<uint32_t>(kIndex));
    // "AnyOutput". Some systems take an endpoint back to it whenever a process looks.
    setProperty(*store.get(), kFormFactorProperty, 1);
}

// A copy of the built library where the installed one lies: its version decides what the store's keys look like.
void installLibrary() {
    const fs::path built = fs::path(test::selfProgram()).parent_path();
    const fs::path installed = hostPath(packageFolder(systemFacts()) + VX_TEXT("\\VXCOMN64U.dll"));
    fs::create_directories(installed.parent_path());
    const bool isWindows = fs::exists(built / "VXCOMN64U.dll");
    fs::copy_file(built / (isWindows ? "VXCOMN64U.dll" : "libVXCOMN64U.so"), installed, fs::copy_options::overwrite_existing);
}

WideString presetPath(const char *apoType, const char *ioConfig, const char *content) {
    return loosePresetPath({kIndex, toWide(apoType), toWide(ioConfig), toWide(content)});
}

PresetDocument documentOf(SampleValues values, const char *engine, const EngineConfig &config) {
    PresetDocument document;
    document.version = kLowestPresetVersion;
    document.engineName.assign(engine, engine + std::char_traits<char>::length(engine) + 1);
    const auto *bytes = reinterpret_cast<const uint8_t *>(&config);
    document.engineConfig.assign(bytes, bytes + config.Size);
    document.blocks = std::move(values.blocks);
    return document;
}

template <size_t size>
std::vector<uint8_t> bytesOf(const std::array<uint8_t, size> &bytes) {
    return {bytes.begin(), bytes.end()};
}

}  // namespace

SampleValues &SampleValues::add(int32_t component, int32_t param, std::vector<uint8_t> value) {
    blocks.push_back({component, param, param, {std::move(value)}});
    return *this;
}

SampleValues SampleValues::usual() {
    SampleValues values;
    values.add(-1, -2, {1}).add(-1, -18, {0}).add(5, 115, {1});
    for (int32_t component = 0; component < 4; ++component) values.add(component, -12, bytesOf(floatBytes(1.0F)));
    float frequency = 31.25F;
    for (int32_t param = kFirstBandParam; param <= kLastBandParam; ++param, frequency *= 2) {
        values.add(5, param, bytesOf(bandBytes({1, frequency, 1.0F, 0.0F})));
    }
    return values;
}

PresetDocument orloPreset(SampleValues values) {
    return documentOf(std::move(values), kDefaultEngineName, kDefaultEngineConfig);
}

PresetDocument novaraPreset(SampleValues values) {
    return documentOf(std::move(values), "KZNOVA", {20, 0, 1, {{0, 0}}});
}

SampleMachine::SampleMachine() {
    clean();
    installLibrary();
    id_ = takeSampleEndpoint();
    if (!id_.empty()) describeEndpoint(id_);
    putPreset(orloPreset());
}

SampleMachine::~SampleMachine() {
    giveSampleEndpointBack();
    clean();
}

void SampleMachine::putPreset(const PresetDocument &document, const char *apoType, const char *ioConfig, const char *content) {
    const fs::path place = hostPath(presetPath(apoType, ioConfig, content));
    const std::vector<uint8_t> image = writePreset(document);
    fs::create_directories(place.parent_path());
    std::ofstream(place, std::ios::binary)
        .write(reinterpret_cast<const char *>(image.data()), static_cast<std::streamsize>(image.size()));
}

void SampleMachine::removePreset(const char *apoType, const char *ioConfig, const char *content) {
    fs::remove(hostPath(presetPath(apoType, ioConfig, content)));
}

WideString SampleMachine::configurationPath(const char *apoType) {
    return vxcomn::configurationKey(kDevice + VX_TEXT("\\7"), toWide(apoType));
}

WideString SampleMachine::parametersPath(const char *engine, const char *ioConfig, const char *apoType, const char *profile,
                                         const char *content) {
    const WideString configuration = configurationPath(apoType);
    const WideString parts[] = {toWide(engine), toWide(ioConfig), toWide(profile), toWide(content)};
    return parameterKey({configuration, parts[0], parts[1], parts[2], parts[3]}, kEngineLevelVersion);
}

RegistryKey SampleMachine::configurationKey(const char *apoType) {
    RegistryKey key;
    require(RegistryKey::create(RegistryRoot::localMachine, configurationPath(apoType), RegistryAccess::all, key) == status::ok,
            "no configuration key");
    return key;
}

std::string SampleMachine::textAt(const RegistryKey &key, const VXWCHAR *name) {
    WideString text;
    return key.readText(name, text) == RegistryRead::value ? toUtf8(text) : "(none)";
}

void SampleMachine::clean() {
    RegistryKey root;
    if (RegistryKey::open(RegistryRoot::localMachine, kStoreRoot, RegistryAccess::all, root) == status::ok) {
        root.deleteTreeBelow({});
    }
    std::error_code ignored;
    fs::remove_all(hostPath(WideString(kLoosePresetRoot) + VX_TEXT("7")), ignored);
}

fs::path hostPath(const WideString &path) {
    std::string narrow = toUtf8(path);
    if constexpr (fs::path::preferred_separator == '/') {
        std::replace(narrow.begin(), narrow.end(), '\\', '/');
        return std::string(std::getenv("VXCOMN_ROOT")) + "/drive_c" + narrow.substr(2);
    }
    return narrow;
}

}  // namespace vxcomn::testing
