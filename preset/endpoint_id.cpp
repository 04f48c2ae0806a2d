// SPDX-License-Identifier: MIT
#include "preset/endpoint_id.h"

#include "preset/read_log.h"

namespace vxcomn {

DeviceIdentity deviceIdentity(WideString text) {
    if (text.size() >= 2 && text.front() == VX_TEXT('{')) {
        const size_t brace = text.find(VX_TEXT("}."));
        if (brace != WideString::npos) text.erase(0, brace + 2);
    }
    // The bus and the device stay, the instance goes. A second backslash right behind the first is none: a character must follow
    // it.
    const size_t first = text.find(VX_TEXT('\\'));
    if (first != WideString::npos) {
        const size_t second = first + 2 <= text.size() ? text.find(VX_TEXT('\\'), first + 2) : WideString::npos;
        if (second != WideString::npos) text.resize(second);
    }
    const size_t subsystem = text.find(VX_TEXT("&SUBSYS_"));  // which is itself 8 long, so a shorter text holds none
    if (subsystem == WideString::npos) return {text, {}};
    const size_t end = text.find(VX_TEXT('&'), subsystem + 1);
    return {text.substr(0, subsystem), text.substr(subsystem + 1, end == WideString::npos ? end : end - subsystem - 1)};
}

WideString deviceIdAndEndpointIndex(const WideString &deviceId, int32_t endpointIndex) {
    if (deviceId.empty() && endpointIndex == -1) return VX_TEXT("0");
    WideString text = deviceId;
    if (endpointIndex == -1) return text;
    if (!deviceId.empty()) text += VX_TEXT('\\');
    read_log::append(text, endpointIndex);
    return text;
}

}  // namespace vxcomn
