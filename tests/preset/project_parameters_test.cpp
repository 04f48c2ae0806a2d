// SPDX-License-Identifier: MIT
#include "preset/project_parameters.h"

#include <doctest/doctest.h>

#include <cstring>
#include <memory>

#include "preset/parameter_store.h"
#include "tests/support/debug_capture.h"
#include "tests/support/sample_machine.h"

using namespace vxcomn;
using vxcomn::testing::SampleMachine;

namespace {

using Bytes = std::vector<uint8_t>;

constexpr uint64_t version(uint64_t major, uint64_t minor, uint64_t build, uint64_t revision) {
    return major << 48 | minor << 32 | build << 16 | revision;
}
constexpr uint64_t kDirect = version(2, 0, 7, 70), kByHandleOnly = version(2, 0, 7, 71);

constexpr const char *kPath = "C:\\ProgramData\\Ondrevale\\APO\\0\\EFX\\LineOut\\AnyContent\\Preset.bin";

const EngineConfig kEngine = {60, 0, 6, {{1, 0}, {3, 1}, {2, 2}, {0, 3}, {4, 4}, {5, 5}}};

// A host's context as far as the mirror looks at it, and its log.
struct Host {
    explicit Host(const char *path = kPath) : presetPath(path) {
        setTraceTag(trace, VX_TEXT("MIRROR"));
        trace.Enabled = 1;
        context->trace = &trace;
        context->apoPresetPath = presetPath.data();
    }

    BinProjectParameters mirror(uint64_t moduleVersion = kByHandleOnly, const char *engine = "VXORLO") const {
        return BinProjectParameters(*context, presetPath.c_str(), engine, kEngine, moduleVersion);
    }
    std::vector<std::string> texts() const {
        std::vector<std::string> texts;
        for (const std::string &line : capture.lines()) {
            if (line.rfind("MIRROR[", 0) != 0) continue;
            const size_t text = line.find_first_not_of(' ', line.find("]: ") + 3);
            texts.push_back(text == std::string::npos ? "" : line.substr(text));
        }
        return texts;
    }
    long count(const std::string &beginning) const {
        const std::vector<std::string> all = texts();
        return std::count_if(all.begin(), all.end(), [&](const std::string &text) { return text.rfind(beginning, 0) == 0; });
    }

    std::string presetPath;
    vxcomn::testing::DebugCapture capture;
    CTraceFuncCallTarget trace;
    std::unique_ptr<LibraryContext> context = std::make_unique<LibraryContext>();
};

Bytes storedAt(const WideString &parameterKey, int32_t component, int32_t param) {
    Bytes bytes(64);
    auto size = static_cast<uint32_t>(bytes.size());
    if (ReadParameterValue(parameterKey, component, param, bytes.data(), size, nullptr, nullptr) != status::ok) size = 0;
    bytes.resize(size);
    return bytes;
}

std::string utf8(const WideString &text) {
    return toUtf8(text);
}

}  // namespace

TEST_CASE("a path with the folder efx in small letters is of type EFX, and the type is in capitals") {
    const PresetPathParts parts = readPresetPath("C:\\data\\APO\\3\\efx\\Out\\Any\\Preset.bin");
    CHECK(parts.apoType == "EFX");
    CHECK(parts.endpointId == "3");
    CHECK(readPresetPath("x\\lFx\\y").apoType == "LFX");
}

TEST_CASE("a path with both SFX and EFX is of type EFX, whatever their order in the path") {
    CHECK(readPresetPath("C:\\SFX\\EFX\\Out\\Any\\Preset.bin").apoType == "EFX");
    CHECK(readPresetPath("C:\\EFX\\SFX\\Out\\Any\\Preset.bin").apoType == "EFX");
    CHECK(readPresetPath("C:\\LFX\\GFX\\x").apoType == "GFX");
    CHECK(readPresetPath("C:\\GFX\\SFX\\x").apoType == "SFX");
    CHECK(readPresetPath("C:\\SFX\\MFX\\x").apoType == "MFX");
}

