// SPDX-License-Identifier: MIT
//
// What opening a host does with endpoint ids and preset paths, and how its parameters reach the store.
#include <doctest/doctest.h>

#include <cstring>
#include <fstream>
#include <iterator>
#include <optional>

#include "VXAPOCOMAPI.h"
#include "platform/module.h"
#include "preset/package_discovery.h"
#include "preset/parameter_store.h"
#include "preset/project_parameters.h"
#include "tests/support/host_instance.h"
#include "tests/support/host_log.h"
#include "tests/support/sample_machine.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Bytes = std::vector<uint8_t>;

constexpr const char *kPath = "C:\\ProgramData\\Ondrevale\\APO\\7\\EFX\\AnyOutput\\AnyContent\\Preset.bin";

std::filesystem::path installedLibrary() {
    return hostPath(packageFolder(systemFacts()) + VX_TEXT("\\VXCOMN64U.dll"));
}

// Writes another version into the installed library's version record.
void setInstalledVersion(uint64_t version) {
    constexpr uint8_t kRecord[] = {0xBD, 0x04, 0xEF, 0xFE, 0x00, 0x00, 0x01, 0x00};  // signature and structure version
    const std::filesystem::path path = installedLibrary();
    std::ifstream in(path, std::ios::binary);
    std::vector<char> image{std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
    in.close();
    const auto place = std::search(image.begin(), image.end(), std::begin(kRecord), std::end(kRecord),
                                   [](char left, uint8_t right) { return static_cast<uint8_t>(left) == right; });
    REQUIRE(place != image.end());
    const uint32_t halves[] = {static_cast<uint32_t>(version >> 32), static_cast<uint32_t>(version)};
    std::memcpy(&*place + sizeof kRecord, halves, sizeof halves);
    std::ofstream(path, std::ios::binary).write(image.data(), static_cast<std::streamsize>(image.size()));
}

constexpr uint64_t version(uint64_t major, uint64_t minor, uint64_t build, uint64_t revision) {
    return major << 48 | minor << 32 | build << 16 | revision;
}

HostInstance::Options optionsOf(const char *commandLine, const char *presetPath, int32_t hostType = 0) {
    HostInstance::Options options;
    options.commandLine = commandLine;
    options.presetPath = presetPath;
    options.hostType = hostType;
    return options;
}

std::string utf8(const VXWCHAR *text) {
    return text != nullptr ? toUtf8(text) : "(null)";
}

Bytes storedAt(const WideString &parameterKey, int32_t component, int32_t param) {
    Bytes bytes(64);
    auto size = static_cast<uint32_t>(bytes.size());
    if (ReadParameterValue(parameterKey, component, param, bytes.data(), size, nullptr, nullptr) != status::ok) size = 0;
    bytes.resize(size);
    return bytes;
}

struct Machine {
    SampleMachine machine;
    HostLog log;
};

}  // namespace

TEST_CASE_FIXTURE(Machine, "without a preset path the version reading is skipped, and both versions stay 0") {
    const HostInstance host(optionsOf("iepid:abc", nullptr));
    CHECK(host.context().thisModuleVersion == 0);
    CHECK(host.context().apoModuleVersion == 0);
    CHECK(host.context().projectParameters == nullptr);
    for (const std::string &text : log.texts()) {
        CHECK(text.find("Invalid module extension") == std::string::npos);
        CHECK(text.find("Couldn't access") == std::string::npos);
    }
}

TEST_CASE_FIXTURE(Machine, "the value of an endpoint key runs to the next blank, and the key may stand inside another word") {
    for (const char *line : {"iepid:abc def", "xiepid:abc", "/a iepid:abc", "iepid:abc iepid:def"}) {
        INFO(line);
        const HostInstance host(optionsOf(line, nullptr));
        CHECK(utf8(host.context().inputEndpointId) == "abc");
        CHECK(host.context().inputEndpointName == nullptr);
        CHECK(host.context().outputEndpointId == nullptr);
    }
    const HostInstance both(optionsOf("oepid:\xC3\xA9 iepid:{1}.{2}", nullptr));
    CHECK(utf8(both.context().inputEndpointId) == "{1}.{2}");
    CHECK(utf8(both.context().outputEndpointId) == "\xC3\xA9");
    for (const char *line : {"", "iepid:", "iepid: abc", "iepid:  oepid: ", "iepi:abc", "IEPID:abc"}) {
        INFO(line);
        const HostInstance none(optionsOf(line, nullptr));
        CHECK(none.context().inputEndpointId == nullptr);
        CHECK(none.context().outputEndpointId == nullptr);
    }
}

