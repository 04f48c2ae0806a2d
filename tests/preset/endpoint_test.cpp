// SPDX-License-Identifier: MIT
//
// What an endpoint's properties tell: its kind, its device and subsystem ids, and the paths that follow.
#include <doctest/doctest.h>

#include <random>

#include "platform/file.h"
#include "platform/system_folder.h"
#include "preset/endpoint_class.h"
#include "preset/endpoint_id.h"
#include "preset/package_discovery.h"
#include "preset/preset_names.h"
#include "tests/preset/recording.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

constexpr int32_t kNotFound = static_cast<int32_t>(0x80070490);

struct Properties final : PropertyReader {
    PropertyAnswer read(const PROPERTYKEY &name) override {
        ++reads;
        for (const auto &[key, answer] : values) {
            if (key.fmtid == name.fmtid && key.pid == name.pid) return answer;
        }
        return {kNotFound, 0, 0, {}};
    }
    Properties &number(const PROPERTYKEY &name, uint32_t value, uint16_t type = kPropertyUi4) {
        values.push_back({name, {0, type, value, {}}});
        return *this;
    }
    Properties &text(const PROPERTYKEY &name, const char *value) {
        values.push_back({name, {0, kPropertyText, 0, toWide(value)}});
        return *this;
    }

    std::vector<std::pair<PROPERTYKEY, PropertyAnswer>> values;
    int reads = 0;
};

std::string ioConfig(Properties properties, RecordingLog *log = nullptr) {
    const VXWCHAR *const name = devicePropsToIOConfig(properties, log);
    return name == nullptr ? "null" : toUtf8(name);
}

struct Index {
    explicit Index(Properties properties) {
        name = toUtf8(devicePropsToEndpointIndex(properties, value, &log));
        reads = properties.reads;
    }
    uint32_t value = 12345;
    std::string name;
    int reads = 0;
    RecordingLog log;
};

std::string deviceOf(const char *key) {
    return toUtf8(deviceIdentity(toWide(key)).deviceId);
}
std::string ssidOf(const char *key) {
    return toUtf8(deviceIdentity(toWide(key)).ssid);
}

}  // namespace

TEST_CASE("form factor 1 without driver properties is any output, after three failures and built-in speakers in the log") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 1), &log) == "AnyOutput");
    CHECK(log.lines == std::vector<std::string>{"FormFactor = 1\n", "Checking for Realtek driver properties ...\n",
                                                "Couldn't retrieve value of PKEY_DRV_Headphone_Mode\n",
                                                "Couldn't retrieve value of PKEY_DRV_RedirectHeadphone_Enable\n",
                                                "Couldn't retrieve value of PKEY_DRV_Internal_Speaker_Mode\n",
                                                "Internal (built-in) speakers detected.\n",
                                                "Resulting IOConfigName = AnyOutput\n"});
}

TEST_CASE("form factor 1 with redirected headphones is headphones") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 1).number(kDriverRedirectHeadphoneProperty, 1), &log) == "Headphones");
    CHECK(log.has("IsRedirectHeadphonesMode = 1\n"));
    CHECK(log.has("Headphones detected.\n"));
}

TEST_CASE("form factor 1 in headphone mode is headphones, and any nonzero value counts") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 1).number(kDriverHeadphoneModeProperty, 0x80000000), &log) ==
          "Headphones");
    CHECK(log.has("IsHeadphonesMode = 1\n"));
}

TEST_CASE("form factor 3 is headphones without any read of the driver's properties") {
    Properties properties;
    properties.number(kFormFactorProperty, 3);
    CHECK(toUtf8(devicePropsToIOConfig(properties, nullptr)) == "Headphones");
    CHECK(properties.reads == 1);
}

TEST_CASE("every form factor has its name, and those above 9 are unknown") {
    const char *const names[] = {"Network", "AnyOutput",   "LineOut", "Headphones",   "Microphone", "Headset",
                                 "Handset", "Passthrough", "SPDIF",   "AudioDisplay", "Unknown",    "Unknown"};
    for (uint32_t i = 0; i < std::size(names); ++i) CHECK(ioConfig(Properties().number(kFormFactorProperty, i)) == names[i]);
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 0xFFFFFFFF)) == "Unknown");
}

