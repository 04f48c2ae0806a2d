// SPDX-License-Identifier: MIT
//
// Where endpoints lie in the registry: HKLM\SOFTWARE\Microsoft\Windows\CurrentVersion\MMDevices\Audio\Render (or Capture)\{guid},
// with the REG_DWORD DeviceState and a subkey Properties. A key whose name is no GUID is no endpoint. Control threads.
#pragma once

#include <optional>
#include <vector>

#include "platform/registry.h"
#include "vxcomn/com_types.h"

namespace vxcomn {

struct Endpoint {
    EDataFlow flow = eRender;
    WideString guid;  // as the key spells it

    WideString id() const;    // {0.0.0.00000000}.{guid}, or {0.0.1.00000000}.{guid} for capture
    WideString path() const;  // of its key, in HKLM
};

// The key above them all.
WideView endpointsPath() noexcept;

// Nothing if the id is not one of the two forms.
std::optional<Endpoint> endpointOfId(WideView id);

// The endpoints of a flow (or all), as they lie there.
std::vector<Endpoint> listEndpoints(EDataFlow flow);

// The endpoint as its key spells it; 2 if there is none.
Status findEndpoint(Endpoint &endpoint);

// 1 active, 2 disabled, 4 not present, 8 unplugged; nothing if the key holds no such state.
std::optional<uint32_t> endpointState(const Endpoint &endpoint);

// "{FORMAT-ID},pid", and back.
WideString propertyName(const PROPERTYKEY &key);
std::optional<PROPERTYKEY> propertyOfName(WideView name);

}  // namespace vxcomn