TEST_CASE_FIXTURE(Machine, "an endpoint that is there gets its name, on either side") {
    if (!machine.hasEndpoint()) {
        MESSAGE("skipped: no endpoint for rendering");
        return;
    }
    const std::string id = toUtf8(machine.endpointId());
    const HostInstance host(optionsOf(("oepid:" + id).c_str(), nullptr));
    CHECK(utf8(host.context().outputEndpointId) == id);
    CHECK(utf8(host.context().outputEndpointName) == "VXTEST\\CONTROL");
    const HostInstance other(optionsOf(("iepid:" + id + " /x").c_str(), nullptr));
    CHECK(utf8(other.context().inputEndpointName) == "VXTEST\\CONTROL");
    CHECK(other.context().outputEndpointName == nullptr);
}

TEST_CASE_FIXTURE(Machine, "from module version 2.0.5.4 on there is a mirror, unless the host is of type 1") {
    setInstalledVersion(version(2, 0, 5, 4));
    {
        const HostInstance host(optionsOf(nullptr, kPath));
        CHECK(host.context().apoModuleVersion == version(2, 0, 5, 4));
        REQUIRE(host.context().projectParameters != nullptr);
        const BinProjectParameters &mirror = *host.context().projectParameters;
        CHECK(mirror.PresetPath == kPath);
        CHECK(mirror.EngineName == "VXORLO");
        CHECK(mirror.EngineDescription.ComponentCount == 6);
        CHECK(mirror.ModuleVersion == version(2, 0, 5, 4));
    }
    const HostInstance first(optionsOf(nullptr, kPath, 1));
    CHECK(first.context().projectParameters == nullptr);
    CHECK(log.count(std::string("Incompatible host! APO version 2.0.5.4. Cannot modify preset file '") + kPath + "'") == 1);
    setInstalledVersion(version(2, 0, 5, 3));
    const HostInstance old(optionsOf(nullptr, kPath, 2));
    CHECK(old.context().projectParameters == nullptr);
    CHECK(log.count(std::string("Incompatible APO version 2.0.5.3. Must be 0.0.0.0. Cannot modify preset file '") + kPath + "'") ==
          1);
}

TEST_CASE_FIXTURE(Machine, "a version prints by the low 8 bits of each part, and one with none in its major part says nothing") {
    setInstalledVersion(version(1, 300, 65535, 7));
    const HostInstance low(optionsOf(nullptr, kPath));
    CHECK(log.count(std::string("Incompatible APO version 1.44.255.7. Must be 0.0.0.0. Cannot modify preset file '") + kPath +
                    "'") == 1);
    // As a signed number it is below every version.
    setInstalledVersion(version(0x8000, 0, 0, 0));
    const HostInstance negative(optionsOf(nullptr, kPath));
    CHECK(negative.context().projectParameters == nullptr);
    // No file of the name: this module's version stands in, and a test program bears none.
    std::filesystem::remove(installedLibrary());
    const HostInstance bare(optionsOf(nullptr, kPath));
    CHECK(bare.context().projectParameters == nullptr);
    CHECK(bare.context().apoModuleVersion == 0);
    const std::vector<std::string> texts = log.texts();
    CHECK(std::count_if(texts.begin(), texts.end(), [](const std::string &text) { return text.rfind("Incompatible", 0) == 0; }) ==
          1);
    CHECK(std::count_if(texts.begin(), texts.end(), [](const std::string &text) {
              return text.rfind("Couldn't access '", 0) == 0 &&
                     text.find("VXCOMN64U.dll' module file, error code = 2.") != text.npos;
          }) == 1);
    CHECK(std::count_if(texts.begin(), texts.end(),
                        [](const std::string &text) { return text.rfind("Invalid module extension '", 0) == 0; }) == 3);
}

