// SPDX-License-Identifier: MIT
//
// Selections, devices and keys of any spelling: whatever a process writes into the configuration key, and a driver into the
// endpoint's properties, ends in a chain that stands still or goes on, and in no harm to what is stored elsewhere.
#include "preset/forced_selection.h"
#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

const std::string kHostileNames[] = {
    "\\",
    "\\\\",
    "a\\",
    "\\a",
    "..\\..\\..",
    "a\\\\b",
    "%s%s%n%999999d",
    ".",
    "*",
    "?",
    "con",
    " ",
    "name with blanks",
    "\xEF\xBF\xBF",
    "\xF0\x9F\x8E\xA7",
    "a/b/c/d/e",
    std::string(255, 'x'),
    std::string(256, 'x'),
    std::string(5000, 'x'),
    std::string(1000, '\\'),
};

}  // namespace

TEST_CASE_FIXTURE(Graph, "hostile selections break nothing, and the next good one is as good as ever") {
    putPreset(longDocument());
    open();
    const WideString good = host->ParamRegKeyName.get();
    const Setter setter("graph-test-hostile");
    RegistryKey slot = configuration();
    slot.setText(store_name::ioConfigSetter, setter.id);
    slot.setText(store_name::engineSetter, setter.id);
    slot.setBytes(store_name::engineConfig, Bytes{1, 2, 3});
    for (const std::string &name : kHostileNames) {
        for (const WideView value :
             {store_name::ioConfig, store_name::userProfile, store_name::contentType, store_name::engineName})
            slot.setText(value, toWide(name));
        host->UpdateIOConfig(false);
        host->UpdateUserProfile();
        host->UpdateContentType();
        host->UpdateEngine();
        CHECK(host->UserProfileName.get() == toWide(name));
        host->ResetParameters(false, false);
        uint8_t data[4] = {};
        uint32_t size = sizeof data;
        host->GetParameter(1, 1, -1, data, size, nullptr, nullptr);
        std::vector<WideString> keys;
        host->GetAllParamRegKeysForAPOType(toWide(name), keys);
    }
    for (const WideView value : {store_name::ioConfig, store_name::userProfile, store_name::contentType, store_name::engineName,
                                 store_name::engineSetter, store_name::ioConfigSetter})
        slot.deleteValue(value);
    host->UserProfileName.set(kDefaultUserProfile);
    host->ContentTypeName.set(kDefaultContentType);
    host->UpdateIOConfig(false);
    host->UpdateEngine();
    CHECK(host->ParamRegKeyName.get() == good);
    CHECK(value(5, 117).size() == 13);
}

TEST_CASE_FIXTURE(Graph, "setter ids of any spelling are nobody's") {
    RegistryKey slot = configuration();
    slot.setText(store_name::ioConfig, VX_TEXT("Forced"));
    WideString name;
    for (const std::string &id : kHostileNames) {
        slot.setText(store_name::ioConfigSetter, toWide(id));
        CHECK(readForcedIOConfig(slot, name) == kSetterGone);
    }
    slot.setBytes(store_name::ioConfigSetter, Bytes(3, 1));
    CHECK(readForcedIOConfig(slot, name) == kSetterGone);
}

TEST_CASE_FIXTURE(Graph, "hardware keys of any spelling give a chain that stands or goes") {
    putPreset(longDocument());
    open();
    for (std::string key : kHostileNames) {
        for (const char *tail : {"", "&SUBSYS_", "&SUBSYS_12345678&x\\y\\z"}) {
            MockPropertyStore other;
            other.text(kEndpointHidKey, key + tail).number(kEndpointIndexProperty, 7).number(kFormFactorProperty, 2);
            host->DevicePropertyStore.set(other.ref());
            CHECK_FALSE(host->DeviceIDAndEndpointIndex.get().empty());
            host->DevicePropertyStore.set({});
        }
    }
    host->DevicePropertyStore.set(store.ref());
    CHECK(toUtf8(host->DeviceIDAndEndpointIndex.get()) == kDevice + "\\7");
    CHECK(value(5, 117).size() == 13);
}

TEST_CASE_FIXTURE(Graph, "indices at the ends of their range stand in keys and paths as they are") {
    for (const uint32_t index : {0u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFEu, 0xFFFFFFFFu}) {
        MockPropertyStore other;
        other.text(kEndpointHidKey, kHardwareKey).number(kEndpointIndexProperty, index).number(kFormFactorProperty, 2);
        host->open(&other, "EFX");
        const auto number = static_cast<int32_t>(index);
        CHECK(toUtf8(host->DeviceIDAndEndpointIndex.get()) == kDevice + (number == -1 ? "" : "\\" + std::to_string(number)));
        host->DevicePropertyStore.set({});
        host->APOTypeStr.set({});
    }
}