TEST_CASE("a form factor of another type gives null") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 3, 18), &log) == "null");
    CHECK(log.lines == std::vector<std::string>{"Couldn't retrieve FormFactor\n", "Resulting IOConfigName = (null)\n"});
    CHECK(ioConfig(Properties()) == "null");
}

TEST_CASE("internal and external speakers are told apart in the log alone") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 1).number(kDriverInternalSpeakerProperty, 0), &log) == "AnyOutput");
    CHECK(log.has("External speakers detected.\n"));
}

TEST_CASE("the line of the internal-speaker switch shows the redirect switch") {
    RecordingLog log;
    ioConfig(Properties().number(kFormFactorProperty, 1).number(kDriverInternalSpeakerProperty, 1), &log);
    CHECK(log.has("IsInternalSpeakersMode = 0\n"));
    CHECK(log.has("Internal (built-in) speakers detected.\n"));
}

TEST_CASE("a driver property of another type counts as missing") {
    RecordingLog log;
    CHECK(ioConfig(Properties().number(kFormFactorProperty, 1).number(kDriverHeadphoneModeProperty, 1, 11), &log) == "AnyOutput");
    CHECK(log.has("Couldn't retrieve value of PKEY_DRV_Headphone_Mode\n"));
}

TEST_CASE("a private endpoint index of 7 gives 7 and an unknown name, and no jack subtype is read") {
    const Index index(
        Properties().number(kEndpointIndexProperty, 7).text(kJackSubTypeProperty, "{DFF21CE1-F70F-11D0-B917-00A0C9223196}"));
    CHECK(index.value == 7);
    CHECK(index.name == "KSNODETYPE_UNKNOWN");
    CHECK(index.reads == 1);
    CHECK(index.log.lines == std::vector<std::string>{"EndpointIndex = 7\n", "JackSubType = KSNODETYPE_UNKNOWN\n"});
}

TEST_CASE("private endpoint indices 0 to 2 have names of their own") {
    const char *const names[] = {"KSNODETYPE_OEM_SPEAKER", "KSNODETYPE_OEM_HEADPHONES", "KSNODETYPE_OEM_LINE_CONNECTOR"};
    for (uint32_t i = 0; i < 3; ++i) {
        const Index index(Properties().number(kEndpointIndexProperty, i));
        CHECK(index.value == i);
        CHECK(index.name == names[i]);
    }
}

TEST_CASE("with neither key the index is all ones and the name unknown") {
    const Index index{Properties()};
    CHECK(index.value == 0xFFFFFFFF);
    CHECK(index.name == "KSNODETYPE_UNKNOWN");
    CHECK(index.log.lines == std::vector<std::string>{"Couldn't access PKEY_VXAPO_EndpointIndex, error code = -2147023728\n",
                                                      "Retrieving endpoint index through PKEY_AudioEndpoint_JackSubType ...\n",
                                                      "Couldn't access PKEY_AudioEndpoint_JackSubType, error code = -2147023728\n",
                                                      "EndpointIndex = -1\n", "JackSubType = KSNODETYPE_UNKNOWN\n"});
}

TEST_CASE("the line connector's subtype, whose first word differs from its neighbours' pattern, gives index 2") {
    const Index index(Properties().text(kJackSubTypeProperty, "{DFF21FE3-F70F-11D0-B917-00A0C9223196}"));
    CHECK(index.value == 2);
    CHECK(index.name == "KSNODETYPE_LINE_CONNECTOR");
    CHECK(index.log.has("PKEY_AudioEndpoint_JackSubType = KSNODETYPE_LINE_CONNECTOR\n"));
}

TEST_CASE("every jack subtype has its index, in letters of any case") {
    const std::pair<const char *, const char *> rows[] = {
        {"{DFF21CE1-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_SPEAKER"},
        {"{dff21ce2-f70f-11d0-b917-00a0c9223196}", "KSNODETYPE_HEADPHONES"},
        {"{DFF21FE3-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_LINE_CONNECTOR"},
        {"{DFF21DE5-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_ECHO_CANCELING_SPEAKERPHONE"},
        {"{DFF21CE6-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_COMMUNICATION_SPEAKER"},
        {"{DFF21DE1-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_HANDSET"},
        {"{DFF21DE2-F70F-11D0-B917-00A0C9223196}", "KSNODETYPE_HEADSET"},
    };
    uint32_t expected = 0;
    for (const auto &[guid, name] : rows) {
        const Index index(Properties().text(kJackSubTypeProperty, guid));
        CHECK(index.value == expected++);
        CHECK(index.name == name);
    }
}

