// SPDX-License-Identifier: MIT
//
// The two exports that classify an endpoint, over property stores: one that a test fills, and an endpoint's own.
#include "preset/endpoint_properties.h"

#include <doctest/doctest.h>

#include "VXDSPAPI.h"
#include "diag/debug_trace.h"
#include "tests/preset/mock_property_store.h"
#include "tests/support/debug_capture.h"

using namespace vxcomn;
using namespace vxcomn::testing;

namespace {

std::string ioConfigOf(MockPropertyStore &store, CTraceFuncCallTarget *trace = nullptr) {
    const VXWCHAR *const name = VXDSPAPI_DevicePropsToIOConfig(trace, &store);
    return name == nullptr ? "null" : toUtf8(name);
}

struct Index {
    explicit Index(MockPropertyStore &store, CTraceFuncCallTarget *trace = nullptr)
        : name(toUtf8(VXDSPAPI_DevicePropsToEndpointIndex(trace, &store, &value))) {}
    uint32_t value = 12345;
    std::string name;
};

bool askedFor(const MockPropertyStore &store, const PROPERTYKEY &key) {
    for (const PROPERTYKEY &asked : store.asked) {
        if (asked.fmtid == key.fmtid && asked.pid == key.pid) return true;
    }
    return false;
}

struct Logger : CTraceFuncCallTarget {
    explicit Logger(bool on = true) {
        setTraceTag(*this, VX_TEXT("CLASS"));
        Enabled = on ? 1 : 0;
    }
};

bool endsWith(const std::vector<std::string> &lines, const std::string &text) {
    return !lines.empty() && lines.back().size() >= text.size() &&
           lines.back().compare(lines.back().size() - text.size(), text.size(), text) == 0;
}

}  // namespace

TEST_CASE("a store with form factor 1 and no driver properties is any output, and each step is logged") {
    MockPropertyStore store;
    Logger trace;
    const DebugCapture capture;
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 1), &trace) == "AnyOutput");
    REQUIRE(capture.lines().size() == 7);
    CHECK(endsWith({capture.lines()[2]}, "Couldn't retrieve value of PKEY_DRV_Headphone_Mode"));
    CHECK(endsWith({capture.lines()[5]}, "Internal (built-in) speakers detected."));
    CHECK(endsWith(capture.lines(), "Resulting IOConfigName = AnyOutput"));
}

TEST_CASE("a store with form factor 1 and redirected headphones is headphones") {
    MockPropertyStore store;
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 1).number(kDriverRedirectHeadphoneProperty, 1)) == "Headphones");
}

TEST_CASE("a store with form factor 3 is headphones after one read") {
    MockPropertyStore store;
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 3)) == "Headphones");
    CHECK(store.reads == 1);
}

TEST_CASE("a store with form factor 10 is unknown, with a two-byte one it has no name") {
    MockPropertyStore store;
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 10)) == "Unknown");
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 3, VT_UI2)) == "null");
    CHECK(ioConfigOf(store.failure(kFormFactorProperty, E_ACCESSDENIED)) == "null");
}

TEST_CASE("the product's own index wins, and the jack is not looked at") {
    MockPropertyStore store;
    const Index index(store.number(kEndpointIndexProperty, 7).text(kJackSubTypeProperty, "{DFF21CE1-F70F-11D0-B917-00A0C9223196}"));
    CHECK(index.value == 7);
    CHECK(index.name == "KSNODETYPE_UNKNOWN");
    CHECK_FALSE(askedFor(store, kJackSubTypeProperty));
}

TEST_CASE("a store with neither index nor jack has index -1 and no node type") {
    MockPropertyStore store;
    Logger trace;
    const DebugCapture capture;
    const Index index(store, &trace);
    CHECK(index.value == 0xFFFFFFFF);
    CHECK(index.name == "KSNODETYPE_UNKNOWN");
    CHECK(endsWith({capture.lines()[2]}, "Couldn't access PKEY_AudioEndpoint_JackSubType, error code = 0"));
    CHECK(endsWith(capture.lines(), "JackSubType = KSNODETYPE_UNKNOWN"));
}

TEST_CASE("the line connector's jack has index 2, in capitals or not") {
    MockPropertyStore store;
    CHECK(Index(store.text(kJackSubTypeProperty, "{DFF21FE3-F70F-11D0-B917-00A0C9223196}")).value == 2);
    CHECK(Index(store.text(kJackSubTypeProperty, "{dff21fe3-f70f-11d0-b917-00a0c9223196}")).name == "KSNODETYPE_LINE_CONNECTOR");
}

TEST_CASE("a failed read of the index is logged with its code") {
    MockPropertyStore store;
    Logger trace;
    const DebugCapture capture;
    const Index index(store.failure(kEndpointIndexProperty, E_ACCESSDENIED), &trace);
    CHECK(endsWith({capture.lines().at(0)}, "Couldn't access PKEY_VXAPO_EndpointIndex, error code = -2147024891"));
}

TEST_CASE("a jack whose text is null, or no GUID, is unknown") {
    MockPropertyStore store;
    CHECK(Index(store.nullText(kJackSubTypeProperty)).value == 0xFFFFFFFF);
    CHECK(Index(store.text(kJackSubTypeProperty, "{DFF21CE1-F70F-11D0-B917-00A0C9223196")).value == 0xFFFFFFFF);
    CHECK(Index(store.text(kJackSubTypeProperty, "%s%n")).name == "KSNODETYPE_UNKNOWN");
}

TEST_CASE("without a store, or without a place for the index, nothing breaks") {
    CHECK(VXDSPAPI_DevicePropsToIOConfig(nullptr, nullptr) == nullptr);
    uint32_t index = 0;
    CHECK(toUtf8(VXDSPAPI_DevicePropsToEndpointIndex(nullptr, nullptr, &index)) == "KSNODETYPE_UNKNOWN");
    CHECK(index == 0xFFFFFFFF);
    MockPropertyStore store;
    CHECK(toUtf8(VXDSPAPI_DevicePropsToEndpointIndex(nullptr, &store.number(kEndpointIndexProperty, 1), nullptr)) ==
          "KSNODETYPE_OEM_HEADPHONES");
}

TEST_CASE("a logger that is switched off gets no line") {
    MockPropertyStore store;
    Logger trace(false);
    const DebugCapture capture;
    CHECK(ioConfigOf(store.number(kFormFactorProperty, 1), &trace) == "AnyOutput");
    CHECK(Index(store, &trace).value == 0xFFFFFFFF);
    CHECK(capture.lines().empty());
}

TEST_CASE("the names are the library's: the same ones at each call") {
    MockPropertyStore store;
    store.number(kFormFactorProperty, 3);
    const VXWCHAR *const name = VXDSPAPI_DevicePropsToIOConfig(nullptr, &store);
    CHECK(VXDSPAPI_DevicePropsToIOConfig(nullptr, &store) == name);
    CHECK(store.references == 1);
}

TEST_CASE("a reader hands out what the store has, by type") {
    MockPropertyStore store;
    store.number(kFormFactorProperty, 3).text(kEndpointHidKey, "text").number(kJackSubTypeProperty, 1, VT_UI2);
    StorePropertyReader reader(&store);
    CHECK(reader.read(kFormFactorProperty).number == 3);
    CHECK(toUtf8(reader.read(kEndpointHidKey).text) == "text");
    CHECK(reader.read(kJackSubTypeProperty).type == VT_UI2);
    CHECK(reader.read(kEndpointIndexProperty).type == VT_EMPTY);
}