TEST_CASE("the usual path gives endpoint id, output and content") {
    const PresetPathParts parts = readPresetPath("C:\\ProgramData\\Ondrevale\\APO\\0\\EFX\\Out\\Any\\Preset.bin");
    CHECK(parts.apoType == "EFX");
    CHECK(parts.hasEndpointId);
    CHECK(parts.endpointId == "0");
    CHECK(parts.output == VX_TEXT("Out"));
    CHECK(parts.content == VX_TEXT("Any"));
    CHECK(readPresetPath("C:\\APO\\USB\\VID_1\\7\\MFX\\Out\\Any\\Preset.bin").endpointId == "USB\\VID_1\\7");
}

TEST_CASE("a path without an APO folder ahead of the slot's gives endpoint id 0") {
    for (const char *path :
         {"C:\\data\\5\\EFX\\Out\\Any\\Preset.bin", "C:\\EFX\\APO\\5\\Preset.bin", "C:\\APO\\EFX\\Out\\Any\\Preset.bin",
          "C:\\APO\\\\EFX\\Out\\Any\\Preset.bin", "C:\\APO\\5\\xyz\\Preset.bin"}) {
        INFO(path);
        CHECK_FALSE(readPresetPath(path).hasEndpointId);
        CHECK(readPresetPath(path).endpointId == "0");
    }
    // The last such folder ahead of the slot's counts.
    CHECK(readPresetPath("C:\\APO\\1\\APO\\2\\EFX\\APO\\3\\Preset.bin").endpointId == "2");
    const std::string longId(3000, 'i');
    CHECK(readPresetPath("C:\\APO\\" + longId + "\\EFX\\x").endpointId == longId.substr(0, 1024));
}

TEST_CASE("a path with fewer backslashes keeps what it does not reach") {
    const PresetPathParts none = readPresetPath("Preset.bin");
    CHECK(none.apoType == "?FX");
    CHECK_FALSE(none.hasType);
    CHECK(none.output == VX_TEXT("AnyOutput"));
    CHECK(none.content == VX_TEXT("AnyContent"));
    CHECK(readPresetPath("").content == VX_TEXT("AnyContent"));
    CHECK(readPresetPath("Any\\Preset.bin").content == VX_TEXT("AnyContent"));
    const PresetPathParts one = readPresetPath("C:\\Any\\Preset.bin");
    CHECK(one.content == VX_TEXT("Any"));
    CHECK(one.output == VX_TEXT("AnyOutput"));
    CHECK(readPresetPath("\\Out\\Any\\Preset.bin").output == VX_TEXT("Out"));
    for (const char *path : {"\\", "\\\\", "\\\\\\", "\xFF\xFE\\EFX\\\xC0", "\\EFX\\"}) readPresetPath(path);
}

