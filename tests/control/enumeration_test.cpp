// SPDX-License-Identifier: MIT
//
// Listing endpoints, over fake ones, so that any of them can fail on either platform.
#include "control/enumeration.h"

#include <doctest/doctest.h>

#include "preset/endpoint_class.h"
#include "tests/control/control_fixture.h"
#include "tests/control/fake_endpoints.h"

using namespace vxcomn;
using test::CallLog;
using test::Client;
using test::FakeDevice;

namespace {

constexpr PROPERTYKEY kInfoLine = {{0x83DA6326, 0x97A6, 0x4088, {0x94, 0x53, 0xA1, 0x92, 0x3F, 0x57, 0x3B, 0x29}}, 3};

// A client whose system has the endpoints that a test gives it.
struct Listing {
    CallLog log;
    Client client;
    test::FakeEnumerator system;
    ComPtr<IMMDeviceEnumerator> real = std::move(client.context().DeviceEnumerator);
    uint32_t count = 99;
    VXWCHAR **ids = reinterpret_cast<VXWCHAR **>(uintptr_t{16});
    uint64_t tag = 0;

    Listing() {
        client.context().DeviceEnumerator = shareCom<IMMDeviceEnumerator>(&system);
        VXAPOCOMAPI_SetLastError(client.api, 0);
        log.restart();
    }
    ~Listing() {
        CHECK(system.held() == 0);
        client.context().DeviceEnumerator = std::move(real);
        CHECK(system.references == 0);
    }

    FakeDevice &add(const std::string &name, const std::string &line) {
        FakeDevice &device = system.add(toWide(name));
        device.store.texts[kInfoLine] = toWide(line);
        return device;
    }
    int32_t list(int32_t capture = 0, uint32_t mask = 0xF) {
        return VXAPOCOMAPI_GetEndpointIDs(client.api, &count, &ids, capture, mask, &tag);
    }
    std::vector<std::string> taken() {
        std::vector<std::string> names;
        for (uint32_t i = 0; i < count; ++i) names.push_back(toUtf8(ids[i]));
        CHECK(VXAPOCOMAPI_FreeEndpointIDs(client.api, count, ids) == 1);
        return names;
    }
};

using Names = std::vector<std::string>;

}  // namespace

TEST_CASE_FIXTURE(Listing, "a second call with the tag of the first gives a null list and a count of 0") {
    add("one", "kvusbaudio.sysfx");
    REQUIRE(list() == 1);
    CHECK(taken() == Names{"one"});
    CHECK(tag == 1);
    log.restart();
    CHECK(list() == 1);
    CHECK(ids == nullptr);
    CHECK(count == 0);
    CHECK(log.texts().empty());

    tag = 0;
    REQUIRE(list() == 1);
    CHECK(taken() == Names{"one"});
}

TEST_CASE_FIXTURE(Listing, "without a tag every call gives the list") {
    add("one", "kvusbaudio.sysfx");
    for (int round = 0; round < 2; ++round) {
        REQUIRE(VXAPOCOMAPI_GetEndpointIDs(client.api, &count, &ids, 0, 0xF, nullptr) == 1);
        CHECK(taken() == Names{"one"});
    }
    CHECK_FALSE(log.has("Received tag 1 doesn't match the current one 1. Return new endpoint IDs list."));
}

TEST_CASE_FIXTURE(Listing, "an endpoint whose line holds only the second package isn't listed, one in upper case of the first is") {
    add("second", "x kvusb2audio.sysfx");
    add("first", "USB\\KVUSBAUDIO.SYSFX,wdma_usb.inf");
    REQUIRE(list() == 1);
    CHECK(taken() == Names{"first"});
    CHECK(log.has("PKEY_AudioEndpoint_InfoLine = x kvusb2audio.sysfx (isKVUSBAudio = false, isKVUSB2Audio = true)."));
    CHECK(
        log.has("PKEY_AudioEndpoint_InfoLine = usb\\kvusbaudio.sysfx,wdma_usb.inf (isKVUSBAudio = true, isKVUSB2Audio = false)."));
}

TEST_CASE_FIXTURE(Listing, "other packages of the system's put no endpoint on the list") {
    for (const char *line : {"usb\\", "wdma_usb.inf", "usbaudio2.inf"}) add(line, line);
    REQUIRE(list() == 1);
    CHECK(ids != nullptr);
    CHECK(taken().empty());
}

TEST_CASE_FIXTURE(Listing, "an endpoint without a marker that stands last leaves the call successful") {
    add("served", "kvusbaudio.sysfx");
    add("other", "something else");
    REQUIRE(list() == 1);
    CHECK(taken() == Names{"served"});
}

TEST_CASE_FIXTURE(Listing, "no endpoints are a success with an array") {
    REQUIRE(list() == 1);
    CHECK(ids != nullptr);
    CHECK(count == 0);
    taken();
}

TEST_CASE_FIXTURE(Listing, "the list grows with the fifth endpoint, and on") {
    Names names;
    for (int i = 0; i < 23; ++i) {
        names.push_back("endpoint " + std::to_string(i));
        add(names.back(), "kvusbaudio.sysfx");
    }
    REQUIRE(list() == 1);
    CHECK(taken() == names);
}

