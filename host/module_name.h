// SPDX-License-Identifier: MIT
//
// The file name of an engine module, composed of the engine's name and the platform's. Control threads.
#pragma once

#include <string>

namespace vxcomn {

// "<EngineName>.dll" with a null platform name or host type 3; else "<EngineName>.DSP.dll", with ".HiFi2" for the platforms "HiFi2"
// and "iSST" or ".AIC326x" for "AIC326x" ahead of the ending. Platform names compare exactly. A null engine name counts as empty.
std::string composeModuleName(const char *EngineName, const char *PlatformName, int HostType);

}  // namespace vxcomn
