// SPDX-License-Identifier: MIT
//
// What kind of endpoint a property store describes: the I/O configuration name and the endpoint index that select a configuration.
// Pure functions over anything that looks a property up; re-entrant. The texts returned are static.
#pragma once

#include <cstdint>

#include "platform/text.h"
#include "preset/read_log.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

// The variant types that are told apart, numbered as VARTYPE.
inline constexpr uint16_t kPropertyUi4 = 19;
inline constexpr uint16_t kPropertyText = 31;

struct PropertyAnswer {
    int32_t result = 0;  // HRESULT of the read; negative is a failure
    uint16_t type = 0;   // VARTYPE; 0 where there is no such property
    uint32_t number = 0;
    WideString text;
};

class PropertyReader {
  public:
    virtual ~PropertyReader() = default;
    virtual PropertyAnswer read(const PROPERTYKEY &key) = 0;
};

extern const PROPERTYKEY kFormFactorProperty;               // PKEY_AudioEndpoint_FormFactor
extern const PROPERTYKEY kJackSubTypeProperty;              // PKEY_AudioEndpoint_JackSubType
extern const PROPERTYKEY kEndpointIndexProperty;            // PKEY_VXAPO_EndpointIndex
extern const PROPERTYKEY kDriverHeadphoneModeProperty;      // PKEY_DRV_Headphone_Mode
extern const PROPERTYKEY kDriverRedirectHeadphoneProperty;  // PKEY_DRV_RedirectHeadphone_Enable
extern const PROPERTYKEY kDriverInternalSpeakerProperty;    // PKEY_DRV_Internal_Speaker_Mode

// The name of the I/O configuration; null if the form factor cannot be read.
const VXWCHAR *devicePropsToIOConfig(PropertyReader &properties, ReadLog *log);

// The name of the node type, and the endpoint index, which is -1 (all bits set) for one that is not known.
const VXWCHAR *devicePropsToEndpointIndex(PropertyReader &properties, uint32_t &index, ReadLog *log);

}  // namespace vxcomn
