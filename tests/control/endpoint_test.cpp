// SPDX-License-Identifier: MIT
//
// Opening and closing endpoints.
#include <doctest/doctest.h>

#include <bit>
#include <set>
#include <thread>

#include "control/notification_client.h"
#include "platform/endpoints.h"
#include "platform/guid.h"
#include "platform/module.h"
#include "preset/parameter_store.h"
#include "tests/control/control_fixture.h"
#include "tests/control/fake_endpoints.h"

using namespace vxcomn;
using test::CallLog;
using test::Client;
using test::OpenEndpoint;

namespace {

// A client over fake endpoints.
struct FakeSystem {
    CallLog log;
    Client client;
    test::FakeEnumerator system;
    ComPtr<IMMDeviceEnumerator> real = std::move(client.context().DeviceEnumerator);

    FakeSystem() { client.context().DeviceEnumerator = shareCom<IMMDeviceEnumerator>(&system); }
    ~FakeSystem() {
        for (VXAPOCOMAPI_EndpointContext *endpoint : std::set(client.context().EndpointHandles)) VXAPOCOMAPI_FreeEndpoint(endpoint);
        CHECK(system.held() == 0);
        client.context().DeviceEnumerator = std::move(real);
    }
    VXAPOHandle open() { return VXAPOCOMAPI_GetEndpoint(client.api, VX_TEXT("id"), 0); }
};

}  // namespace

TEST_CASE_FIXTURE(OpenEndpoint, "GetEndpoint passing hardwareOnly 0 still opens in hardware-only mode and says so") {
    if (none()) return;
    const CallLog log;
    const Client other;
    VXAPOHandle const handle = VXAPOCOMAPI_GetEndpoint(other.api, machine.endpointId().c_str(), 0);
    REQUIRE(handle != nullptr);
    CHECK(test::endpointOf(handle).HardwareOnly == 1);
    CHECK(test::endpointOf(handle).HostsAPO == 1);
    CHECK(log.hasInOrder({"{ VXAPOCOMAPI_GetEndpointEx(apiHandle = 0x" + test::hexadecimal(other.api) + ")",
                          "hardwareOnly = 1 (always hardware-only mode!)",
                          "{ _VXAPOCOMAPI_GetEndpoint(apiHandle = 0x" + test::hexadecimal(other.api) + ", instanceId = 0x0)",
                          "endpointID = " + toUtf8(machine.endpointId()) + ", hardwareOnly = 1, hostAPO = 1",
                          "{ VXAPOCOMAPI_EndpointContext::VXAPOCOMAPI_EndpointContext()()",
                          "{ VXAPOCOMAPI_EndpointContext::Initialize()", "Hardware only mode.", "Hosts APO.", "Done.",
                          "Endpoint Handle = 0x" + test::hexadecimal(handle, true)}));
    CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 1);
}

TEST_CASE("InitializeEx with a null GUID fails with -15, readable by a null handle") {
    const CallLog log;
    VXAPOCOMAPI_SetLastError(nullptr, 0);
    CHECK(VXAPOCOMAPI_InitializeEx("an id", nullptr, 3) == nullptr);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
    CHECK(log.hasInOrder({"{ VXAPOCOMAPI_InitializeEx()", "endpointId = an id, endpointGuid = NULL, hardwareOnly = 3",
                          "hardwareOnly = 1 (always hardware-only mode!)", "Hardware-only mode.",
                          "endpointID = {0.0.0.00000000}., hardwareOnly = 1, hostAPO = 1", "Error: -15"}));
}

TEST_CASE_FIXTURE(OpenEndpoint, "InitializeEx opens a render endpoint by its GUID, and Free ends both") {
    if (none()) return;
    CallLog log;
    const std::string id = toUtf8(machine.endpointId());
    const std::string guid = id.substr(id.find(".{") + 1);
    VXAPOHandle const handle = VXAPOCOMAPI_InitializeEx("ignored", guid.c_str(), 0);
    REQUIRE(handle != nullptr);
    CHECK(log.has("endpointId = ignored, endpointGuid = " + guid + ", hardwareOnly = 0"));
    const WideString mutex = test::endpointOf(handle).ApiContext->SetterMutexName;
    CHECK(NamedMutex::exists(mutex));
    CHECK(VXAPOCOMAPI_Free(handle) == 1);
    CHECK_FALSE(NamedMutex::exists(mutex));
}

