// SPDX-License-Identifier: MIT
#include "preset/store_names.h"

#include <doctest/doctest.h>

using namespace vxcomn;

namespace {

const ParameterKeyParts kParts = {VX_TEXT("C"), VX_TEXT("engine"), VX_TEXT("io"), VX_TEXT("user"), VX_TEXT("content")};

}  // namespace

TEST_CASE("the configuration key is made of the root, the device and the effect type") {
    CHECK(configurationKey(VX_TEXT("HDAUDIO\\FUNC_01\\3"), VX_TEXT("MFX")) ==
          VX_TEXT("Software\\Ondrevale\\APO\\HDAUDIO\\FUNC_01\\3\\MFX"));
    CHECK(configurationKey(VX_TEXT("0"), VX_TEXT("LFX")) == VX_TEXT("Software\\Ondrevale\\APO\\0\\LFX"));
}

TEST_CASE("the parameter key has the engine level from version 2.0.7.74 on, and not below") {
    CHECK(parameterKey(kParts, 0x000200000007004A) == VX_TEXT("C\\engine\\io\\user\\content\\Parameters"));
    CHECK(parameterKey(kParts, 0x0002000100000000) == VX_TEXT("C\\engine\\io\\user\\content\\Parameters"));
    CHECK(parameterKey(kParts, 0x0002000000070049) == VX_TEXT("C\\io\\user\\content\\Parameters"));
    CHECK(parameterKey(kParts, 0) == VX_TEXT("C\\io\\user\\content\\Parameters"));
}

TEST_CASE("a value is named by its parameter, and a private one by its client behind a comma") {
    CHECK(parameterValueName(-18) == VX_TEXT("-18"));
    CHECK(parameterValueName(256) == VX_TEXT("256"));
    CHECK(parameterValueName(INT32_MIN) == VX_TEXT("-2147483648"));
    CHECK(parameterValueName(7, VX_TEXT("{A}")) == VX_TEXT("7,{A}"));
}

TEST_CASE("each effect type of the three has its mutex, and all others share one") {
    CHECK(slotMutexName(VX_TEXT("EFX")) == VX_TEXT("{CD147EE7-2140-4445-B39A-473D43BE970D}"));
    CHECK(slotMutexName(VX_TEXT("MFX")) == VX_TEXT("{36B0FFEC-2F71-433D-A3FF-55E149CF7F3A}"));
    CHECK(slotMutexName(VX_TEXT("SFX")) == VX_TEXT("{651B4609-6CC8-4137-B61B-193FE66D2A1C}"));
    for (const VXWCHAR *other : {VX_TEXT("GFX"), VX_TEXT("LFX"), VX_TEXT("efx"), VX_TEXT("")}) {
        CHECK(slotMutexName(other) == VX_TEXT("{76957D8F-A424-4E75-9984-8F053A875C95}"));
    }
}

TEST_CASE("the mutex of a running effect has underscores for the key's backslashes") {
    CHECK(syncMutexName(VX_TEXT("Software\\Ondrevale\\APO\\0\\EFX")) == VX_TEXT("Global\\Software_Ondrevale_APO_0_EFX"));
}
