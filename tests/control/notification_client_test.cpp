// SPDX-License-Identifier: MIT
//
// What the client hears of the system's endpoints, and which of it moves the tag.
#include "control/notification_client.h"

#include <doctest/doctest.h>

#include "platform/endpoints.h"
#include "tests/control/control_fixture.h"

using namespace vxcomn;
using test::CallLog;
using test::Client;

namespace {

uint64_t reportedTag(const Client &client) {
    uint32_t count = 0;
    VXWCHAR **ids = nullptr;
    uint64_t tag = 0;
    REQUIRE(VXAPOCOMAPI_GetEndpointIDs(client.api, &count, &ids, 0, 0xF, &tag) == 1);
    VXAPOCOMAPI_FreeEndpointIDs(client.api, count, ids);
    return tag;
}

}  // namespace

TEST_CASE("OnDeviceAdded alone doesn't change the tag that GetEndpointIDs reports") {
    const Client client;
    CHECK(reportedTag(client) == 1);
    auto &listener = *client.context().NotificationClient.get();
    CHECK(listener.OnDeviceAdded(VX_TEXT("id")) == S_OK);
    CHECK(reportedTag(client) == 1);
}

TEST_CASE("only a change of state moves the tag") {
    const Client client;
    auto &listener = *client.context().NotificationClient.get();
    CHECK(listener.OnDeviceRemoved(VX_TEXT("id")) == S_OK);
    CHECK(listener.OnDefaultDeviceChanged(eRender, eConsole, VX_TEXT("id")) == S_OK);
    CHECK(listener.OnPropertyValueChanged(VX_TEXT("id"), kEndpointGuidKey) == S_OK);
    CHECK(reportedTag(client) == 1);
    CHECK(listener.OnDeviceStateChanged(VX_TEXT("id"), DEVICE_STATE_ACTIVE) == S_OK);
    CHECK(reportedTag(client) == 2);
}

TEST_CASE("the notification client answers for itself and for IUnknown alone") {
    const Client client;
    auto &listener = *client.context().NotificationClient.get();
    void *object = &object;
    CHECK(listener.QueryInterface(kIidPropertyStore, &object) == E_NOINTERFACE);
    CHECK(object == nullptr);
    const ULONG before = listener.AddRef();
    for (const GUID &iid : {kIidUnknown, kIidNotificationClient}) {
        CHECK(listener.QueryInterface(iid, &object) == S_OK);
        CHECK(object == static_cast<IMMNotificationClient *>(&listener));
        CHECK(listener.Release() == before);
    }
    CHECK(listener.Release() == before - 1);
}

TEST_CASE("each notification traces its name, and a property its key") {
    CallLog log;
    const Client client;
    auto &listener = *client.context().NotificationClient.get();
    void *object = nullptr;
    log.restart();
    listener.AddRef();
    listener.Release();
    listener.QueryInterface(kIidPropertyStore, &object);
    listener.OnDeviceStateChanged(VX_TEXT("id"), 1);
    listener.OnDeviceAdded(VX_TEXT("id"));
    listener.OnDeviceRemoved(VX_TEXT("id"));
    listener.OnDefaultDeviceChanged(eRender, eConsole, VX_TEXT("id"));
    listener.OnPropertyValueChanged(VX_TEXT("id"), kEndpointGuidKey);
    for (const char *name : {"AddRef", "Release", "QueryInterface", "OnDeviceStateChanged", "OnDeviceAdded", "OnDeviceRemoved",
                             "OnDefaultDeviceChanged", "OnPropertyValueChanged"}) {
        CAPTURE(name);
        CHECK(log.count(std::string("{ CMMNotificationClient::") + name + "()") == 1);
        CHECK(log.count(std::string("} CMMNotificationClient::") + name + "()") == 1);
    }
    CHECK(log.has("Key = {{1DA5D803-D492-4EDD-8C23-E0C0FFEE7F0E}, 4}"));
}

TEST_CASE("a notification client that the system holds on to outlives its owner in silence") {
    CallLog log;
    VXAPOCOMAPI_APIContext::CMMNotificationClient *kept = nullptr;
    {
        const Client client;
        kept = client.context().NotificationClient.get();
        kept->AddRef();
    }
    log.restart();
    CHECK(kept->OnDeviceStateChanged(VX_TEXT("id"), 1) == S_OK);
    CHECK(kept->Release() == 0);
    CHECK(log.texts().empty());
}
