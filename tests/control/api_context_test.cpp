// SPDX-License-Identifier: MIT
//
// API contexts, handles and last errors.
#include <doctest/doctest.h>

#include <array>
#include <thread>

#include "control/last_error.h"
#include "control/notification_client.h"
#include "platform/endpoints.h"
#include "platform/error_text.h"
#include "platform/guid.h"
#include "preset/parameter_store.h"
#include "tests/control/control_fixture.h"
#include "tests/control/fake_endpoints.h"

using namespace vxcomn;
using test::CallLog;
using test::Client;

namespace {

struct LastErrorsCleared {
    LastErrorsCleared() { VXAPOCOMAPI_SetLastError(nullptr, 0); }
};

}  // namespace

TEST_CASE_FIXTURE(LastErrorsCleared, "the last error of a null handle after a failed InitializeEx is -15") {
    CHECK(VXAPOCOMAPI_InitializeEx("id", "{00000000-1111-2222-3333-444444444444}", 0) == nullptr);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE);
}

TEST_CASE_FIXTURE(LastErrorsCleared, "freeing an API handle twice fails and leaves the process's last error") {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    REQUIRE(api != nullptr);
    CHECK(VXAPOCOMAPI_FreeAPI(api) == 1);
    VXAPOCOMAPI_SetLastError(nullptr, -77);
    CHECK(VXAPOCOMAPI_FreeAPI(api) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -77);
}

TEST_CASE_FIXTURE(LastErrorsCleared, "setting the last error of a handle that isn't valid changes the process's") {
    const Client client;
    int nothing = 0;
    VXAPOCOMAPI_SetLastError(&nothing, -42);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -42);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == 0);
}

TEST_CASE_FIXTURE(LastErrorsCleared, "a bad handle's last error is the process's") {
    const Client client;
    VXAPOCOMAPI_SetLastError(client.api, -4);
    int nothing = 0;
    CHECK(VXAPOCOMAPI_GetLastError(&nothing) == -4);
    CHECK(VXAPOCOMAPI_GetLastError(reinterpret_cast<void *>(uintptr_t{8})) == -4);
    CHECK(VXAPOCOMAPI_GetWindowsLastError(&nothing) == VXAPOCOMAPI_GetWindowsLastError(nullptr));
}

TEST_CASE_FIXTURE(LastErrorsCleared, "two clients have setter mutexes and last errors of their own, and share the process's") {
    const Client one, other;
    CHECK(one.context().SetterMutexName != other.context().SetterMutexName);
    CHECK(toUtf8(one.context().SetterMutexName) == "Global\\" + toUtf8(guidText(one.context().ClientGuid)));
    CHECK(NamedMutex::exists(one.context().SetterMutexName));
    CHECK(NamedMutex::exists(other.context().SetterMutexName));

    failWith(one.context(), one.context(), -3);
    CHECK(VXAPOCOMAPI_GetLastError(one.api) == -3);
    CHECK(VXAPOCOMAPI_GetLastError(other.api) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -3);
    failWith(other.context(), other.context(), -10);
    CHECK(VXAPOCOMAPI_GetLastError(one.api) == -3);
    CHECK(VXAPOCOMAPI_GetLastError(other.api) == -10);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -10);
}

TEST_CASE("a client's setter mutex goes with it, whichever thread frees it") {
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    REQUIRE(api != nullptr);
    const WideString name = test::apiOf(api).SetterMutexName;
    CHECK(NamedMutex::exists(name));
    int32_t freed = 0;
    std::thread([&] { freed = VXAPOCOMAPI_FreeAPI(api); }).join();
    CHECK(freed == 1);
    CHECK_FALSE(NamedMutex::exists(name));
}

TEST_CASE("the signature and the kind stand in a live API context") {
    const Client client;
    CHECK(client.context().HandleSignature == 0x46D3C1DF);
    CHECK(client.context().TypeID == 0);
    CHECK(client.context().Initialized);
    CHECK(client.context().TraceTarget == &client.context());
}

TEST_CASE("a second Initialize of the same context says so and succeeds") {
    const CallLog log;
    const Client client;
    CHECK_FALSE(log.has("Already initialized."));
    CHECK(client.context().Initialize());
    CHECK(log.has("Already initialized."));
}