TEST_CASE("a jack subtype that is no GUID, or another one, is unknown and logged as read") {
    for (const char *text : {"", "speaker", "{DFF21CE3-F70F-11D0-B917-00A0C9223196}", "DFF21CE1-F70F-11D0-B917-00A0C9223196",
                             "{DFF21CE1-F70F-11D0-B917-00A0C922319}", "{DFF21CE1-F70F-11D0-B917-00A0C922319G}",
                             "{00000000-0000-0000-0000-000000000000}"}) {
        const Index index(Properties().text(kJackSubTypeProperty, text));
        CHECK(index.value == 0xFFFFFFFF);
        CHECK(index.log.has("Unknown PKEY_AudioEndpoint_JackSubType = " + std::string(text) + "\n"));
    }
}

TEST_CASE("a jack subtype of another type is logged with a success code") {
    const Index index(Properties().number(kJackSubTypeProperty, 1));
    CHECK(index.log.has("Couldn't access PKEY_AudioEndpoint_JackSubType, error code = 0\n"));
}

TEST_CASE("a private endpoint index of another type falls through to the jack subtype") {
    const Index index(
        Properties().number(kEndpointIndexProperty, 0, 18).text(kJackSubTypeProperty, "{DFF21CE2-F70F-11D0-B917-00A0C9223196}"));
    CHECK(index.value == 1);
    CHECK(index.log.has("Couldn't access PKEY_VXAPO_EndpointIndex, error code = 0\n"));
}

TEST_CASE("a hardware key is cut to bus and device, and the subsystem id taken out") {
    const char *const key = "{1}.HDAUDIO\\FUNC_01&VEN_1234&DEV_5678&SUBSYS_1234ABCD&REV_1000\\5&2a&0&0001";
    CHECK(deviceOf(key) == "HDAUDIO\\FUNC_01&VEN_1234&DEV_5678");
    CHECK(ssidOf(key) == "SUBSYS_1234ABCD");
}

TEST_CASE("a device without a subsystem has an empty id and the whole cut text for a device") {
    CHECK(deviceOf("{1}.USB\\VID_1&PID_2\\7&x") == "USB\\VID_1&PID_2");
    CHECK(ssidOf("{1}.USB\\VID_1&PID_2\\7&x").empty());
}

TEST_CASE("a key without the leading brace group is used from its first character") {
    CHECK(deviceOf("USB\\VID_1\\x") == "USB\\VID_1");
    CHECK(deviceOf("{1USB\\VID_1") == "{1USB\\VID_1");
    CHECK(deviceOf("a{1}.USB\\V") == "a{1}.USB\\V");
}

TEST_CASE("odd hardware keys are cut without harm") {
    CHECK(deviceOf("") == "");
    CHECK(deviceOf("{") == "{");
    CHECK(deviceOf("{}.") == "");
    CHECK(deviceOf("\\") == "\\");
    CHECK(deviceOf("A\\") == "A\\");
    CHECK(deviceOf("A\\\\") == "A\\\\");
    CHECK(deviceOf("A\\B\\") == "A\\B");
    CHECK(deviceOf("&SUBSYS_") == "");
    CHECK(ssidOf("&SUBSYS_") == "SUBSYS_");
    CHECK(ssidOf("A&SUBSYS_1&SUBSYS_2") == "SUBSYS_1");
    CHECK(deviceOf("A\\B\\&SUBSYS_12345678") == "A\\B");
    CHECK(deviceOf("SUBSYS_1") == "SUBSYS_1");
}

