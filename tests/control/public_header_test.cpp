// SPDX-License-Identifier: MIT
//
// The public header: its numbers, which clients compare with, and its view from C.
#include <doctest/doctest.h>

#include "tests/control/control_fixture.h"
#include "tests/control/public_header_in_c.h"

using test::OpenEndpoint;

TEST_CASE("errors, user parameters and properties have the numbers that clients compare with") {
    CHECK(VXAPOCOMAPI_ERROR_NONE == 0);
    CHECK(VXAPOCOMAPI_ERROR_INVALID_APO_TYPE == -2);
    CHECK(VXAPOCOMAPI_ERROR_INVALID_PARAMETER_ID == -3);
    CHECK(VXAPOCOMAPI_ERROR_INVALID_PARAMETER_VALUE == -4);
    CHECK(VXAPOCOMAPI_ERROR_APO_TYPE_NOT_SET == -9);
    CHECK(VXAPOCOMAPI_ERROR_PARAMETER_NOT_SUPPORTED == -10);
    CHECK(VXAPOCOMAPI_ERROR_ENDPOINT_INDEX_NOT_FOUND == -11);
    CHECK(VXAPOCOMAPI_ERROR_ENDPOINT_NOT_AVAILABLE == -15);
    CHECK(VXAPOCOMAPI_ERROR_PROPERTY_NOT_AVAILABLE == -16);
    CHECK(VXAPOCOMAPI_ERROR_WINDOWS_ERRORCODE == -256);

    CHECK(USER_PARAM_ID_POWER_ON == 0);
    CHECK(USER_PARAM_ID_BASS_LEVEL == 1);
    CHECK(USER_PARAM_ID_DETAIL_LEVEL == 2);
    CHECK(USER_PARAM_ID_VOICE_LEVEL == 3);
    CHECK(USER_PARAM_ID_SURROUND_LEVEL == 4);
    CHECK(USER_PARAM_ID_ENABLE_EQ == 5);
    CHECK(USER_PARAM_ID_EQ_BAND1_LEVEL == 6);
    CHECK(USER_PARAM_ID_EQ_BAND10_LEVEL == 15);
    CHECK(USER_PARAM_ID_BYPASS_ALL == 16);
    CHECK(VXAPOCOMAPI_IS_GLOBAL == 0x8000);

    CHECK(VXAPOCOMAPI_EndpointPropID_DeviceID == 0);
    CHECK(VXAPOCOMAPI_EndpointPropID_SSID == 1);
    CHECK(VXAPOCOMAPI_EndpointPropID_FriendlyName == 2);
    CHECK(VXAPOCOMAPI_EndpointPropID_EngineName == 3);
    CHECK(VXAPOCOMAPI_EndpointPropID_EndpointIndex == 4);
    CHECK(VXAPOCOMAPI_EndpointPropID_EndpointState == 5);
    CHECK(VXAPOCOMAPI_EndpointPropID_PresetZipPath == 6);
    CHECK(VXAPOCOMAPI_EndpointPropID_PresetFilePath == 7);
}

TEST_CASE("a C program's calls with a bad handle all fail") {
    uint64_t nothing[16] = {};
    CHECK(controlCallsInC(nullptr) == 0);
    CHECK(controlCallsInC(nothing) == 0);
    CHECK(controlCallsInC(reinterpret_cast<void *>(uintptr_t{1})) == 0);
}

TEST_CASE_FIXTURE(OpenEndpoint, "a C program binds the two functions with C++ names") {
    if (none()) return;
    REQUIRE(VXAPOCOMAPI_SetAPOType(endpoint, "EFX") == 1);
    uint64_t time = 0;
    CHECK(setParameterInC(endpoint, 7, 70, 123, &time) == 2);
    CHECK(time != 0);
    for (const int32_t param : {70, 71}) {
        uint8_t value = 0;
        uint32_t size = 1;
        CHECK(VXAPOCOMAPI_GetUserParameterEx(endpoint, 7, param, 0, &value, &size, nullptr, nullptr) == 1);
        CHECK(value == 123);
    }
}