TEST_CASE("a client's beginning is logged step by step") {
    const CallLog log;
    const Client client;
    const auto &version = client.context().ModuleVersionBytes;
    const std::string bytes = std::to_string(version[0]) + ", " + std::to_string(version[1]) + ", " + std::to_string(version[2]) +
                              ", " + std::to_string(version[3]);
    CHECK(log.hasInOrder(
        {"{ VXAPOCOMAPI_APIContext::VXAPOCOMAPI_APIContext()", "{ CMMNotificationClient::CMMNotificationClient()",
         "} CMMNotificationClient::CMMNotificationClient()", "} VXAPOCOMAPI_APIContext::VXAPOCOMAPI_APIContext()",
         "{ VXAPOCOMAPI_InitializeAPI()", "{ VXAPOCOMAPI_APIContext::Initialize()", "Retrieving module version ...",
         "APO module version = { " + bytes + " }.", "Done.", "Registering endpoint notification callback ...",
         "Received device enumerator. Installing notification client ...", "Done.", "} VXAPOCOMAPI_APIContext::Initialize()",
         "Handle = 0x" + test::hexadecimal(client.api, true), "} VXAPOCOMAPI_InitializeAPI()"}));
}

TEST_CASE("a client's end is logged step by step") {
    CallLog log;
    std::string handle;
    {
        const Client client;
        handle = test::hexadecimal(client.api);
        log.restart();
    }
    CHECK(
        log.hasInOrder({"{ VXAPOCOMAPI_FreeAPI(apiHandle = 0x" + handle + ")", "~VXAPOCOMAPI_APIContext",
                        "{ VXAPOCOMAPI_APIContext::Free()", "Unregistering endpoint notification callback ...", "Done.",
                        "} VXAPOCOMAPI_APIContext::Free()", "{ CMMNotificationClient::Release()",
                        "{ CMMNotificationClient::~CMMNotificationClient()", "} CMMNotificationClient::~CMMNotificationClient()"}));
    CHECK_FALSE(log.has("Found orphan endpoint handles, disposing ..."));
}

TEST_CASE("without the switch nothing is logged") {
    vxcomn::testing::DebugCapture capture;
    {
        const Client client;
        CHECK(client.context().Enabled == 0);
    }
    CHECK(capture.lines().empty());
}

TEST_CASE("lines of two clients bear numbers of their own") {
    const CallLog log;
    const Client one, other;
    CHECK(one.context().InstanceId != other.context().InstanceId);
}

TEST_CASE("a context that could not be initialised says that it is freed already") {
    const CallLog log;
    { VXAPOCOMAPI_APIContext context; }
    CHECK(log.hasInOrder({"~VXAPOCOMAPI_APIContext", "{ VXAPOCOMAPI_APIContext::Free()", "Already freed."}));
}

TEST_CASE("an enumerator that won't unregister is let go of all the same") {
    CallLog log;
    test::FakeEnumerator fake;
    fake.unregisterResult = E_FAIL;
    {
        VXAPOCOMAPI_APIContext context;
        context.Initialized = true;
        context.DeviceEnumerator = shareCom<IMMDeviceEnumerator>(&fake);
    }
    CHECK(fake.references == 0);
    CHECK(log.has("Failed to unregister endpoint notification callback with error code " + std::to_string(E_FAIL) + "."));
}

TEST_CASE("what a client set as setter is taken back when it ends, and what fails is logged") {
    CallLog log;
    const WideString there = VX_TEXT("Software\\Ondrevale\\VxcomnTestSetter"),
                     gone = VX_TEXT("Software\\Ondrevale\\VxcomnTestGone");
    const WideString text = VX_TEXT("x");
    REQUIRE(SetRegString(there, VX_TEXT("Mine"), &text) == status::ok);
    REQUIRE(SetRegString(there, VX_TEXT("Others"), &text) == status::ok);
    {
        const Client client;
        client.context().noteSetterValue(there, VX_TEXT("Mine"));
        client.context().noteSetterValue(there, VX_TEXT("Mine"));
        client.context().noteSetterValue(there, VX_TEXT("Vanished"));
        client.context().noteSetterValue(gone, VX_TEXT("Any"));
        CHECK(client.context().SetterValues[there].size() == 2);
    }
    WideString read;
    CHECK(GetRegString(there, VX_TEXT("Mine"), read) == status::fileNotFound);
    CHECK(GetRegString(there, VX_TEXT("Others"), read) == status::ok);
    CHECK(log.hasInOrder({"Failed to open 'HKLM\\" + toUtf8(gone) + "' registry key with error code 2.",
                          "Failed to delete 'HKLM\\" + toUtf8(there) + "\\Vanished' registry value with error code 2."}));
    DeleteRegKeyTree(there, false);
}

