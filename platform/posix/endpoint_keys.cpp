// SPDX-License-Identifier: MIT
#include "platform/posix/endpoint_keys.h"

#include "platform/guid.h"

namespace vxcomn {
namespace {

constexpr WideView kAudioKey = VX_TEXT("SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\MMDevices\\Audio");
constexpr WideView kRenderPrefix = VX_TEXT("{0.0.0.00000000}."), kCapturePrefix = VX_TEXT("{0.0.1.00000000}.");

WideString pathOfFlow(EDataFlow flow) {
    return WideString(kAudioKey) + (flow == eCapture ? VX_TEXT("\\Capture") : VX_TEXT("\\Render"));
}

bool isGuid(WideView text) noexcept {
    GUID guid;
    return parseGuidText(text, guid);
}

}  // namespace

WideString Endpoint::id() const {
    return WideString(flow == eCapture ? kCapturePrefix : kRenderPrefix) + guid;
}

WideString Endpoint::path() const {
    return pathOfFlow(flow) + VX_TEXT("\\") + guid;
}

WideView endpointsPath() noexcept {
    return kAudioKey;
}

std::optional<Endpoint> endpointOfId(WideView id) {
    for (const EDataFlow flow : {eRender, eCapture}) {
        const WideView prefix = flow == eCapture ? kCapturePrefix : kRenderPrefix;
        if (id.starts_with(prefix) && isGuid(id.substr(prefix.size()))) return Endpoint{flow, WideString(id.substr(prefix.size()))};
    }
    return std::nullopt;
}

std::vector<Endpoint> listEndpoints(EDataFlow wanted) {
    std::vector<Endpoint> found;
    for (const EDataFlow flow : {eRender, eCapture}) {
        if (wanted != flow && wanted != eAll) continue;
        RegistryKey key;
        std::vector<WideString> names;
        if (RegistryKey::open(RegistryRoot::localMachine, pathOfFlow(flow), RegistryAccess::read, key) != status::ok) continue;
        if (key.subkeys(names) != status::ok) continue;
        for (WideString &name : names) {
            if (isGuid(name)) found.push_back({flow, std::move(name)});
        }
    }
    return found;
}

Status findEndpoint(Endpoint &endpoint) {
    for (const Endpoint &each : listEndpoints(endpoint.flow)) {
        if (!equalIgnoringCase(each.guid, endpoint.guid)) continue;
        endpoint = each;
        return status::ok;
    }
    return status::fileNotFound;
}

std::optional<uint32_t> endpointState(const Endpoint &endpoint) {
    RegistryKey key;
    uint32_t state = 0;
    if (RegistryKey::open(RegistryRoot::localMachine, endpoint.path(), RegistryAccess::read, key) != status::ok)
        return std::nullopt;
    if (key.readU32(VX_TEXT("DeviceState"), state) != RegistryRead::value) return std::nullopt;
    state &= DEVICE_STATEMASK_ALL;  // the system keeps marks of its own above
    return state != 0 ? std::optional(state) : std::nullopt;
}

WideString propertyName(const PROPERTYKEY &key) {
    return guidText(key.fmtid) + VX_TEXT(",") + toWide(std::to_string(key.pid));
}

std::optional<PROPERTYKEY> propertyOfName(WideView name) {
    PROPERTYKEY key;
    const size_t comma = name.find(VXWCHAR{','});
    if (comma == WideView::npos || !parseGuidText(name.substr(0, comma), key.fmtid)) return std::nullopt;
    const WideView digits = name.substr(comma + 1);
    if (digits.empty() || digits.size() > 10) return std::nullopt;
    uint64_t number = 0;
    for (const VXWCHAR digit : digits) {
        if (digit < '0' || digit > '9') return std::nullopt;
        number = number * 10 + static_cast<uint64_t>(digit - '0');
    }
    if (number > UINT32_MAX) return std::nullopt;
    key.pid = static_cast<DWORD>(number);
    return key;
}

}  // namespace vxcomn
