// SPDX-License-Identifier: MIT
//
// What applications force on a slot, for as long as they live, and what stands without them.
#include "preset/forced_selection.h"

#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

std::string of(const CAPOPresetFile::Text &property) {
    return toUtf8(property.get());
}

// A record of one component.
Bytes record(uint32_t size) {
    Bytes bytes(size);
    bytes.at(8) = 1;
    return bytes;
}

struct Forcing : Graph {
    Forcing() {
        putPreset(longDocument());
        open();
        slot = configuration();
    }
    void forceIOConfig(const WideString &setter, const char *name) {
        slot.setText(store_name::ioConfigSetter, setter);
        slot.setText(store_name::ioConfig, toWide(name));
    }
    void forceEngine(const WideString &setter, const char *name, const Bytes &config) {
        slot.setText(store_name::engineSetter, setter);
        slot.setText(store_name::engineName, toWide(name));
        slot.setBytes(store_name::engineConfig, config);
    }
    std::string textOf(WideView name) const {
        WideString text;
        return slot.readText(name, text) == RegistryRead::value ? toUtf8(text) : "absent";
    }

    RegistryKey slot;
};

}  // namespace

TEST_CASE_FIXTURE(Forcing, "an I/O configuration that a live setter forces wins over the derived one") {
    const Setter setter("graph-test-io");
    forceIOConfig(setter.id, "Forced");
    const GraphLog log;
    host->UpdateIOConfig(false);
    CHECK(of(host->IOConfigName) == "Forced");
    CHECK(log.inOrder({"{ CAPOPresetFile::UpdateIOConfig()", "Forced IOConfigName = Forced",
                       "{ IOConfigName_Changing(IOConfigName = LineOut)", "{ IOConfigName_Changed(IOConfigName = Forced)",
                       "} CAPOPresetFile::UpdateIOConfig()"}));
    CHECK(textOf(store_name::ioConfigSetter) == toUtf8(setter.id));
}

TEST_CASE_FIXTURE(Forcing,
                  "once the setter has ended the I/O configuration is derived again, written, and the setter's id deleted") {
    {
        const Setter setter("graph-test-io");
        forceIOConfig(setter.id, "Forced");
        host->UpdateIOConfig(false);
    }
    WideString name = VX_TEXT("left over");
    CHECK(readForcedIOConfig(slot, name) == 0x80004005);
    CHECK(name.empty());
    const GraphLog log;
    host->UpdateIOConfig(false);
    CHECK(of(host->IOConfigName) == "LineOut");
    CHECK(textOf(store_name::ioConfig) == "LineOut");
    CHECK(textOf(store_name::ioConfigSetter) == "absent");
    CHECK(log.inOrder({"Resulting IOConfigName = LineOut", "Retrieved IOConfigName = LineOut, GraduallyMute = 0",
                       "Resulting I/O config name = LineOut",
                       "Writing I/O config name at HKLM\\Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\IOConfig ...", "Done."}));
}

TEST_CASE_FIXTURE(Forcing, "a derived I/O configuration is written without a stamp") {
    host->IOConfigName.set(VX_TEXT("Elsewhere"));
    host->UpdateIOConfig(false);
    CHECK(textOf(store_name::ioConfig) == "LineOut");
    uint64_t stamp = 0;
    CHECK(slot.readU64(store_name::writeTime, stamp) == RegistryRead::absent);
}

TEST_CASE_FIXTURE(Forcing, "a derived I/O configuration that stands already is not written") {
    host->UpdateIOConfig(true);
    CHECK(textOf(store_name::ioConfig) == "absent");
    CHECK(host->gradualMutes == 0);
}

TEST_CASE_FIXTURE(Forcing, "gradual muting is asked of the host once, ahead of the change, and only if it is wanted") {
    host->IOConfigName.set(VX_TEXT("Elsewhere"));
    host->UpdateIOConfig(false);
    CHECK(host->gradualMutes == 0);
    host->IOConfigName.set(VX_TEXT("Elsewhere"));
    const GraphLog log;
    host->UpdateIOConfig(true);
    CHECK(host->gradualMutes == 1);
    CHECK(log.has("Retrieved IOConfigName = LineOut, GraduallyMute = 1"));
}

TEST_CASE_FIXTURE(Forcing, "without a form factor no I/O configuration is derived, and the one that stands is kept") {
    store.remove(kFormFactorProperty);
    const GraphLog log;
    host->UpdateIOConfig(false);
    CHECK(log.inOrder({"Couldn't retrieve FormFactor", "Couldn't retrieve I/O Config"}));
    CHECK(of(host->IOConfigName) == "LineOut");
}

TEST_CASE_FIXTURE(Graph, "an object without endpoint derives no I/O configuration") {
    const GraphLog log;
    host->UpdateIOConfig(false);
    host->UpdateEngine();
    host->UpdateUserProfile();
    host->UpdateContentType();
    CHECK(log.has("Couldn't retrieve I/O Config"));
    CHECK(host->IOConfigName.get().empty());
}

TEST_CASE_FIXTURE(Forcing, "an empty forced I/O configuration is none") {
    const Setter setter("graph-test-io");
    forceIOConfig(setter.id, "");
    host->UpdateIOConfig(false);
    CHECK(of(host->IOConfigName) == "LineOut");
}

TEST_CASE_FIXTURE(Forcing, "a forced engine moves record and name to nothing and then to the new ones, name first") {
    const Setter setter("graph-test-engine");
    forceEngine(setter.id, "FORCED", record(20));
    Texts moves;
    const Moves config(host->EngineConfig, "record", moves);
    const Moves name(host->EngineShortName, "name", moves);
    const Moves key(host->ParamRegKeyName, "key", moves);
    const GraphLog log;
    host->UpdateEngine();
    CHECK(log.has("Forced EngineName = FORCED"));
    CHECK(moves ==
          Texts{"record=0", "name=", "name=FORCED",
                "key=Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\7\\EFX\\FORCED\\LineOut\\GlobalProfile\\AnyContent\\Parameters",
                "record=20"});
}

