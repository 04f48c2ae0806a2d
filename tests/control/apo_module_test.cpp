// SPDX-License-Identifier: MIT
//
// The direct line to the effect module, with a stand-in for it.
#include <doctest/doctest.h>

#include <filesystem>

#include "platform/guid.h"
#include "platform/module.h"
#include "tests/control/control_fixture.h"
#include "tests/control/modules/apo_module.h"
#include "tests/support/process.h"

using namespace vxcomn;
using test::ApoCall;
using test::CallLog;
using test::OpenEndpoint;

namespace {

// The stand-in is found and loaded; its calls stay known as long as this lives.
struct ApoModule {
    Module module;
    test::ApoModuleCalls *calls = nullptr;

    ApoModule() {
        const auto folder = std::filesystem::path(test::selfProgram()).parent_path() / "apo_module";
        setModuleDirectory(toWide(folder.string()));
        module = loadModule(kApoModuleName);
        REQUIRE(module);
        calls = reinterpret_cast<test::GetApoModuleCalls>(findExport(module.get(), "VxcomnTestApoCalls"))();
        *calls = {};
    }
    ~ApoModule() { setModuleDirectory(VX_TEXT("")); }
};

struct HostedEndpoint {
    CallLog log;
    ApoModule apo;
    OpenEndpoint open;
    test::ApoModuleCalls &calls = *apo.calls;
};

std::string failureText(const GUID &guid, HRESULT result) {
    return "Failed to initialize VXAPOAPI for endpoint: " + toUtf8(guidText(guid)) + " with error code " + std::to_string(result);
}

}  // namespace

TEST_CASE_FIXTURE(HostedEndpoint, "each slot is opened in the effect module by its kind, and closed before the next") {
    if (open.none()) return;
    CHECK(open.context().ApoModule);
    CHECK(calls.count == 0);
    const std::pair<const char *, int32_t> slots[] = {{"EFX", 3}, {"MFX", 2}, {"SFX", 1}, {"GFX", 2}, {"LFX", 1}};
    int32_t seen = 0;
    for (const auto &slot : slots) {
        CAPTURE(slot.first);
        REQUIRE(VXAPOCOMAPI_SetAPOType(open.endpoint, slot.first) == 1);
        if (seen > 0) {
            CHECK(calls.calls[seen].isFree);
            CHECK(calls.calls[seen].handle == calls.calls[seen - 1].handle);
            ++seen;
        }
        REQUIRE(calls.count == seen + 1);
        const ApoCall &call = calls.calls[seen++];
        CHECK_FALSE(call.isFree);
        CHECK(call.kind == slot.second);
        CHECK(call.guid == open.context().EndpointGuid.get());
        CHECK(std::string(call.guidText) == toUtf8(open.context().EndpointGuidText.get()));
        CHECK(call.properties == open.context().DevicePropertyStore.get().get());
        CHECK(call.hardwareOnly == 1);
        CHECK(open.context().ApoHandle == call.handle);
    }
    CHECK(VXAPOCOMAPI_FreeEndpoint(open.endpoint) == 1);
    REQUIRE(calls.count == seen + 1);
    CHECK(calls.calls[seen].isFree);
    CHECK(calls.calls[seen].handle == calls.calls[seen - 1].handle);
}

TEST_CASE_FIXTURE(HostedEndpoint, "the slot that is set already is not opened again") {
    if (open.none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(open.endpoint, "EFX") == 1);
    REQUIRE(VXAPOCOMAPI_SetAPOType(open.endpoint, "EFX") == 1);
    CHECK(calls.count == 1);
    CHECK(VXAPOCOMAPI_SetAPOType(open.endpoint, "efx") == 0);
    CHECK(calls.count == 1);
}

TEST_CASE_FIXTURE(HostedEndpoint, "an effect module that declines is logged, and the slot is chosen") {
    if (open.none()) return;
    calls.result = E_ACCESSDENIED;
    CHECK(VXAPOCOMAPI_SetAPOType(open.endpoint, "EFX") == 1);
    CHECK(log.has(failureText(open.context().EndpointGuid.get(), E_ACCESSDENIED)));
    CHECK(open.context().ApoHandle == nullptr);
    CHECK(VXAPOCOMAPI_GetUserParameter(open.endpoint, USER_PARAM_ID_POWER_ON) == 1.0F);
    CHECK(VXAPOCOMAPI_FreeEndpoint(open.endpoint) == 1);
    CHECK(calls.count == 1);
}

TEST_CASE_FIXTURE(HostedEndpoint, "a number that is no slot's is an invalid argument") {
    if (open.none()) return;
    open.context().APOType.set(6);
    CHECK(log.hasInOrder({"APOType contains unknown value 6", failureText(open.context().EndpointGuid.get(), E_INVALIDARG)}));
    CHECK(calls.count == 0);
}

TEST_CASE_FIXTURE(HostedEndpoint, "an endpoint opened by its index leaves the effect module alone") {
    if (open.none()) return;
    VXAPOHandle const handle = VXAPOCOMAPI_Initialize(7);
    REQUIRE(handle != nullptr);
    CHECK_FALSE(test::endpointOf(handle).ApoModule);
    CHECK(VXAPOCOMAPI_SetAPOType(handle, "EFX") == 1);
    CHECK(calls.count == 0);
    CHECK(VXAPOCOMAPI_Free(handle) == 1);
}

TEST_CASE_FIXTURE(HostedEndpoint, "a free endpoint gives its reference to the effect module back") {
    if (open.none()) return;
    apo.module.reset();
    CHECK(open.context().ApoModule);
    CHECK(VXAPOCOMAPI_FreeEndpoint(open.endpoint) == 1);
}
