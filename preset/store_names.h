// SPDX-License-Identifier: MIT
//
// How the keys, values and mutexes of the parameter store are named. Pure functions over text. Any thread.
//
//     Software\Ondrevale\APO                                         the root, watched with all below it
//       \<DeviceIDAndEndpointIndex>\<APOTypeStr>                     the configuration key of an effect slot
//         \Clients                                                   a value for each live client, named by its instance id
//         \[<engine>\]<I/O configuration>\<profile>\<content>\Parameters     the parameter key
//           \<ComponentId>\Data, Time, Source                        one value for each parameter in each
#pragma once

#include <cstdint>

#include "platform/text.h"

namespace vxcomn {

inline constexpr const VXWCHAR *kStoreRoot = VX_TEXT("Software\\Ondrevale\\APO");

inline constexpr const VXWCHAR *kDefaultUserProfile = VX_TEXT("GlobalProfile");
inline constexpr const VXWCHAR *kDefaultContentType = VX_TEXT("AnyContent");

// Names of values and subkeys.
namespace store_name {
inline constexpr const VXWCHAR *clients = VX_TEXT("Clients");
inline constexpr const VXWCHAR *writeTime = VX_TEXT("WriteTime");
inline constexpr const VXWCHAR *presetHash = VX_TEXT("PresetSHA256");
inline constexpr const VXWCHAR *data = VX_TEXT("Data");
inline constexpr const VXWCHAR *time = VX_TEXT("Time");
inline constexpr const VXWCHAR *source = VX_TEXT("Source");
inline constexpr const VXWCHAR *engineName = VX_TEXT("EngineName");
inline constexpr const VXWCHAR *engineConfig = VX_TEXT("EngineConfig");
inline constexpr const VXWCHAR *engineSetter = VX_TEXT("EngineSetterID");
inline constexpr const VXWCHAR *ioConfig = VX_TEXT("IOConfig");
inline constexpr const VXWCHAR *ioConfigSetter = VX_TEXT("IOConfigSetterID");
inline constexpr const VXWCHAR *userProfile = VX_TEXT("UserProfile");
inline constexpr const VXWCHAR *contentType = VX_TEXT("ContentType");
}  // namespace store_name

// From this module version on a parameter key has the level of the engine.
inline constexpr uint64_t kEngineLevelVersion = 0x000200000007004A;  // 2.0.7.74

// kStoreRoot \ device and index \ APO type.
WideString configurationKey(WideView deviceIDAndEndpointIndex, WideView apoType);

struct ParameterKeyParts {
    WideView configurationKey;
    WideView engine;  // stands in the key from kEngineLevelVersion on
    WideView ioConfig;
    WideView userProfile;
    WideView contentType;
};
WideString parameterKey(const ParameterKeyParts &parts, uint64_t moduleVersion);

// A number as the names of components and parameters have it.
WideString decimalName(int32_t number);

// "<ParamId>", or "<ParamId>,<client>" for a value of one client's own.
WideString parameterValueName(int32_t paramId, WideView client = {});

// The name, without "Global\", of the mutex that serialises the writers of an effect slot.
WideView slotMutexName(WideView apoType);

// "Global\" + the configuration key with an underscore for each backslash: held by whoever runs effects on this key.
WideString syncMutexName(WideView configurationKey);

}  // namespace vxcomn