TEST_CASE("a GUID beyond the buffer for ids is no endpoint's") {
    const std::string longGuid(600, 'x');
    CHECK(VXAPOCOMAPI_InitializeEx(nullptr, longGuid.c_str(), 0) == nullptr);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
}

TEST_CASE_FIXTURE(OpenEndpoint, "Free of a bad endpoint handle leaves the API context alive") {
    if (none()) return;
    CHECK(VXAPOCOMAPI_FreeEndpoint(endpoint) == 1);
    CHECK(VXAPOCOMAPI_Free(endpoint) == 0);
    CHECK(VXAPOCOMAPI_Free(client.api) == 0);
    CHECK(NamedMutex::exists(client.context().SetterMutexName));
    VXAPOCOMAPI_SetLastError(client.api, -3);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == -3);
}

TEST_CASE_FIXTURE(OpenEndpoint, "Free of the last endpoint frees the API context") {
    if (none()) return;
    VXAPOHandle const handle = VXAPOCOMAPI_Initialize(7);
    REQUIRE(handle != nullptr);
    VXAPOHandle const api = test::endpointOf(handle).ApiContext;
    CHECK(VXAPOCOMAPI_Free(handle) == 1);
    CHECK(VXAPOCOMAPI_FreeAPI(api) == 0);
    CHECK(VXAPOCOMAPI_Free(handle) == 0);
}

TEST_CASE_FIXTURE(OpenEndpoint, "Initialize opens the endpoint of an index without a line to the effect module") {
    if (none()) return;
    const CallLog log;
    VXAPOHandle const handle = VXAPOCOMAPI_Initialize(7);
    REQUIRE(handle != nullptr);
    CHECK(test::endpointOf(handle).EndpointID == machine.endpointId());
    CHECK(test::endpointOf(handle).HostsAPO == 0);
    CHECK(test::endpointOf(handle).HardwareOnly == 0);
    CHECK(log.hasInOrder({"{ VXAPOCOMAPI_Initialize()", "endpointIndex = 7",
                          "endpointID = " + toUtf8(machine.endpointId()) + ", hardwareOnly = 0, hostAPO = 0"}));
    CHECK_FALSE(log.has("Hosts APO."));
    CHECK(VXAPOCOMAPI_Free(handle) == 1);
}

TEST_CASE("Initialize with an index that no endpoint has ends with -15") {
    CHECK(VXAPOCOMAPI_Initialize(123456) == nullptr);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
}

TEST_CASE_FIXTURE(OpenEndpoint, "the GUID out is the instance's identity, whose mutex tells that it lives") {
    if (none()) return;
    GUID identity = {};
    VXAPOHandle const handle = VXAPOCOMAPI_GetEndpointEx(client.api, machine.endpointId().c_str(), 1, &identity);
    REQUIRE(handle != nullptr);
    CHECK(identity == test::endpointOf(handle).InstanceGuid);
    CHECK(NamedMutex::exists(VX_TEXT("Global\\") + guidText(identity)));
    CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 1);
    CHECK_FALSE(NamedMutex::exists(VX_TEXT("Global\\") + guidText(identity)));
}

TEST_CASE_FIXTURE(FakeSystem, "the GUID out is written even if there is no such endpoint") {
    GUID identity = {};
    CHECK(VXAPOCOMAPI_GetEndpointEx(client.api, VX_TEXT("nobody"), 1, &identity) == nullptr);
    CHECK(identity != GUID{});
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
    CHECK(log.hasInOrder({"Failed to get device for endpoint ID = nobody. Error code = " + std::to_string(kNotFound),
                          "~VXAPOCOMAPI_EndpointContext::VXAPOCOMAPI_EndpointContext", "Error: -15"}));
    CHECK(client.context().EndpointHandles.empty());
    CHECK(VXAPOCOMAPI_GetEndpoint(client.api, nullptr, 0) == nullptr);
}