TEST_CASE_FIXTURE(Forcing, "a forced engine that stands already moves nothing") {
    const Setter setter("graph-test-engine");
    forceEngine(setter.id, "FORCED", record(20));
    host->UpdateEngine();
    Texts moves;
    const Moves name(host->EngineShortName, "name", moves);
    host->UpdateEngine();
    CHECK(moves.empty());
}

TEST_CASE_FIXTURE(Forcing, "an engine whose setter has ended gives way to the preset's") {
    const ::EngineConfig before = host->EngineConfig.get();
    {
        const Setter setter("graph-test-engine");
        forceEngine(setter.id, "FORCED", record(20));
        host->UpdateEngine();
        REQUIRE(of(host->EngineShortName) == "FORCED");
    }
    host->UpdateEngine();
    CHECK(of(host->EngineShortName) == "KZNOVA");
    CHECK(sameEngineConfig(host->EngineConfig.get(), before));
    CHECK(of(host->ParamRegKeyName).find("KZNOVA") != std::string::npos);
}

TEST_CASE_FIXTURE(Forcing, "an engine whose setter has ended gives way to none where there is no preset") {
    {
        const Setter setter("graph-test-engine");
        host->ContentTypeName.set(VX_TEXT("Nothing"));
        forceEngine(setter.id, "FORCED", record(20));
        host->UpdateEngine();
        REQUIRE(of(host->EngineShortName) == "FORCED");
    }
    host->UpdateEngine();
    CHECK(host->EngineShortName.get().empty());
    CHECK_FALSE(engineConfigSet(host->EngineConfig.get()));
}

TEST_CASE_FIXTURE(Forcing, "an engine that nobody forced stays as it is") {
    host->EngineShortName.set(VX_TEXT("MINE"));
    host->UpdateEngine();
    CHECK(of(host->EngineShortName) == "MINE");
}

TEST_CASE_FIXTURE(Forcing, "an engine value without a live setter is unset") {
    forceEngine(VX_TEXT("Global\\graph-test-nobody"), "FORCED", record(20));
    CHECK(readForcedEngineName(slot).empty());
    CHECK_FALSE(engineConfigSet(readForcedEngineConfig(slot)));
    host->UpdateEngine();
    CHECK(of(host->EngineShortName) == "KZNOVA");
    slot.deleteValue(store_name::engineSetter);
    CHECK(readForcedEngineName(slot).empty());
}

TEST_CASE_FIXTURE(Forcing, "an engine record of 525 bytes is ignored, one of 524 is taken with the number of bytes as its size") {
    const Setter setter("graph-test-engine");
    forceEngine(setter.id, "FORCED", record(525));
    CHECK_FALSE(engineConfigSet(readForcedEngineConfig(slot)));
    slot.setBytes(store_name::engineConfig, record(524));
    CHECK(readForcedEngineConfig(slot).Size == 524);
    CHECK(readForcedEngineConfig(slot).ComponentCount == 1);
    slot.setBytes(store_name::engineConfig, {});
    CHECK_FALSE(engineConfigSet(readForcedEngineConfig(slot)));
    slot.setText(store_name::engineConfig, VX_TEXT("text"));
    CHECK_FALSE(engineConfigSet(readForcedEngineConfig(slot)));
}

TEST_CASE_FIXTURE(Forcing, "an engine record of eight bytes counts, though it names no component") {
    const Setter setter("graph-test-engine");
    forceEngine(setter.id, "FORCED", Bytes{60, 0, 0, 0, 0, 0, 0, 0});
    host->UpdateEngine();
    CHECK(host->EngineConfig.get().Size == 8);
    CHECK(host->EngineConfig.get().ComponentCount == 0);
    CHECK(of(host->ParamRegKeyName).find("FORCED") != std::string::npos);
}

TEST_CASE_FIXTURE(Forcing, "a name forced without a record keeps the record that stands") {
    const Setter setter("graph-test-engine");
    slot.setText(store_name::engineSetter, setter.id);
    slot.setText(store_name::engineName, VX_TEXT("FORCED"));
    host->UpdateEngine();
    CHECK(of(host->EngineShortName) == "FORCED");
    CHECK(host->EngineConfig.get().Size == 20);
    CHECK(of(host->ParamRegKeyName).find("FORCED") != std::string::npos);
}

TEST_CASE_FIXTURE(Forcing, "user profile and content type have no setter and persist") {
    slot.setText(store_name::userProfile, VX_TEXT("Evening"));
    const GraphLog log;
    host->UpdateUserProfile();
    CHECK(of(host->UserProfileName) == "Evening");
    slot.setText(store_name::contentType, VX_TEXT("Music"));
    host->UpdateContentType();
    CHECK(of(host->ContentTypeName) == "Music");
    CHECK(log.inOrder({"{ CAPOPresetFile::UpdateUserProfile()", "Forced UserProfileName = Evening",
                       "{ CAPOPresetFile::UpdateContentType()", "Forced ContentTypeName = Music"}));
}

TEST_CASE_FIXTURE(Forcing, "an empty user profile or content type is none") {
    slot.setText(store_name::userProfile, {});
    slot.setText(store_name::contentType, {});
    host->UpdateUserProfile();
    host->UpdateContentType();
    CHECK(of(host->UserProfileName) == "GlobalProfile");
    CHECK(of(host->ContentTypeName) == "AnyContent");
}
