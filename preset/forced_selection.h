// SPDX-License-Identifier: MIT
//
// What applications force on an effect slot: the values of its configuration key. Those with a setter count only while the setter
// lives, so that they lapse with it and nobody has to clean up. Control threads.
#pragma once

#include "platform/registry.h"
#include "platform/status.h"
#include "platform/text.h"
#include "vxcomn/engine.h"

namespace vxcomn {

// E_FAIL: a value whose setter is gone.
inline constexpr Status kSetterGone = 0x80004005;

// Opens a configuration key for reading; none if there is none, or the path is empty.
RegistryKey openConfiguration(WideView keyPath);

// Each takes the open configuration key.

// Whether somebody holds the mutex that the text value names: its setter lives.
bool setterAlive(const RegistryKey &configuration, WideView setterValueName);
// Empty if nothing is forced.
WideString readForcedEngineName(const RegistryKey &configuration);
// All zeros if nothing is forced. A value of 525 bytes or more is none. The first word is the number of bytes read.
EngineConfig readForcedEngineConfig(const RegistryKey &configuration);
// The registry's status, or kSetterGone; `name` is empty then.
Status readForcedIOConfig(const RegistryKey &configuration, WideString &name);
// Without a setter. Empty if there is none.
WideString readUserProfile(const RegistryKey &configuration);
WideString readContentType(const RegistryKey &configuration);

}  // namespace vxcomn
