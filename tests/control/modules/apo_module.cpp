// SPDX-License-Identifier: MIT
//
// A stand-in for the effect module VXAPO64U.dll: remembers its calls and does nothing else.
#include "tests/control/modules/apo_module.h"

namespace {

test::ApoModuleCalls recorded;
int objects[sizeof recorded.calls / sizeof recorded.calls[0]];

test::ApoCall &nextCall() {
    constexpr int32_t last = sizeof recorded.calls / sizeof recorded.calls[0] - 1;
    test::ApoCall &call = recorded.calls[recorded.count < last ? recorded.count : last];
    ++recorded.count;
    call = {};
    return call;
}

}  // namespace

extern "C" {

VXCOMN_EXPORT HRESULT VXAPOAPI_Initialize(int32_t kind, void **apoHandle, const VXWCHAR *guidText, const GUID *guid,
                                          IPropertyStore *properties, int32_t hardwareOnly) {
    test::ApoCall &call = nextCall();
    call.kind = kind;
    call.guid = *guid;
    for (int i = 0; i < 63 && guidText[i] != 0; ++i) call.guidText[i] = static_cast<char>(guidText[i]);
    call.properties = properties;
    call.hardwareOnly = hardwareOnly;
    if (recorded.result >= 0) *apoHandle = call.handle = &objects[&call - recorded.calls];
    return recorded.result;
}

VXCOMN_EXPORT void VXAPOAPI_Free(void *apoHandle) {
    test::ApoCall &call = nextCall();
    call.isFree = true;
    call.handle = apoHandle;
}

VXCOMN_EXPORT test::ApoModuleCalls *VxcomnTestApoCalls() {
    return &recorded;
}
}
