// SPDX-License-Identifier: MIT
//
// The first row of the property chain: what follows from a device's properties, and goes with them.
#include "tests/preset/graph_fixture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

using Texts = std::vector<std::string>;

std::string of(const CAPOPresetFile::Text &property) {
    return toUtf8(property.get());
}

}  // namespace

TEST_CASE_FIXTURE(Graph, "a property store tells identity, package name and index, and each step is logged") {
    store.text(kEndpointGuidKey, "{01020304-0506-0708-090A-0B0C0D0E0F10}");
    const GraphLog log;
    host->DevicePropertyStore.set(store.ref());
    CHECK(of(host->DeviceID) == kDevice);
    CHECK(of(host->SSID) == "SUBSYS_1234ABCD");
    CHECK(of(host->PresetPackageName) == "VXAPODATU.VXTEST.GRAPH.zip");
    CHECK(of(host->EndpointGuidText) == "{01020304-0506-0708-090A-0B0C0D0E0F10}");
    CHECK(host->EndpointGuid.get().Data1 == 0x01020304);
    CHECK(host->EndpointIndex.get() == 7);
    CHECK(of(host->DeviceIDAndEndpointIndex) == kDevice + "\\7");
    CHECK(of(host->IOConfigName) == "LineOut");
    CHECK(log.inOrder({"Retrieved endpoint GUID = {01020304-0506-0708-090A-0B0C0D0E0F10}",
                       "Deriving DeviceID and SSID from PKEY_EndpointHIDKey ...",
                       "DeviceID = VXTEST\\GRAPH, SSID = SUBSYS_1234ABCD.", "Preset package name = VXAPODATU.VXTEST.GRAPH.zip",
                       "Updating preset .zip archive path ...", "Preset zip file doesn't exist.",
                       "Retrieving endpoint index through PKEY_VXAPO_EndpointIndex ...", "EndpointIndex = 7", "Endpoint index = 7",
                       "DeviceIDAndEndpointIndex = VXTEST\\GRAPH\\7", "Resulting I/O config name = LineOut"}));
}

TEST_CASE_FIXTURE(Graph, "taking the property store away clears what came from it, in order") {
    store.text(kEndpointGuidKey, "{01020304-0506-0708-090A-0B0C0D0E0F10}");
    host->DevicePropertyStore.set(store.ref());
    Texts moves;
    const Moves io(host->IOConfigName, "io", moves), package(host->PresetPackageName, "package", moves);
    const Moves device(host->DeviceID, "device", moves);
    const Moves index(host->EndpointIndex, "index", moves);
    const Moves ssid(host->SSID, "ssid", moves), text(host->EndpointGuidText, "text", moves);
    const Moves guid(host->EndpointGuid, "guid", moves);
    host->DevicePropertyStore.set({});
    CHECK(moves == Texts{"io=", "index=-1", "package=", "device=", "ssid=", "text=", "guid=zero"});
    CHECK(of(host->DeviceIDAndEndpointIndex) == kDevice + "\\7");
}

TEST_CASE_FIXTURE(Graph, "a store without GUID and hardware key is told so, and its device has no id") {
    store.remove(kEndpointHidKey);
    const GraphLog log;
    host->DevicePropertyStore.set(store.ref());
    CHECK(log.inOrder({"PKEY_AudioEndpoint_GUID property is not present.",
                       "Failed to retrieve PKEY_EndpointHIDKey value with error code 0.", "Updating preset .zip archive path ...",
                       "Device ID is empty.", "DeviceIDAndEndpointIndex = 7"}));
    CHECK(host->PresetPackageName.get().empty());
}

TEST_CASE_FIXTURE(Graph, "a hardware key that can't be read is logged with its code") {
    store.failure(kEndpointHidKey, E_ACCESSDENIED);
    const GraphLog log;
    host->DevicePropertyStore.set(store.ref());
    CHECK(log.has("Failed to retrieve PKEY_EndpointHIDKey value with error code -2147024891."));
}

TEST_CASE_FIXTURE(Graph, "a GUID text that is none leaves the GUID zero") {
    store.text(kEndpointGuidKey, "{nonsense}");
    host->DevicePropertyStore.set(store.ref());
    CHECK(of(host->EndpointGuidText) == "{nonsense}");
    CHECK(host->EndpointGuid.get() == GUID{});
}

TEST_CASE_FIXTURE(Graph, "a device with no subsystem has an empty SSID, and its id is the whole cut text") {
    store.text(kEndpointHidKey, "{1}.USB\\VID_1&PID_2\\7&1");
    host->DevicePropertyStore.set(store.ref());
    CHECK(of(host->DeviceID) == "USB\\VID_1&PID_2");
    CHECK(host->SSID.get().empty());
}

TEST_CASE_FIXTURE(Graph, "an id without the leading brace group is used from its first character") {
    store.text(kEndpointHidKey, "VXTEST\\OTHER&SUBSYS_1&REV_1\\5");
    host->DevicePropertyStore.set(store.ref());
    CHECK(of(host->DeviceID) == "VXTEST\\OTHER");
    CHECK(of(host->SSID) == "SUBSYS_1");
}

TEST_CASE_FIXTURE(Graph, "with index -1 and no device id the registry path contains 0") {
    store.remove(kEndpointHidKey);
    store.remove(kEndpointIndexProperty);
    const GraphLog log;
    open();
    CHECK(of(host->APOTypeRegKeyName) == "Software\\Ondrevale\\APO\\0\\EFX");
    CHECK(log.has("Endpoint index hasn't changed."));
    CHECK(log.has("DeviceIDAndEndpointIndex = 0"));
}

TEST_CASE_FIXTURE(Graph, "a device without index stands in the path alone") {
    store.remove(kEndpointIndexProperty);
    open();
    CHECK(of(host->APOTypeRegKeyName) == "Software\\Ondrevale\\APO\\VXTEST\\GRAPH\\EFX");
}
