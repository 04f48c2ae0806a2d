// SPDX-License-Identifier: MIT
//
// What an endpoint's hardware key tells: the device id that names its package and its keys, and the subsystem id that chooses a
// machine model in the package. Pure functions over text from the system. Any thread; allocates.
#pragma once

#include <cstdint>

#include "platform/text.h"

namespace vxcomn {

struct DeviceIdentity {
    WideString deviceId;
    WideString ssid;  // "SUBSYS_" and its digits; empty if the key names none
};

// Cuts the text of PKEY_EndpointHIDKey, such as "{1}.HDAUDIO\FUNC_01&VEN_1&DEV_2&SUBSYS_12345678&REV_1\5&1a".
DeviceIdentity deviceIdentity(WideString hardwareKey);

// The level of the store's keys that stands for the endpoint: device id and index, whichever of them there are; "0" without both.
WideString deviceIdAndEndpointIndex(const WideString &deviceId, int32_t endpointIndex);

}  // namespace vxcomn