TEST_CASE_FIXTURE(FakeSystem, "a fresh context has the defaults of its tables") {
    system.add(VX_TEXT("id"));
    VXAPOHandle const handle = open();
    REQUIRE(handle != nullptr);
    const VXAPOCOMAPI_EndpointContext &context = test::endpointOf(handle);
    CHECK(context.HandleSignature == 0x46D3C1DF);
    CHECK(context.TypeID == 1);
    CHECK(context.ApiContext == &client.context());
    CHECK(client.context().EndpointHandles.count(&test::endpointOf(handle)) == 1);
    CHECK(toUtf8(context.EndpointID) == "id");
    for (const LevelRange *range : {&context.VoiceRange, &context.SurroundRange, &context.DetailRange}) {
        CHECK(range->minimum == -48.0F);
        CHECK(range->maximum == 12.0F);
    }
    CHECK(context.BassRange.minimum == -54.0F);
    CHECK(context.BassRange.maximum == 6.0F);
    CHECK(context.EqRange.minimum == -18.0F);
    CHECK(context.EqRange.maximum == 18.0F);
    constexpr std::array<float, 10> frequencies = {31, 62, 125, 250, 500, 1000, 2000, 4000, 8000, 1600};
    CHECK(context.EqBandFrequency == frequencies);
    for (size_t band = 0; band < 10; ++band) {
        CHECK(context.EqBandType[band] == 1);
        CHECK(std::bit_cast<uint32_t>(context.EqBandQ[band]) == 0x3FB851EC);
    }
    CHECK(context.APOType.get() == 0);
    CHECK(waitForOne(context.ConfigIdle, 0) == WaitOutcome::signalled);
    CHECK(waitForOne(context.ParamIdle, 0) == WaitOutcome::signalled);
    for (const Event *event :
         {&context.ConfigShutdown, &context.ConfigCancel, &context.ParamShutdown, &context.ParamCancel, &context.AudioEvent}) {
        CHECK(waitForOne(*event, 0) == WaitOutcome::timedOut);
    }
}

TEST_CASE_FIXTURE(FakeSystem, "a property store that can't be written is opened for reading") {
    test::FakeDevice &device = system.add(VX_TEXT("id"));
    device.writeResult = E_ACCESSDENIED;
    VXAPOHandle const handle = open();
    REQUIRE(handle != nullptr);
    CHECK(device.accesses == std::vector<DWORD>{STGM_READWRITE, STGM_READ});
    CHECK(test::endpointOf(handle).DevicePropertyStore.get().get() == &device.store);
    CHECK(log.has("Failed to open device property store with STGM_READWRITE flag. Error code = " + std::to_string(E_ACCESSDENIED)));
    CHECK_FALSE(
        log.has("Failed to open device property store with STGM_READ flag. Error code = " + std::to_string(E_ACCESSDENIED)));
}

