// SPDX-License-Identifier: MIT
//
// What kind of endpoint a property store describes: the I/O configuration name and the endpoint index that select a configuration.
// Pure functions over anything that looks a property up; re-entrant. The texts returned are static.
#pragma once

#include <array>
#include <cstdint>

#include "platform/text.h"
#include "preset/read_log.h"

namespace vxcomn {

// A GUID as its sixteen bytes in the order in which its text shows them.
using GuidBytes = std::array<uint8_t, 16>;

struct PropertyName {
    GuidBytes format;
    uint32_t id;
};

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
    virtual PropertyAnswer read(const PropertyName &name) = 0;
};

extern const PropertyName kFormFactorProperty;               // PKEY_AudioEndpoint_FormFactor
extern const PropertyName kJackSubTypeProperty;              // PKEY_AudioEndpoint_JackSubType
extern const PropertyName kEndpointIndexProperty;            // PKEY_VXAPO_EndpointIndex
extern const PropertyName kDriverHeadphoneModeProperty;      // PKEY_DRV_Headphone_Mode
extern const PropertyName kDriverRedirectHeadphoneProperty;  // PKEY_DRV_RedirectHeadphone_Enable
extern const PropertyName kDriverInternalSpeakerProperty;    // PKEY_DRV_Internal_Speaker_Mode

// Reads the usual text {xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx}. False, and `guid` is all zeros, if the text is anything else.
bool parseGuid(WideView text, GuidBytes &guid) noexcept;

// The name of the I/O configuration; null if the form factor cannot be read.
const VXWCHAR *devicePropsToIOConfig(PropertyReader &properties, ReadLog *log);

// The name of the node type, and the endpoint index, which is -1 (all bits set) for one that is not known.
const VXWCHAR *devicePropsToEndpointIndex(PropertyReader &properties, uint32_t &index, ReadLog *log);

}  // namespace vxcomn
