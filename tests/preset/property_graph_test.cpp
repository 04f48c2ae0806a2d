// SPDX-License-Identifier: MIT
//
// The chain of properties, row by row: what each change tears down and what it computes.
#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

std::string of(const CAPOPresetFile::Text &property) {
    return toUtf8(property.get());
}

}  // namespace

TEST_CASE_FIXTURE(Graph, "a new object has its defaults, and the chain stands still") {
    CHECK(host->EndpointIndex.get() == -1);
    CHECK(of(host->UserProfileName) == "GlobalProfile");
    CHECK(of(host->ContentTypeName) == "AnyContent");
    CHECK(of(host->DeviceIDAndEndpointIndex) == "0");
    CHECK(host->ModuleVersion.get() == 0);
    CHECK_FALSE(host->EngineLocked.get());
    for (const CAPOPresetFile::Text *empty :
         {&host->IOConfigName, &host->APOTypeRegKeyName, &host->PresetZipPath, &host->PresetFilePath, &host->ParamRegKeyName,
          &host->EngineShortName, &host->DeviceID})
        CHECK(empty->get().empty());
    CHECK_FALSE(host->Mutex);
}

TEST_CASE_FIXTURE(Graph, "a zero module version leaves the whole chain unlinked") {
    host->DevicePropertyStore.set(store.ref());
    host->APOTypeStr.set(VX_TEXT("EFX"));
    CHECK(host->APOTypeRegKeyName.get().empty());
    CHECK_FALSE(host->Mutex);
    host->ModuleVersion.set(kVersionWithEngine);  // links all rows at once
    CHECK(toUtf8(host->APOTypeRegKeyName.get()) == "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX");
    host->ModuleVersion.set(0);
    host->DeviceIDAndEndpointIndex.set(VX_TEXT("elsewhere"));
    CHECK(toUtf8(host->APOTypeRegKeyName.get()) == "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX");
}

TEST_CASE_FIXTURE(Graph, "another device and index moves the configuration key") {
    open();
    host->DeviceIDAndEndpointIndex.set(VX_TEXT("VXTEST\\ELSEWHERE"));
    CHECK(of(host->APOTypeRegKeyName) == "Software\\Ondrevale\\APO\\VXTEST\\ELSEWHERE\\EFX");
}

