// SPDX-License-Identifier: MIT
//
// The silent stream that keeps an endpoint's effects loaded.
#include "tests/control/open_slot.h"

using namespace vxcomn;
using namespace vxcomn::testing;

TEST_CASE_FIXTURE(OpenSlot, "deactivating without a prior activation is a success") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    CHECK(VXAPOCOMAPI_DeactivateEndpoint(handle()) == 1);
    CHECK(error() == 0);
}

TEST_CASE_FIXTURE(NoSlot, "an activation keeps a started stream, needs no slot, and ends with the deactivation") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    const auto lines = linesOf([&] { CHECK(VXAPOCOMAPI_ActivateEndpoint(handle()) == 1); });
    CHECK(error() == 0);
    CHECK(std::any_of(lines.begin(), lines.end(), [](const std::string &line) {
        return line.rfind("Audio format: Number of channels = ", 0) == 0 && line.find(", Sample rate = ") != std::string::npos &&
               line.find(", Sample resolution = ") != std::string::npos;
    }));
    const ComRef<IAudioClient> stream = context().AudioClient.get();
    REQUIRE(stream);
    CHECK(stream->Start() == AUDCLNT_E_NOT_STOPPED);
    CHECK(VXAPOCOMAPI_DeactivateEndpoint(handle()) == 1);
    CHECK_FALSE(context().AudioClient.get());
    CHECK(VXAPOCOMAPI_DeactivateEndpoint(handle()) == 1);
}

TEST_CASE_FIXTURE(OpenSlot, "both are traced with the handle, inside and out") {
    const auto lines = linesOf([&] {
        VXAPOCOMAPI_ActivateEndpoint(handle());
        VXAPOCOMAPI_DeactivateEndpoint(handle());
    });
    for (const char *name : {"ActivateEndpoint", "DeactivateEndpoint"}) {
        CHECK(std::any_of(lines.begin(), lines.end(), [&](const std::string &line) {
            return line.rfind(std::string("{ VXAPOCOMAPI_") + name + "(apoComHandle = 0x", 0) == 0;
        }));
        CHECK(contains(lines, std::string("{ VXAPOCOMAPI_EndpointContext::") + name + "()"));
    }
}

TEST_CASE_FIXTURE(OpenSlot, "a stream runs the property's subscribers when it comes, and not when it goes") {
    ChangeCount changes(context().AudioClient);
    CHECK(VXAPOCOMAPI_ActivateEndpoint(handle()) == 1);
    CHECK(changes.count == 1);
    CHECK(VXAPOCOMAPI_DeactivateEndpoint(handle()) == 1);
    CHECK(changes.count == 1);
}

TEST_CASE_FIXTURE(OpenSlot, "a later activation replaces the stream") {
    CHECK(VXAPOCOMAPI_ActivateEndpoint(handle()) == 1);
    const ComRef<IAudioClient> first = context().AudioClient.get();
    CHECK(VXAPOCOMAPI_ActivateEndpoint(handle()) == 1);
    CHECK_FALSE(context().AudioClient.get() == first);
}

TEST_CASE_FIXTURE(OpenSlot, "without a device an activation fails without a code") {
    context().Device.setSilently({});
    CHECK(VXAPOCOMAPI_ActivateEndpoint(handle()) == 0);
    CHECK(error() == 0);
    CHECK_FALSE(context().AudioClient.get());
}

TEST_CASE_FIXTURE(OpenSlot, "bad handles activate nothing") {
    VXAPOCOMAPI_SetLastError(handle(), -2);
    int something = 0;
    for (VXAPOHandle bad : {static_cast<VXAPOHandle>(nullptr), static_cast<VXAPOHandle>(&something), client->api}) {
        CHECK(VXAPOCOMAPI_ActivateEndpoint(bad) == 0);
        CHECK(VXAPOCOMAPI_DeactivateEndpoint(bad) == 0);
    }
    CHECK(error() == -2);
}
