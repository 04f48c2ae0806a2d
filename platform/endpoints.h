// SPDX-License-Identifier: MIT
//
// Audio endpoints: the system's device enumerator on Windows; elsewhere one over the registry, where endpoints lie as Windows lays
// them out, with a notification thread of its own and an audio client that keeps the rules of the real one without any sound.
// Control threads; notifications come on a thread of the system's, or the enumerator's.
#pragma once

#include "platform/com_ptr.h"

namespace vxcomn {

inline constexpr GUID kIidUnknown = {0x00000000, 0x0000, 0x0000, {0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x46}};
inline constexpr GUID kIidDeviceEnumerator = {0xA95664D2, 0x9614, 0x4F35, {0xA7, 0x46, 0xDE, 0x8D, 0xB6, 0x36, 0x17, 0xE6}};
inline constexpr GUID kIidDeviceCollection = {0x0BD7A1BE, 0x7A1A, 0x44DB, {0x83, 0x97, 0xCC, 0x53, 0x92, 0x38, 0x7B, 0x5E}};
inline constexpr GUID kIidDevice = {0xD666063F, 0x1587, 0x4E43, {0x81, 0xF1, 0xB9, 0x48, 0xE8, 0x07, 0x36, 0x3F}};
inline constexpr GUID kIidNotificationClient = {0x7991EEC9, 0x7E89, 0x4D85, {0x83, 0x90, 0x6C, 0x70, 0x3C, 0xEC, 0x60, 0xC0}};
inline constexpr GUID kIidPropertyStore = {0x886D8EEB, 0x8CF2, 0x4446, {0x8D, 0x02, 0xCD, 0xBA, 0x1D, 0xBD, 0xCF, 0x99}};
inline constexpr GUID kIidAudioClient = {0x1CB9AD4C, 0xDBFA, 0x4C32, {0xB1, 0x78, 0xC2, 0xF5, 0x68, 0xA7, 0x03, 0xB2}};

// PKEY_AudioEndpoint_GUID
inline constexpr PROPERTYKEY kEndpointGuidKey = {{0x1DA5D803, 0xD492, 0x4EDD, {0x8C, 0x23, 0xE0, 0xC0, 0xFF, 0xEE, 0x7F, 0x0E}}, 4};
// PKEY_AudioEngine_DeviceFormat
inline constexpr PROPERTYKEY kDeviceFormatKey = {{0xF19F064D, 0x082C, 0x4E27, {0xBC, 0x73, 0x68, 0x82, 0xA1, 0xBB, 0x8E, 0x4C}}, 0};

// HRESULT_FROM_WIN32(ERROR_NOT_FOUND)
inline constexpr HRESULT kNotFound = static_cast<HRESULT>(0x80070490);

// Readies the calling thread for the objects below, for as long as it lives: CoInitialize.
HRESULT initializeCom() noexcept;

// A new enumerator, with one reference that is the caller's.
HRESULT createDeviceEnumerator(ComPtr<IMMDeviceEnumerator> &enumerator) noexcept;

}  // namespace vxcomn
