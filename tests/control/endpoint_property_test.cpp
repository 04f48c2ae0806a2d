// SPDX-License-Identifier: MIT
//
// Properties of open endpoints.
#include <doctest/doctest.h>

#include "preset/endpoint_class.h"
#include "preset/endpoint_properties.h"
#include "tests/control/control_fixture.h"
#include "tests/control/fake_endpoints.h"

using namespace vxcomn;
using test::CallLog;
using test::Client;

namespace {

constexpr PROPERTYKEY kFriendlyName = {{0xA45C254E, 0xDF1C, 0x4EFD, {0x80, 0x20, 0x67, 0xD1, 0x46, 0xA8, 0x50, 0xE0}}, 14};
constexpr PROPERTYKEY kOwn = {{0x6A6414E7, 0x39E4, 0x491F, {0x8B, 0x8C, 0xC9, 0x02, 0x8A, 0xC7, 0xD6, 0x59}}, 77};

struct Properties {
    CallLog log;
    Client client;
    test::FakeEnumerator system;
    ComPtr<IMMDeviceEnumerator> real = std::move(client.context().DeviceEnumerator);
    test::FakeDevice &device = system.add(VX_TEXT("id"));
    VXAPOHandle endpoint = nullptr;
    VARIANT value;

    Properties() {
        client.context().DeviceEnumerator = shareCom<IMMDeviceEnumerator>(&system);
        device.state = DEVICE_STATE_UNPLUGGED;
        device.store.texts[kEndpointHidKey] = VX_TEXT("{1}.VXTEST\\PROPERTY&SUBSYS_1234ABCD&REV_1\\5&1a");
        device.store.texts[kFriendlyName] = VX_TEXT("Loud speakers");
        device.store.numbers[kEndpointIndexProperty] = 3;
        endpoint = VXAPOCOMAPI_GetEndpoint(client.api, VX_TEXT("id"), 0);
        REQUIRE(endpoint != nullptr);
        VariantInit(&value);
        log.restart();
    }
    ~Properties() {
        VariantClear(&value);
        VXAPOCOMAPI_FreeEndpoint(endpoint);
        CHECK(system.held() == 0);
        client.context().DeviceEnumerator = std::move(real);
    }
    int32_t get(uint32_t id, const GUID *guid = nullptr) {
        VariantClear(&value);
        VXAPOCOMAPI_SetLastError(endpoint, -1000);
        return VXAPOCOMAPI_GetEndpointPropertyValue(endpoint, guid, id, &value);
    }
    int32_t error() const { return VXAPOCOMAPI_GetLastError(endpoint); }
    std::string text() const {
        REQUIRE(value.vt == VT_BSTR);
        return toUtf8(WideView(value.bstrVal, SysStringLen(value.bstrVal)));
    }
};

}  // namespace

TEST_CASE_FIXTURE(Properties, "each property that is known by number comes in its type, and its name is logged") {
    test::endpointOf(endpoint).EngineShortName.setSilently(VX_TEXT("VXORLO"));
    test::endpointOf(endpoint).PresetZipPath.setSilently(VX_TEXT("C:\\p.zip"));
    test::endpointOf(endpoint).PresetFilePath.setSilently(VX_TEXT("0/EFX"));
    const std::pair<uint32_t, std::string> texts[] = {
        {VXAPOCOMAPI_EndpointPropID_DeviceID, "VXTEST\\PROPERTY"},  {VXAPOCOMAPI_EndpointPropID_SSID, "SUBSYS_1234ABCD"},
        {VXAPOCOMAPI_EndpointPropID_FriendlyName, "Loud speakers"}, {VXAPOCOMAPI_EndpointPropID_EngineName, "VXORLO"},
        {VXAPOCOMAPI_EndpointPropID_PresetZipPath, "C:\\p.zip"},    {VXAPOCOMAPI_EndpointPropID_PresetFilePath, "0/EFX"}};
    for (const auto &property : texts) {
        CAPTURE(property.first);
        CHECK(get(property.first) == 1);
        CHECK(error() == 0);
        CHECK(text() == property.second);
    }
    const std::pair<uint32_t, int32_t> numbers[] = {{VXAPOCOMAPI_EndpointPropID_EndpointIndex, 3},
                                                    {VXAPOCOMAPI_EndpointPropID_EndpointState, DEVICE_STATE_UNPLUGGED}};
    for (const auto &[id, wanted] : numbers) {
        CHECK(get(id) == 1);
        CHECK(error() == 0);
        CHECK(value.vt == VT_I4);
        CHECK(value.lVal == wanted);
    }
    for (const char *name :
         {"DeviceID", "SSID", "FriendlyName", "EngineName", "EndpointIndex", "EndpointState", "PresetZipPath", "PresetFilePath"}) {
        CHECK(log.count(std::string("property ID = VXAPOCOMAPI_EndpointPropID_") + name) == 1);
    }
    CHECK(log.has("Property GUID is NULL, property ID 7 is from VXAPOCOMAPI_EndpointPropID enum."));
    CHECK(log.has("{ VXAPOCOMAPI_GetEndpointPropertyValue(epHandle = 0x" + test::hexadecimal(endpoint) + ")"));
}