TEST_CASE("a Windows error is stored in all four places and logged in words") {
    const CallLog log;
    const Client client;
    CHECK(failWithWindowsError(client.context(), status::accessDenied) == 0);
    CHECK(VXAPOCOMAPI_GetLastError(client.api) == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
    CHECK(VXAPOCOMAPI_GetLastError(nullptr) == VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE);
    CHECK(VXAPOCOMAPI_GetWindowsLastError(client.api) == status::accessDenied);
    CHECK(VXAPOCOMAPI_GetWindowsLastError(nullptr) == status::accessDenied);
    const std::vector<std::string> texts = log.texts();
    CHECK(std::any_of(texts.begin(), texts.end(), [](const std::string &line) {
        return line.rfind("Error: -256. Windows error: (5) ", 0) == 0 && line.size() > 32;
    }));
    CHECK_FALSE(errorText(status::fileNotFound).empty());
    CHECK(errorText(0xDEADBEEF).empty());
}

TEST_CASE("wild pointers are refused by every function that takes a handle") {
    const Client client;
    std::array<uint8_t, 64> block = {};
    std::memcpy(block.data(), &kHandleSignature, sizeof kHandleSignature);
    VARIANT value;
    uint32_t count = 7;
    VXWCHAR **ids = nullptr;
    for (void *wild : {static_cast<void *>(nullptr), static_cast<void *>(block.data()), reinterpret_cast<void *>(uintptr_t{1}),
                       reinterpret_cast<void *>(~uintptr_t{0}), client.api}) {
        VXAPOCOMAPI_SetLastError(nullptr, -99);
        if (wild != client.api) {
            CHECK(VXAPOCOMAPI_FreeAPI(wild) == 0);
            CHECK(VXAPOCOMAPI_GetEndpointIDs(wild, &count, &ids, 0, 0xF, nullptr) == 0);
            CHECK(VXAPOCOMAPI_FreeEndpointIDs(wild, 0, nullptr) == 0);
            CHECK(VXAPOCOMAPI_GetEndpoint(wild, VX_TEXT("x"), 0) == nullptr);
            CHECK(VXAPOCOMAPI_GetEndpointEx(wild, VX_TEXT("x"), 0, nullptr) == nullptr);
            CHECK(_VXAPOCOMAPI_GetEndpoint(wild, VX_TEXT("x"), 0, 0, nullptr) == nullptr);
        }
        CHECK(VXAPOCOMAPI_FreeEndpoint(wild) == 0);
        CHECK(VXAPOCOMAPI_Free(wild) == 0);
        CHECK(VXAPOCOMAPI_SetAPOType(wild, "EFX") == 0);
        CHECK(VXAPOCOMAPI_GetEndpointPropertyValue(wild, nullptr, 0, &value) == 0);
        CHECK(VXAPOCOMAPI_GetLastError(nullptr) == -99);
        CHECK(VXAPOCOMAPI_GetLastError(client.api) == 0);
    }
    CHECK(count == 7);
}

TEST_CASE("clients begin and end on many threads at once") {
    std::array<std::thread, 4> threads;
    std::atomic<int> wrong{0};
    for (std::thread &thread : threads) {
        thread = std::thread([&] {
            for (int round = 0; round < 8; ++round) {
                VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
                if (api == nullptr || VXAPOCOMAPI_GetLastError(api) != 0) ++wrong;
                VXAPOCOMAPI_SetLastError(api, round);
                if (VXAPOCOMAPI_GetLastError(api) != round) ++wrong;
                if (VXAPOCOMAPI_FreeAPI(api) != 1 || VXAPOCOMAPI_FreeAPI(api) != 0) ++wrong;
            }
        });
    }
    for (std::thread &thread : threads) thread.join();
    CHECK(wrong == 0);
}