TEST_CASE_FIXTURE(Graph, "every effect slot has its mutex and its key") {
    const std::pair<const char *, const char *> slots[] = {
        {"EFX", "{CD147EE7-2140-4445-B39A-473D43BE970D}"}, {"MFX", "{36B0FFEC-2F71-433D-A3FF-55E149CF7F3A}"},
        {"SFX", "{651B4609-6CC8-4137-B61B-193FE66D2A1C}"}, {"GFX", "{76957D8F-A424-4E75-9984-8F053A875C95}"},
        {"LFX", "{76957D8F-A424-4E75-9984-8F053A875C95}"}, {"sfx", "{76957D8F-A424-4E75-9984-8F053A875C95}"},
    };
    open("EFX");
    for (const auto &[slot, mutex] : slots) {
        const GraphLog log;
        host->APOTypeStr.set({});
        CHECK_FALSE(host->Mutex);
        CHECK(host->Mutex.name().empty());
        host->APOTypeStr.set(toWide(slot));
        CHECK(host->Mutex);
        CHECK(NamedMutex::exists(toWide(std::string("Global\\") + mutex)));
        CHECK(log.inOrder({std::string("Global mutex name = ") + mutex,
                           std::string("APOTypeRegKeyName = Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\") + slot}));
    }
}

TEST_CASE_FIXTURE(Graph, "the slot reads the I/O configuration that a live application forces") {
    const Setter setter("graph-test-io");
    RegistryKey slot = configuration();
    slot.setText(store_name::ioConfig, VX_TEXT("Forced"));
    slot.setText(store_name::ioConfigSetter, setter.id);
    open();
    CHECK(of(host->IOConfigName) == "Forced");
}

TEST_CASE_FIXTURE(Graph, "the slot ignores the I/O configuration of an application that has ended") {
    RegistryKey slot = configuration();
    slot.setText(store_name::ioConfig, VX_TEXT("Forced"));
    slot.setText(store_name::ioConfigSetter, VX_TEXT("Global\\graph-test-nobody"));
    open();
    CHECK(of(host->IOConfigName) == "LineOut");
}

TEST_CASE_FIXTURE(Graph, "the I/O configuration reads the content type, and that the user profile") {
    RegistryKey slot = configuration();
    slot.setText(store_name::contentType, VX_TEXT("Music"));
    slot.setText(store_name::userProfile, VX_TEXT("Evening"));
    open();
    CHECK(of(host->ContentTypeName) == "Music");
    CHECK(of(host->UserProfileName) == "Evening");
}

TEST_CASE_FIXTURE(Graph, "values of the wrong type in the configuration key count as absent") {
    RegistryKey slot = configuration();
    slot.setU32(store_name::contentType, 1);
    slot.setBytes(store_name::userProfile, Bytes{'x', 0});
    slot.setU64(store_name::ioConfig, 1);
    open();
    CHECK(of(host->ContentTypeName) == "AnyContent");
    CHECK(of(host->UserProfileName) == "GlobalProfile");
    CHECK(of(host->IOConfigName) == "LineOut");
}

TEST_CASE_FIXTURE(Graph, "a loose preset is found by index, slot, I/O configuration and content") {
    putPreset(longDocument());
    const GraphLog log;
    open();
    const std::string path = "C:\\ProgramData\\Ondrevale\\APO\\7\\EFX\\LineOut\\AnyContent\\Preset.bin";
    CHECK(of(host->PresetFilePath) == path);
    CHECK(log.inOrder({"Updating binary preset file path ...", "Checking if preset file exists for IOConfig = LineOut",
                       "{ OpenPresetFile()", "Opening preset binary file '" + path + "' ...", "Done.",
                       "Found preset at '" + path + "', zip archive = '', zip entry = ''"}));
}

TEST_CASE_FIXTURE(Graph, "a package in the system folder comes before the loose tree, and the subsystem chooses the model") {
    putPackage(Package()
                   .add("9/7/EFX/LineOut/AnyContent/Preset.bin", writePreset(shortDocument()))
                   .add("7/7/EFX/LineOut/AnyContent/Preset.bin", writePreset(longDocument())));
    putPreset(shortDocument());
    open();
    CHECK(of(host->PresetZipPath) == toUtf8(packagePath()));
    CHECK(of(host->PresetFilePath) == "7/EFX/LineOut/AnyContent/Preset.bin");
    CHECK(of(host->PresetZipEntry) == "7/7/EFX/LineOut/AnyContent/Preset.bin");
    CHECK(of(host->EngineShortName) == "KZNOVA");
}

TEST_CASE_FIXTURE(Graph, "without a preset the path is empty and the engine is cleared") {
    open();
    host->EngineConfig.set(kDefaultEngineConfig);
    host->EngineShortName.set(VX_TEXT("ENGINE"));
    const GraphLog log;
    host->ContentTypeName.set(VX_TEXT("Nothing"));
    CHECK(host->PresetFilePath.get().empty());
    CHECK_FALSE(engineConfigSet(host->EngineConfig.get()));
    CHECK(host->EngineShortName.get().empty());
    CHECK(
        log.has("Preset doesn't exist at 'C:\\ProgramData\\Ondrevale\\APO\\7\\EFX\\LineOut\\Nothing\\Preset.bin', "
                "zip archive = ''"));
}

TEST_CASE_FIXTURE(Graph, "a lock keeps the engine through a preset change and where there is no preset") {
    putPreset(longDocument());
    putPreset(shortDocument(), "EFX", "LineOut", "Other");
    open();
    REQUIRE(of(host->EngineShortName) == "KZNOVA");
    host->EngineLocked.set(true);
    host->ContentTypeName.set(VX_TEXT("Other"));
    CHECK(of(host->EngineShortName) == "KZNOVA");
    host->ContentTypeName.set(VX_TEXT("Nothing"));
    CHECK(host->PresetFilePath.get().empty());
    CHECK(of(host->EngineShortName) == "KZNOVA");
    CHECK(engineConfigSet(host->EngineConfig.get()));
    host->EngineLocked.set(false);
    host->ContentTypeName.set(VX_TEXT("Other"));
    CHECK(of(host->EngineShortName) == "VXORLO");
}

TEST_CASE_FIXTURE(Graph, "the chain stops at an engine record of size 0, and the parameter key keeps its value") {
    putPreset(longDocument());
    open();
    const std::string before = of(host->ParamRegKeyName);
    REQUIRE_FALSE(before.empty());
    host->ContentTypeName.set(VX_TEXT("Nothing"));
    CHECK(of(host->ParamRegKeyName) == before);
}

TEST_CASE_FIXTURE(Graph, "the parameter key has the engine's level from module version 2.0.7.74 on") {
    putPreset(longDocument());
    const std::string slot = "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX";
    open("EFX", kVersionWithoutEngine);
    CHECK(of(host->ParamRegKeyName) == slot + "\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
    host->ModuleVersion.set(kEngineLevelVersion);
    CHECK(of(host->ParamRegKeyName) == slot + "\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
}

TEST_CASE_FIXTURE(Graph, "the parameter key moves behind the mute key, and the parameters are made sure of after both") {
    putPreset(longDocument());
    Texts moves;
    const GraphLog log;
    {
        const Moves mute(host->PresetSwitchMuteKey, "mute", moves), key(host->ParamRegKeyName, "key", moves);
        open();
    }
    const std::string key =
        "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent\\Parameters";
    CHECK(moves == Texts{"mute=" + key + "\\-1\\Data", "key=" + key});
    CHECK(log.inOrder({"{ EngineShortName_Changed(EngineShortName = KZNOVA)", "Updating parameter registry keys ...",
                       "Parameter registry key: " + key, "Preset switch muting parameters registry key: " + key + "\\-1\\Data",
                       "Saving preset hash in the registry under: " + key + "...", "Done.",
                       "} EngineShortName_Changed(EngineShortName = KZNOVA)"}));
    CHECK(keyExists(toWide(key)));
}

TEST_CASE_FIXTURE(Graph, "a profile that leaves preset and engine alone moves the parameter key all the same") {
    putPreset(longDocument());
    open();
    host->UserProfileName.set(VX_TEXT("Evening"));
    CHECK(of(host->ParamRegKeyName) ==
          "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\KZNOVA\\LineOut\\Evening\\AnyContent\\Parameters");
    CHECK(of(host->EngineShortName) == "KZNOVA");
}

TEST_CASE_FIXTURE(Graph, "two content types of one engine each have their parameter key") {
    putPreset(longDocument());
    putPreset(longDocument(), "EFX", "LineOut", "Music");
    open();
    host->ContentTypeName.set(VX_TEXT("Music"));
    CHECK(of(host->ParamRegKeyName) ==
          "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\KZNOVA\\LineOut\\GlobalProfile\\Music\\Parameters");
}

TEST_CASE_FIXTURE(Graph, "a property set twice in a row, with a change each time, leaves each link subscribed once") {
    putPreset(longDocument());
    putPreset(longDocument(), "EFX", "Other");
    open();
    for (const char *name : {"Other", "LineOut", "Other", "LineOut"}) host->IOConfigName.set(toWide(name));
    host->DeviceIDAndEndpointIndex.set(VX_TEXT("VXTEST\\TWICE"));
    host->DeviceIDAndEndpointIndex.set(VX_TEXT("VXTEST\\THRICE"));
    const GraphLog log;
    host->UserProfileName.set(VX_TEXT("Evening"));
    CHECK(log.count("{ UserProfileName_Changing(UserProfileName = GlobalProfile)") == 1);
    CHECK(log.count("{ UserProfileName_Changed(UserProfileName = Evening)") == 1);
    CHECK(log.count("{ EngineConfig_Changed(EngineConfig = { 0, 0 })") == 1);
    CHECK(log.count("{ EngineShortName_Changed(EngineShortName = KZNOVA)") == 1);
}

TEST_CASE_FIXTURE(Graph, "loading a preset moves record and name to nothing and then to the new ones, record first") {
    putPreset(longDocument());
    open();
    putPreset(shortDocument(), "EFX", "LineOut", "Other");
    Texts moves;
    const Moves record(host->EngineConfig, "record", moves);
    const Moves name(host->EngineShortName, "name", moves);
    host->ContentTypeName.set(VX_TEXT("Other"));
    CHECK(moves == Texts{"record=0", "name=", "record=60", "name=VXORLO"});
}

TEST_CASE_FIXTURE(Graph, "every change of the hardware behind the endpoint rebuilds the whole chain") {
    putPreset(longDocument());
    open();
    MockPropertyStore other;
    other.text(kEndpointHidKey, "VXTEST\\OTHER").number(kEndpointIndexProperty, 7).number(kFormFactorProperty, 2);
    host->DevicePropertyStore.set(other.ref());
    CHECK(of(host->ParamRegKeyName) ==
          "Software\\Ondrevale\\APO\\VXTEST\\OTHER\\7\\EFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
    CHECK(store.references == 1);
    host->DevicePropertyStore.set({});
}

TEST_CASE_FIXTURE(Graph, "another slot has presets and parameters of its own") {
    putPreset(longDocument(), "MFX");
    open("EFX");
    CHECK(host->PresetFilePath.get().empty());
    CHECK(host->ParamRegKeyName.get().empty());
    host->APOTypeStr.set(VX_TEXT("MFX"));
    CHECK(of(host->ParamRegKeyName) ==
          "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\MFX\\KZNOVA\\LineOut\\GlobalProfile\\AnyContent\\Parameters");
}