TEST_CASE_FIXTURE(Properties, "a property id of 8 without a GUID returns 1 and sets -16") {
    for (const uint32_t id : {8U, 0x7FFFFFFFU, 0xFFFFFFFFU}) {
        CHECK(get(id) == 1);
        CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
        CHECK(value.vt == VT_EMPTY);
    }
    CHECK(log.count("Property ID is unknown.") == 3);
    CHECK_FALSE(log.has("Error: -16"));
}

TEST_CASE_FIXTURE(Properties, "a friendly name that can't be read or converted returns 1 and sets -16") {
    device.store.failures[kFriendlyName] = E_FAIL;
    CHECK(get(VXAPOCOMAPI_EndpointPropID_FriendlyName) == 1);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(log.has("Failed to retrieve endpoint's friendly name."));
}

TEST_CASE_FIXTURE(Properties, "a state that the device won't tell returns 1 and sets -16") {
    device.stateResult = E_FAIL;
    CHECK(get(VXAPOCOMAPI_EndpointPropID_EndpointState) == 1);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(value.vt == VT_EMPTY);
}

TEST_CASE_FIXTURE(Properties, "a property of the store comes by its key") {
    device.store.numbers[kOwn] = 4000000000U;
    CHECK(get(77, &kOwn.fmtid) == 1);
    CHECK(error() == 0);
    CHECK(value.vt == VT_UI4);
    CHECK(value.ulVal == 4000000000U);
    CHECK(log.has("Received property GUID {6A6414E7-39E4-491F-8B8C-C9028AC7D659} and property ID 77."));
    CHECK(get(14, &kFriendlyName.fmtid) == 1);
    CHECK(text() == "Loud speakers");
}

TEST_CASE_FIXTURE(Properties, "a property of the store that fails returns 0 and sets -16") {
    device.store.failures[kOwn] = E_FAIL;
    CHECK(get(77, &kOwn.fmtid) == 0);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(log.hasInOrder({"Failed to access property with error code " + std::to_string(E_FAIL) + ".", "Error: -16"}));
}

TEST_CASE_FIXTURE(Properties, "a property GUID on a context without a store returns 0 and sets -16") {
    test::endpointOf(endpoint).DevicePropertyStore.setSilently({});
    CHECK(get(77, &kOwn.fmtid) == 0);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(log.hasInOrder({"DevicePropertyStore == NULL.", "Error: -16"}));
}

TEST_CASE_FIXTURE(Properties, "a null output is a property that can't be delivered") {
    CHECK(VXAPOCOMAPI_GetEndpointPropertyValue(endpoint, nullptr, 0, nullptr) == 1);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(VXAPOCOMAPI_GetEndpointPropertyValue(endpoint, &kOwn.fmtid, 77, nullptr) == 0);
    CHECK(error() == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
}
