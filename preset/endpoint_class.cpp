// SPDX-License-Identifier: MIT
#include "preset/endpoint_class.h"

#include <iterator>

#include "platform/guid.h"

namespace vxcomn {
namespace {

constexpr GUID kAudioEndpoint = {0x1DA5D803, 0xD492, 0x4EDD, {0x8C, 0x23, 0xE0, 0xC0, 0xFF, 0xEE, 0x7F, 0x0E}};
constexpr GUID kPrivate = {0x6A6414E7, 0x39E4, 0x491F, {0x8B, 0x8C, 0xC9, 0x02, 0x8A, 0xC7, 0xD6, 0x59}};
constexpr GUID kDriver = {0x3BA0CD54, 0x830F, 0x4551, {0xA6, 0xEB, 0xF3, 0xEA, 0xB6, 0x8E, 0x37, 0x00}};

constexpr const VXWCHAR *kFormFactors[] = {
    VX_TEXT("Network"), VX_TEXT("AnyOutput"), VX_TEXT("LineOut"),     VX_TEXT("Headphones"), VX_TEXT("Microphone"),
    VX_TEXT("Headset"), VX_TEXT("Handset"),   VX_TEXT("Passthrough"), VX_TEXT("SPDIF"),      VX_TEXT("AudioDisplay"),
};
constexpr uint32_t kSpeakersFormFactor = 1;
constexpr uint32_t kHeadphonesFormFactor = 3;

constexpr const VXWCHAR *kUnknownNode = VX_TEXT("KSNODETYPE_UNKNOWN");

// Node types of the system differ in the low half of their first word alone.
constexpr GUID nodeType(uint16_t number) {
    return {0xDFF20000U | number, 0xF70F, 0x11D0, {0xB9, 0x17, 0x00, 0xA0, 0xC9, 0x22, 0x31, 0x96}};
}

struct JackSubType {
    GUID guid;
    const VXWCHAR *name;
};
constexpr JackSubType kJackSubTypes[] = {
    // in the order of their indices
    {nodeType(0x1CE1), VX_TEXT("KSNODETYPE_SPEAKER")},
    {nodeType(0x1CE2), VX_TEXT("KSNODETYPE_HEADPHONES")},
    {nodeType(0x1FE3), VX_TEXT("KSNODETYPE_LINE_CONNECTOR")},
    {nodeType(0x1DE5), VX_TEXT("KSNODETYPE_ECHO_CANCELING_SPEAKERPHONE")},
    {nodeType(0x1CE6), VX_TEXT("KSNODETYPE_COMMUNICATION_SPEAKER")},
    {nodeType(0x1DE1), VX_TEXT("KSNODETYPE_HANDSET")},
    {nodeType(0x1DE2), VX_TEXT("KSNODETYPE_HEADSET")},
};

constexpr const VXWCHAR *kPrivateNames[] = {
    VX_TEXT("KSNODETYPE_OEM_SPEAKER"),
    VX_TEXT("KSNODETYPE_OEM_HEADPHONES"),
    VX_TEXT("KSNODETYPE_OEM_LINE_CONNECTOR"),
};

bool holds(const PropertyAnswer &answer, uint16_t type) noexcept {
    return answer.result >= 0 && answer.type == type;
}

// Whether a switch of the driver is on; `otherwise` where the driver has none. `logged`, if given, is what the line shows instead.
bool driverSwitch(PropertyReader &properties, const PROPERTYKEY &key, bool otherwise, const VXWCHAR *label, const VXWCHAR *keyName,
                  const bool *logged, ReadLog *log) {
    const PropertyAnswer answer = properties.read(key);
    if (!holds(answer, kPropertyUi4)) {
        say(log, VX_TEXT("Couldn't retrieve value of "), keyName, VX_TEXT("\n"));
        return otherwise;
    }
    const bool on = answer.number != 0;
    say(log, label, VX_TEXT(" = "), static_cast<int32_t>(logged != nullptr ? *logged : on), VX_TEXT("\n"));
    return on;
}

// Whether the driver plays a speaker endpoint through headphones.
bool driverSaysHeadphones(PropertyReader &properties, ReadLog *log) {
    say(log, VX_TEXT("Checking for Realtek driver properties ...\n"));
    const bool headphones = driverSwitch(properties, kDriverHeadphoneModeProperty, false, VX_TEXT("IsHeadphonesMode"),
                                         VX_TEXT("PKEY_DRV_Headphone_Mode"), nullptr, log);
    const bool redirect = driverSwitch(properties, kDriverRedirectHeadphoneProperty, false, VX_TEXT("IsRedirectHeadphonesMode"),
                                       VX_TEXT("PKEY_DRV_RedirectHeadphone_Enable"), nullptr, log);
    // Kept: this line shows the redirect switch, not the internal one.
    const bool internal = driverSwitch(properties, kDriverInternalSpeakerProperty, true, VX_TEXT("IsInternalSpeakersMode"),
                                       VX_TEXT("PKEY_DRV_Internal_Speaker_Mode"), &redirect, log);
    if (headphones || redirect) {
        say(log, VX_TEXT("Headphones detected.\n"));
        return true;
    }
    // Kept: internal and external speakers are told apart in the log alone.
    say(log, internal ? VX_TEXT("Internal (built-in) speakers detected.\n") : VX_TEXT("External speakers detected.\n"));
    return false;
}

// The index and name that a jack subtype stands for, or the unknown ones.
const VXWCHAR *nameOfSubType(const WideString &text, uint32_t &index) {
    GUID guid;
    parseGuidText(text, guid);  // all zeros, which no row has, for a text that is none
    for (uint32_t i = 0; i < std::size(kJackSubTypes); ++i) {
        if (kJackSubTypes[i].guid != guid) continue;
        index = i;
        return kJackSubTypes[i].name;
    }
    return kUnknownNode;
}

}  // namespace

const PROPERTYKEY kFormFactorProperty = {kAudioEndpoint, 0};
const PROPERTYKEY kJackSubTypeProperty = {kAudioEndpoint, 8};
const PROPERTYKEY kEndpointIndexProperty = {kPrivate, 0};
const PROPERTYKEY kDriverHeadphoneModeProperty = {kDriver, 4};
const PROPERTYKEY kDriverRedirectHeadphoneProperty = {kDriver, 1};
const PROPERTYKEY kDriverInternalSpeakerProperty = {kDriver, 6};

const VXWCHAR *devicePropsToIOConfig(PropertyReader &properties, ReadLog *log) {
    const VXWCHAR *name = nullptr;
    const PropertyAnswer formFactor = properties.read(kFormFactorProperty);
    if (holds(formFactor, kPropertyUi4)) {
        say(log, VX_TEXT("FormFactor = "), static_cast<int32_t>(formFactor.number), VX_TEXT("\n"));
        name = formFactor.number < std::size(kFormFactors) ? kFormFactors[formFactor.number] : VX_TEXT("Unknown");
        if (formFactor.number == kSpeakersFormFactor && driverSaysHeadphones(properties, log))
            name = kFormFactors[kHeadphonesFormFactor];
    } else {
        say(log, VX_TEXT("Couldn't retrieve FormFactor\n"));
    }
    say(log, VX_TEXT("Resulting IOConfigName = "), name != nullptr ? name : VX_TEXT("(null)"), VX_TEXT("\n"));
    return name;
}

const VXWCHAR *devicePropsToEndpointIndex(PropertyReader &properties, uint32_t &index, ReadLog *log) {
    index = UINT32_MAX;
    const VXWCHAR *name = kUnknownNode;
    const PropertyAnswer own = properties.read(kEndpointIndexProperty);
    if (holds(own, kPropertyUi4)) {
        index = own.number;
        if (index < std::size(kPrivateNames)) name = kPrivateNames[index];
    } else {
        say(log, VX_TEXT("Couldn't access PKEY_VXAPO_EndpointIndex, error code = "), own.result, VX_TEXT("\n"));
        say(log, VX_TEXT("Retrieving endpoint index through PKEY_AudioEndpoint_JackSubType ...\n"));
        const PropertyAnswer jack = properties.read(kJackSubTypeProperty);
        if (!holds(jack, kPropertyText)) {
            // Kept: a property of another type is logged with the code of its successful read.
            say(log, VX_TEXT("Couldn't access PKEY_AudioEndpoint_JackSubType, error code = "), jack.result, VX_TEXT("\n"));
        } else {
            name = nameOfSubType(jack.text, index);
            const bool unknown = name == kUnknownNode;
            say(log, unknown ? VX_TEXT("Unknown PKEY_AudioEndpoint_JackSubType = ") : VX_TEXT("PKEY_AudioEndpoint_JackSubType = "),
                unknown ? jack.text.c_str() : name, VX_TEXT("\n"));
        }
    }
    say(log, VX_TEXT("EndpointIndex = "), static_cast<int32_t>(index), VX_TEXT("\n"));
    say(log, VX_TEXT("JackSubType = "), name, VX_TEXT("\n"));
    return name;
}

}  // namespace vxcomn