TEST_CASE("random hardware keys give back parts of themselves") {
    std::mt19937 random(4711);
    const char *const pieces[] = {"{", "}.", "\\", "&SUBSYS_", "&", "A", "1234", "}"};
    for (int round = 0; round < 5000; ++round) {
        std::string key;
        for (unsigned i = random() % 9; i > 0; --i) key += pieces[random() % 8];
        const DeviceIdentity identity = deviceIdentity(toWide(key));
        CHECK(key.find(toUtf8(identity.deviceId)) != std::string::npos);
        CHECK((identity.ssid.empty() || identity.ssid.starts_with(VX_TEXT("SUBSYS_"))));
        CHECK(identity.ssid.find(VX_TEXT('&')) == WideString::npos);
    }
}

TEST_CASE("device id and index are joined from what there is") {
    CHECK(toUtf8(deviceIdAndEndpointIndex(toWide("BUS\\DEV"), 3)) == "BUS\\DEV\\3");
    CHECK(toUtf8(deviceIdAndEndpointIndex(toWide("BUS\\DEV"), -1)) == "BUS\\DEV");
    CHECK(toUtf8(deviceIdAndEndpointIndex({}, 3)) == "3");
    CHECK(toUtf8(deviceIdAndEndpointIndex({}, -1)) == "0");
}

TEST_CASE("a package is named by its device with the first backslash replaced") {
    CHECK(toUtf8(presetPackageName(toWide("BUS\\DEVICE"))) == "VXAPODATU.BUS.DEVICE.zip");
    CHECK(toUtf8(presetPackageName(toWide("A\\B\\C"))) == "VXAPODATU.A.B\\C.zip");
    CHECK(toUtf8(presetPackageName(toWide("X"))) == "VXAPODATU.X.zip");
}

TEST_CASE("preset paths are joined with slashes in a package and backslashes on disk, and endpoint index -1 stands as 0") {
    PresetKey key{2, VX_TEXT("EFX"), VX_TEXT("Output"), VX_TEXT("AnyContent")};
    CHECK(toUtf8(packagePresetPath(key)) == "2/EFX/Output/AnyContent/Preset.bin");
    CHECK(toUtf8(loosePresetPath(key)) == "C:\\ProgramData\\Ondrevale\\APO\\2\\EFX\\Output\\AnyContent\\Preset.bin");
    key.endpointIndex = -1;
    CHECK(toUtf8(packagePresetPath(key)) == "0/EFX/Output/AnyContent/Preset.bin");
    CHECK(toUtf8(loosePresetPath(key)) == "C:\\ProgramData\\Ondrevale\\APO\\0\\EFX\\Output\\AnyContent\\Preset.bin");
}

TEST_CASE("the folder of packages follows the native architecture and the kind of process") {
    const WideString windows = VX_TEXT("C:\\Windows");
    CHECK(toUtf8(packageFolder({windows, 0, false})) == "C:\\Windows\\SysWOW64");
    CHECK(toUtf8(packageFolder({windows, 0, true})) == "C:\\Windows\\SysWOW64");
    CHECK(toUtf8(packageFolder({windows, 9, false})) == "C:\\Windows\\System32");
    CHECK(toUtf8(packageFolder({windows, 9, true})) == "C:\\Windows\\Sysnative");
    CHECK(toUtf8(packageFolder({windows, 12, false})) == "C:\\Windows\\System32");
    CHECK(toUtf8(packageFolder({VX_TEXT("C:\\"), 9, false})) == "C:\\System32");
}

TEST_CASE("this system's facts name an existing kind of folder") {
    const SystemFacts facts = systemFacts();
    CHECK(toUtf8(facts.windowsFolder).starts_with("C:\\"));
    CHECK(facts.nativeArchitecture == kArchitectureAmd64);
    CHECK_FALSE(facts.underWow64);
}

TEST_CASE("without a device id no package is looked for, and a missing one is logged") {
    RecordingLog log;
    CHECK(findPresetPackage({}, systemFacts(), &log).empty());
    CHECK(log.lines == std::vector<std::string>{"Device ID is empty.\n"});
    log = {};
    CHECK(findPresetPackage(toWide("NO\\SUCH&DEVICE"), {VX_TEXT("C:\\Nowhere"), 9, false}, &log).empty());
    CHECK(log.lines ==
          std::vector<std::string>{"Checking for preset .zip package at C:\\Nowhere\\System32\\VXAPODATU.NO.SUCH&DEVICE.zip ...\n",
                                   "Preset zip file doesn't exist.\n"});
}
