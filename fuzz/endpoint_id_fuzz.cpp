// SPDX-License-Identifier: MIT
//
// The cutting of hardware keys, and the names that follow, on any text.
#include <cstdlib>

#include "platform/text.h"
#include "preset/endpoint_id.h"
#include "preset/preset_names.h"

using namespace vxcomn;

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size) {
    const WideString key = toWide({reinterpret_cast<const char *>(data), size});
    const DeviceIdentity identity = deviceIdentity(key);
    if (key.find(identity.deviceId) == WideString::npos || key.find(identity.ssid) == WideString::npos) std::abort();
    if (!identity.ssid.empty() &&
        (!identity.ssid.starts_with(VX_TEXT("SUBSYS_")) || identity.ssid.find(VX_TEXT('&')) != WideString::npos)) {
        std::abort();
    }
    if (presetPackageName(identity.deviceId).size() != identity.deviceId.size() + 14) std::abort();
    if (deviceIdAndEndpointIndex(identity.deviceId, -1).empty()) std::abort();
    return 0;
}