TEST_CASE_FIXTURE(Listing, "an endpoint that can't be read is left out, unless it is the last one") {
    FakeDevice &lost = add("lost", "kvusbaudio.sysfx");
    add("served", "kvusbaudio.sysfx");
    SUBCASE("item") {
        lost.itemResult = E_FAIL;
    }
    SUBCASE("store") {
        lost.readResult = E_ACCESSDENIED;
    }
    SUBCASE("id") {
        lost.idResult = E_FAIL;
    }
    SUBCASE("line") {
        lost.store.failures[kInfoLine] = E_FAIL;
        REQUIRE(list() == 1);
        CHECK(taken() == Names{"served"});
        CHECK(log.has("Failed to retrieve PKEY_AudioEndpoint_InfoLine for endpoint #0 with error code " + std::to_string(E_FAIL) +
                      "."));
        tag = 0;
    }
    REQUIRE(list() == 1);
    CHECK(taken() == Names{"served"});

    std::swap(system.devices[0].id, system.devices[1].id);
    std::swap(system.devices[0].itemResult, system.devices[1].itemResult);
    std::swap(system.devices[0].readResult, system.devices[1].readResult);
    std::swap(system.devices[0].idResult, system.devices[1].idResult);
    std::swap(system.devices[0].store.failures, system.devices[1].store.failures);
    VXAPOCOMAPI_SetLastError(client.api, -55);
    const uint64_t before = tag = 0;
    CHECK(list() == 0);
    CHECK(ids == nullptr);
    CHECK(count == 0);
    CHECK(tag == before);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == -55);
}

TEST_CASE_FIXTURE(Listing, "a line that is no text is logged and its endpoint left out") {
    FakeDevice &device = system.add(VX_TEXT("number"));
    device.store.numbers[kInfoLine] = 5;
    REQUIRE(list() == 1);
    CHECK(taken().empty());
    CHECK(log.has("Invalid format of PKEY_AudioEndpoint_InfoLine data. Must be single-line string."));
    CHECK(log.has("PKEY_AudioEndpoint_InfoLine =  (isKVUSBAudio = false, isKVUSB2Audio = false)."));
}

TEST_CASE_FIXTURE(Listing, "a listing that fails as a whole gives nothing and leaves the errors") {
    add("one", "kvusbaudio.sysfx");
    SUBCASE("enumeration") {
        system.enumerateResult = E_FAIL;
    }
    SUBCASE("count") {
        system.countResult = E_FAIL;
    }
    VXAPOCOMAPI_SetLastError(client.api, -55);
    CHECK(list() == 0);
    CHECK(ids == nullptr);
    CHECK(count == 0);
    CHECK(tag == 0);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == -55);
}

TEST_CASE_FIXTURE(Listing, "flow and state mask reach the system as they are") {
    REQUIRE(list(0, 9) == 1);
    taken();
    CHECK(system.askedFlow == eRender);
    CHECK(system.askedMask == 9);
    tag = 0;
    REQUIRE(list(-3, 0xFFFFFFFF) == 1);
    taken();
    CHECK(system.askedFlow == eCapture);
    CHECK(system.askedMask == 0xFFFFFFFF);
}

TEST_CASE_FIXTURE(Listing, "without an enumerator the listing fails with -15, but the tag still counts") {
    client.context().DeviceEnumerator.reset();
    CHECK(list() == 0);
    CHECK(count == 99);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
    CHECK(log.hasInOrder({"{ VXAPOCOMAPI_GetEndpointIDs(apiHandle = 0x" + test::hexadecimal(client.api) + ")",
                          "Received tag 0 doesn't match the current one 1. Return new endpoint IDs list.",
                          "DeviceEnumerator == NULL.", "Error: -15"}));
    tag = 1;
    CHECK(list() == 1);
    CHECK(ids == nullptr);
}

TEST_CASE_FIXTURE(Listing, "null outputs list nothing") {
    add("one", "kvusbaudio.sysfx");
    CHECK(VXAPOCOMAPI_GetEndpointIDs(client.api, nullptr, &ids, 0, 0xF, nullptr) == 0);
    CHECK(VXAPOCOMAPI_GetEndpointIDs(client.api, &count, nullptr, 0, 0xF, nullptr) == 0);
    CHECK(VXAPOCOMAPI_FreeEndpointIDs(client.api, 3, nullptr) == 1);
}

TEST_CASE_FIXTURE(Listing, "a product index finds its endpoint, also among several") {
    add("none", "");
    for (uint32_t index = 1; index < 4; ++index)
        add("endpoint " + std::to_string(index), "").store.numbers[kEndpointIndexProperty] = index;
    WideString id;
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == S_OK);
    CHECK(toUtf8(id) == "endpoint 2");
    CHECK(system.askedFlow == eRender);
    CHECK(system.askedMask == 9);
    CHECK(log.hasInOrder({"{ EndpointIndexToEndpointID(EndpointIndex = 2)", "Found matching endpoint ID = endpoint 2.",
                          "Failed to find matching endpoint ID."}));
}

TEST_CASE_FIXTURE(Listing, "a search without a match gives what the last call came to") {
    add("one", "").store.numbers[kEndpointIndexProperty] = 1;
    FakeDevice &last = add("two", "");
    WideString id = VX_TEXT("untouched");
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == S_OK);
    last.readResult = E_ACCESSDENIED;
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == E_ACCESSDENIED);
    last.itemResult = E_FAIL;
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == E_FAIL);
    CHECK(toUtf8(id) == "untouched");
    system.enumerateResult = E_OUTOFMEMORY;
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == E_OUTOFMEMORY);
    client.context().DeviceEnumerator.reset();
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == E_FAIL);
    CHECK(log.has("DeviceEnumerator = NULL."));
}

TEST_CASE_FIXTURE(Listing, "an endpoint that won't tell its id is passed over") {
    FakeDevice &mute = add("mute", "");
    mute.store.numbers[kEndpointIndexProperty] = 2;
    mute.idResult = E_FAIL;
    add("speaking", "").store.numbers[kEndpointIndexProperty] = 2;
    WideString id;
    CHECK(EndpointIndexToEndpointID(client.context(), 2, id) == S_OK);
    CHECK(toUtf8(id) == "speaking");
    CHECK(log.has("IMMDevice::GetId() failed with error = 0x80004005."));
}