TEST_CASE_FIXTURE(Machine, "a parameter stands in the store before the engine gets it, also while the engine is not ready") {
    setInstalledVersion(version(2, 0, 7, 70));
    HostInstance host(optionsOf(nullptr, kPath));
    REQUIRE(host.context().projectParameters != nullptr);
    const WideString key = host.context().projectParameters->ParameterKey;
    Bytes data = {1, 2, 3}, seen;
    host.engine().onControl = [&] { seen = storedAt(key, 4, 9); };
    host.engine().parameterResult = 77;
    CHECK(VXDSPAPI_SetParameter(host.handle, 4, 9, 0, data.data(), 3) == 77);
    CHECK(seen == data);
    CHECK(host.context().projectParameters->Components[4].Values.at(9) == data);
    // One of the host's own goes to the store, too.
    uint8_t on = 1;
    CHECK(VXDSPAPI_SetParameter(host.handle, 4, -6, 0, &on, 1) == 1);
    CHECK(storedAt(key, 4, -6) == Bytes{1});
    // Transient: under the mirror's own name, and not recorded.
    VXDSPAPI_SetParameterEx(host.handle, 4, 10, 0, data.data(), 3, 1);
    CHECK(storedAt(key, 4, 10).empty());
    CHECK(host.context().projectParameters->Components[4].Values.count(10) == 0);

    host.context().initialised = 0;
    seen.clear();
    CHECK(VXDSPAPI_SetParameter(host.handle, 4, 11, 0, data.data(), 3) == 0);
    CHECK(seen.empty());
    CHECK(storedAt(key, 4, 11) == data);
    host.context().initialised = 1;
}

TEST_CASE_FIXTURE(Machine, "what a tool sets through the host is received by the effect's side of the same endpoint") {
    if (!machine.hasEndpoint()) {
        MESSAGE("skipped: no endpoint for rendering");
        return;
    }
    const VXAPOHandle api = VXAPOCOMAPI_InitializeAPI();
    const VXAPOHandle endpoint = VXAPOCOMAPI_GetEndpoint(api, machine.endpointId().c_str(), 0);
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    const void *blob = nullptr;
    uint32_t size = 0, count = 0;
    while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 0) == 1) {
    }

    HostInstance host(optionsOf(("oepid:" + toUtf8(machine.endpointId())).c_str(), kPath));
    REQUIRE(host.context().projectParameters != nullptr);
    CHECK(host.context().projectParameters->ControlHandle != nullptr);
    while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 0, 0) == 1) {
    }
    uint8_t data[] = {4, 3, 2, 1};
    VXDSPAPI_SetParameter(host.handle, 3, 200, 0, data, 4);
    REQUIRE(VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, 20000, 0) == 1);
    REQUIRE(count == 1);
    REQUIRE(size == 48 + 4);
    int32_t component = 0, param = 0;
    std::memcpy(&component, static_cast<const uint8_t *>(blob) + 24, 4);
    std::memcpy(&param, static_cast<const uint8_t *>(blob) + 28, 4);
    CHECK(component == 3);
    CHECK(param == 200);
    CHECK(std::memcmp(static_cast<const uint8_t *>(blob) + 48, data, 4) == 0);
    host.free();
    VXAPOCOMAPI_FreeAPI(api);
}

TEST_CASE_FIXTURE(Machine, "freeing the host ends the mirror and all that it opened") {
    for (int round = 0; round < 5; ++round) {
        HostInstance host(optionsOf(("oepid:" + toUtf8(machine.endpointId())).c_str(), kPath));
        REQUIRE(host.context().projectParameters != nullptr);
        const WideString instance = host.context().projectParameters->InstanceId;
        CHECK(NamedMutex::exists(VX_TEXT("Global\\") + instance));
        host.free();
        CHECK_FALSE(NamedMutex::exists(VX_TEXT("Global\\") + instance));
    }
    CHECK(log.inOrder({"{ VXDSPAPI_FreeLibrary()", "{ ~BinProjectParameters()", "} ~BinProjectParameters()",
                       "Disposing library context.", "} VXDSPAPI_FreeLibrary()"}));
}