TEST_CASE_FIXTURE(FakeSystem, "without any property store the context goes on, with no preset path") {
    test::FakeDevice &device = system.add(VX_TEXT("id"));
    device.writeResult = E_ACCESSDENIED;
    device.readResult = E_FAIL;
    VXAPOHandle const handle = open();
    REQUIRE(handle != nullptr);
    CHECK_FALSE(test::endpointOf(handle).DevicePropertyStore.get());
    CHECK(log.has("Failed to open device property store with STGM_READ flag. Error code = " + std::to_string(E_FAIL)));
    CHECK(VXAPOCOMAPI_SetAPOType(handle, "EFX") == 1);
    CHECK(test::endpointOf(handle).PresetZipPath.get().empty());
    GUID guid = {};
    VARIANT value;
    CHECK(VXAPOCOMAPI_GetEndpointPropertyValue(handle, &guid, 1, &value) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(handle) == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
    CHECK(VXAPOCOMAPI_GetEndpointPropertyValue(handle, nullptr, VXAPOCOMAPI_EndpointPropID_FriendlyName, &value) == 1);
    CHECK(VXAPOCOMAPI_GetLastError(handle) == VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE);
}

TEST_CASE_FIXTURE(FakeSystem, "without the effect module opening succeeds and says so") {
    setModuleDirectory(VX_TEXT(""));
    system.add(VX_TEXT("id"));
    VXAPOHandle const handle = open();
    REQUIRE(handle != nullptr);
    CHECK_FALSE(test::endpointOf(handle).ApoModule);
    const bool isBound = test::endpointOf(handle).ApoInitialize != nullptr;
    CHECK_FALSE(isBound);
    CHECK(log.has("Failed to load VXAPO64U.dll to directly communicate with hardware"));
    CHECK(VXAPOCOMAPI_SetAPOType(handle, "EFX") == 1);
}

TEST_CASE_FIXTURE(FakeSystem, "FreeAPI frees endpoints that are left, in the order of their addresses") {
    system.add(VX_TEXT("id"));
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    REQUIRE(api != nullptr);
    const ComPtr<IMMDeviceEnumerator> own =
        std::exchange(test::apiOf(api).DeviceEnumerator, shareCom<IMMDeviceEnumerator>(&system));
    std::vector<VXAPOHandle> handles;
    for (int i = 0; i < 3; ++i) handles.push_back(VXAPOCOMAPI_GetEndpoint(api, VX_TEXT("id"), 0));
    std::sort(handles.begin(), handles.end());
    own->UnregisterEndpointNotificationCallback(test::apiOf(api).NotificationClient.get());
    log.restart();
    CHECK(VXAPOCOMAPI_FreeAPI(api) == 1);
    CHECK(log.hasInOrder({"Found orphan endpoint handles, disposing ...",
                          "{ VXAPOCOMAPI_FreeEndpoint(epHandle = 0x" + test::hexadecimal(handles[0]) + ")",
                          "{ VXAPOCOMAPI_FreeEndpoint(epHandle = 0x" + test::hexadecimal(handles[1]) + ")",
                          "{ VXAPOCOMAPI_FreeEndpoint(epHandle = 0x" + test::hexadecimal(handles[2]) + ")", "Done.",
                          "~VXAPOCOMAPI_APIContext"}));
    for (VXAPOHandle handle : handles) CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 0);
}

TEST_CASE_FIXTURE(FakeSystem, "the last error of an endpoint handle is its client's, and freeing it stores 0") {
    system.add(VX_TEXT("id"));
    VXAPOHandle const handle = open();
    VXAPOCOMAPI_SetLastError(handle, -10);
    CHECK(VXAPOCOMAPI_GetLastError(handle) == -10);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == -10);
    CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 1);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == 0);
    VXAPOCOMAPI_SetLastError(nullptr, -77);
    CHECK(VXAPOCOMAPI_GetLastError(handle) == -77);
    CHECK(VXAPOCOMAPI_FreeEndpoint(handle) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -77);
}

TEST_CASE_FIXTURE(OpenEndpoint, "freeing an endpoint ends a thread that is inside a receive call") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    std::atomic<int> left{0};
    std::thread config([&] {
        const VXWCHAR *name = nullptr;
        const void *data = nullptr;
        uint32_t size = 0;
        CHECK(VXAPOCOMAPI_ReceiveConfigChange(endpoint, &name, &data, &size, kForever, 0) == 0);
        ++left;
    });
    std::thread param([&] {
        const void *blob = nullptr;
        uint32_t size = 0, count = 0;
        while (VXAPOCOMAPI_ReceiveParamChange(endpoint, &blob, &size, &count, kForever, 0) != 0) {
        }
        ++left;
    });
    while (waitForOne(context().ConfigIdle, 0) == WaitOutcome::signalled) std::this_thread::yield();
    while (waitForOne(context().ParamIdle, 0) == WaitOutcome::signalled) std::this_thread::yield();
    CHECK(VXAPOCOMAPI_FreeEndpoint(endpoint) == 1);
    config.join();
    param.join();
    CHECK(left == 2);
}
