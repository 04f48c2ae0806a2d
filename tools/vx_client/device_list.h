// SPDX-License-Identifier: MIT
//
// The machine's audio endpoints as the system lists them, with what the library makes of their properties. Looks only: nothing is
// opened for writing and no effect slot is chosen. What the properties hold is hostile until checked.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/text.h"

namespace vx::client {

struct Device {
    vxcomn::WideString id;
    std::string idText;  // the same as UTF-8
    std::string name;    // of the endpoint, fit to be printed
    bool isCapture = false;
    uint32_t state = 0;  // DEVICE_STATE
    bool hasProperties = false;

    vxcomn::WideString deviceId;
    vxcomn::WideString subsystemId;
    int32_t index = -1;                  // -1: none
    vxcomn::WideString storeName;        // the level of the store's keys that stands for the endpoint
    vxcomn::WideString derivedIoConfig;  // empty: its form factor cannot be read
    bool effectsOff = false;             // the system's own switch for this endpoint
};

// All of them, whatever their state; render before capture, in the system's order. Fails if the system lists none at all.
std::vector<Device> listDevices();

// "active", "disabled", "not present", "unplugged", or the number.
std::string stateText(uint32_t state);

// Text from the system for a terminal: control characters become '?'.
std::string printable(std::string text);

}  // namespace vx::client
