// SPDX-License-Identifier: MIT
#include "preset/store_names.h"

#include <algorithm>
#include <charconv>

namespace vxcomn {
namespace {

constexpr VXWCHAR kSeparator = '\\';

void appendLevel(WideString &key, WideView level) {
    key += kSeparator;
    key += level;
}

}  // namespace

WideString configurationKey(WideView deviceIDAndEndpointIndex, WideView apoType) {
    WideString key = kStoreRoot;
    appendLevel(key, deviceIDAndEndpointIndex);
    appendLevel(key, apoType);
    return key;
}

WideString parameterKey(const ParameterKeyParts &parts, uint64_t moduleVersion) {
    WideString key(parts.configurationKey);
    if (moduleVersion >= kEngineLevelVersion) appendLevel(key, parts.engine);
    for (const WideView level : {parts.ioConfig, parts.userProfile, parts.contentType}) appendLevel(key, level);
    appendLevel(key, VX_TEXT("Parameters"));
    return key;
}

WideString decimalName(int32_t number) {
    char digits[11];  // a sign and ten digits
    char *const end = std::to_chars(std::begin(digits), std::end(digits), number).ptr;
    return WideString(std::begin(digits), end);
}

WideString parameterValueName(int32_t paramId, WideView client) {
    WideString name = decimalName(paramId);
    if (!client.empty()) {
        name += VXWCHAR{','};
        name += client;
    }
    return name;
}

WideView slotMutexName(WideView apoType) {
    if (apoType == VX_TEXT("EFX")) return VX_TEXT("{CD147EE7-2140-4445-B39A-473D43BE970D}");
    if (apoType == VX_TEXT("MFX")) return VX_TEXT("{36B0FFEC-2F71-433D-A3FF-55E149CF7F3A}");
    if (apoType == VX_TEXT("SFX")) return VX_TEXT("{651B4609-6CC8-4137-B61B-193FE66D2A1C}");
    return VX_TEXT("{76957D8F-A424-4E75-9984-8F053A875C95}");
}

WideString syncMutexName(WideView configurationKey) {
    WideString name = VX_TEXT("Global\\");
    const size_t first = name.size();
    name += configurationKey;
    std::replace(name.begin() + static_cast<std::ptrdiff_t>(first), name.end(), kSeparator, VXWCHAR{'_'});
    return name;
}

}  // namespace vxcomn