TEST_CASE("up to module version 2.0.7.73 the key has no engine level, from 2.0.7.74 on it has") {
    const Host host;
    CHECK(utf8(host.mirror(version(2, 0, 7, 73)).ParameterKey) ==
          "Software\\Ondrevale\\APO\\0\\EFX\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
    CHECK(utf8(host.mirror(version(2, 0, 7, 74)).ParameterKey) ==
          "Software\\Ondrevale\\APO\\0\\EFX\\VXORLO\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
    CHECK(utf8(host.mirror().ConfigurationKey) == "Software\\Ondrevale\\APO\\0\\EFX");
    const Host unknown("Preset.bin");
    CHECK(utf8(unknown.mirror(version(2, 0, 7, 74), nullptr).ConfigurationKey) == "Software\\Ondrevale\\APO\\0\\?FX");
    CHECK(host.mirror(kDirect, std::string(2000, 'e').c_str()).EngineName == std::string(511, 'e'));
}

TEST_CASE("what making and ending the mirror says") {
    const Host host;
    { const BinProjectParameters mirror = host.mirror(); }
    CHECK(host.texts() ==
          std::vector<std::string>{
              "{ BinProjectParameters()", "Detected APO type from the preset path as EFX", "Received engine name 'VXORLO'",
              "Received engine config with 6 component(s)", "Parsing endpoint id ...", "Endpoint id = 0",
              "VXAPOCOMAPI_InitializeEx failed with error code -15.",
              "Resulting registry key: HKLM\\Software\\Ondrevale\\APO\\0\\EFX\\LineOut\\GlobalProfile\\AnyContent\\Parameters",
              "} BinProjectParameters()", "{ ~BinProjectParameters()", "} ~BinProjectParameters()"});
    const Host noFolder("C:\\EFX\\Out\\Any\\Preset.bin");
    noFolder.mirror();
    CHECK(noFolder.count("Preset path doesn't contain endpoint id, set as '0'") == 1);
    const Host noType("Preset.bin");
    noType.mirror();
    CHECK(noType.count("Detected APO type from the preset path as ?FX") == 1);
    CHECK(noType.count("VXAPOCOMAPI_InitializeEx") == 0);
}

TEST_CASE("values are recorded with their range, and a transient one is not") {
    const Host host;
    BinProjectParameters mirror = host.mirror();
    CHECK(mirror.Global.Low == 0x7FFFFFFF);
    CHECK(mirror.Global.High == INT32_MIN);
    CHECK(mirror.Global.Dirty == 0);
    const Bytes one = {1}, two = {2, 2};
    mirror.SetParameter(-1, -2, 0, one.data(), 1, 1);
    mirror.SetParameter(3, 7, 0, one.data(), 1, 1);
    CHECK(mirror.Global.Values.empty());
    CHECK(mirror.Components[3].Values.empty());
    CHECK(mirror.Components[3].Dirty == 0);

    mirror.SetParameter(-1, -2, 0, one.data(), 1, 0);
    mirror.SetParameter(-1, 5, 0, one.data(), 1, 0);
    mirror.SetParameter(-1, -2, 0, two.data(), 2, 0);
    CHECK(mirror.Global.Low == -2);
    CHECK(mirror.Global.High == 5);
    CHECK(mirror.Global.Dirty == 1);
    CHECK(mirror.Global.Values == std::map<int32_t, Bytes>{{-2, two}, {5, one}});
    mirror.SetParameter(0, 1, 0, one.data(), 1, 0);
    mirror.SetParameter(15, 256, 0, nullptr, 9, 0);
    CHECK(mirror.Components[0].Values == std::map<int32_t, Bytes>{{1, one}});
    CHECK(mirror.Components[15].Values == std::map<int32_t, Bytes>{{256, {}}});
    for (const int32_t component : {16, 99, -2, INT32_MAX, INT32_MIN}) mirror.SetParameter(component, 1, 0, one.data(), 1, 0);
    CHECK(mirror.Components[3].Dirty == 0);
}

TEST_CASE("without a preset path nothing is set") {
    const Host host;
    BinProjectParameters mirror = host.mirror(kDirect);
    host.context->apoPresetPath = nullptr;
    const uint8_t one = 1;
    mirror.SetParameter(0, 1, 0, &one, 1, 0);
    CHECK(host.count("APOPresetPath = NULL") == 1);
    CHECK(mirror.Components[0].Values.empty());
    CHECK(storedAt(mirror.ParameterKey, 0, 1).empty());
    host.context->apoPresetPath = const_cast<char *>(kPath);
}

TEST_CASE("without a control handle a module of up to 2.0.7.70 gets its value at the key that the path tells") {
    const Host host;
    const uint8_t data[] = {0xAB, 2};
    {
        BinProjectParameters mirror = host.mirror(kByHandleOnly);
        mirror.SetParameter(2, 5, 3, data, 2, 0);
        CHECK(storedAt(mirror.ParameterKey, 2, 5).empty());
        CHECK(host.count("Setting parameter at") == 0);
    }
    BinProjectParameters mirror = host.mirror(kDirect);
    mirror.SetParameter(2, 5, 3, data, 2, 0);
    CHECK(storedAt(mirror.ParameterKey, 2, 5) == Bytes{0xAB, 2});
    CHECK(host.count("Setting parameter at HKLM\\" + utf8(mirror.ParameterKey) +
                     ". ComponentId = 2, ParamId = 5, Channel = 3, data[0] = 0xAB, DataSize = 2") == 1);
    // A transient one goes there under the object's own name.
    mirror.SetParameter(2, 6, 3, data, 2, 1);
    CHECK(storedAt(mirror.ParameterKey, 2, 6).empty());
    RegistryValue value;
    const WideString part = mirror.ParameterKey + VX_TEXT("\\2\\Data");
    CHECK(RegistryKey::queryAt(RegistryRoot::localMachine, part, VX_TEXT("6,") + mirror.InstanceId, value) == status::ok);
    SampleMachine::clean();
}

TEST_CASE("on an endpoint module version 2.0.7.70 writes twice, by the handle and directly, and 2.0.7.71 writes once") {
    SampleMachine machine;
    if (!machine.hasEndpoint()) {
        MESSAGE("skipped: no endpoint for rendering");
        return;
    }
    WideString endpoint = machine.endpointId();
    const uint8_t data[] = {9, 8, 7, 6};
    for (const uint64_t moduleVersion : {kDirect, kByHandleOnly}) {
        const bool twice = moduleVersion == kDirect;
        INFO(twice);
        const Host host;
        host.context->outputEndpointId = endpoint.data();
        BinProjectParameters mirror = host.mirror(moduleVersion);
        REQUIRE(mirror.ControlHandle != nullptr);
        CHECK(host.count("VXAPOCOMAPI_InitializeEx succeded.") == 1);
        CHECK(host.count("Endpoint id =") == 0);
        mirror.SetParameter(1, twice ? 20 : 21, 0, data, 4, 0);
        const WideString byHandle = SampleMachine::parametersPath();
        CHECK(byHandle != mirror.ParameterKey);
        CHECK(storedAt(byHandle, 1, twice ? 20 : 21) == Bytes{9, 8, 7, 6});
        CHECK(storedAt(mirror.ParameterKey, 1, twice ? 20 : 21) == (twice ? Bytes{9, 8, 7, 6} : Bytes()));
        // What it selected on the way.
        const RegistryKey slot = SampleMachine::configurationKey();
        CHECK(SampleMachine::textAt(slot, VX_TEXT("EngineName")) == "VXORLO");
        CHECK(SampleMachine::textAt(slot, VX_TEXT("UserProfile")) == "GlobalProfile");
        CHECK(SampleMachine::textAt(slot, VX_TEXT("ContentType")) == "AnyContent");
    }
    // With the handle goes what it had forced.
    CHECK(SampleMachine::textAt(SampleMachine::configurationKey(), VX_TEXT("EngineName")) == "(none)");
}

TEST_CASE("an endpoint id that names none leaves the mirror usable, with the direct path only") {
    const Host host;
    WideString nobody = VX_TEXT("{0.0.0.00000000}.{nobody}");
    host.context->inputEndpointId = nobody.data();
    BinProjectParameters mirror = host.mirror(kDirect);
    CHECK(mirror.ControlHandle == nullptr);
    CHECK(host.count("VXAPOCOMAPI_InitializeEx failed with error code -15.") == 1);
    const uint8_t one = 1;
    mirror.SetParameter(0, 1, 0, &one, 1, 0);
    CHECK(storedAt(mirror.ParameterKey, 0, 1) == Bytes{1});
    SampleMachine::clean();
}
