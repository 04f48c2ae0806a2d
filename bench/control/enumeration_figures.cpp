// SPDX-License-Identifier: MIT
//
// Listing 64 endpoints, and what a client pays that asks whether its list still holds.
#include <cstdio>

#include "VXAPOCOMAPI.h"
#include "bench/control/figures.h"
#include "bench/support/timing.h"
#include "platform/posix/endpoint_keys.h"
#include "platform/registry.h"

namespace vxcomn::bench {

namespace {

constexpr int kEndpoints = 64;
constexpr double kFastPathAim = 100;  // ns

void makeEndpoints() {
    for (int i = 0; i < kEndpoints; ++i) {
        const std::string guid = "{00000000-1111-2222-3333-4444444444" + std::to_string(10 + i) + "}";
        const WideString path = WideString(endpointsPath()) + VX_TEXT("\\Render\\") + toWide(guid);
        RegistryKey endpoint, properties;
        require(RegistryKey::create(RegistryRoot::localMachine, path, RegistryAccess::all, endpoint) == status::ok &&
                    endpoint.setU32(VX_TEXT("DeviceState"), 1) == status::ok &&
                    endpoint.createBelow(VX_TEXT("Properties"), RegistryAccess::all, properties) == status::ok &&
                    properties.setText(VX_TEXT("{83DA6326-97A6-4088-9453-A1923F573B29},3"), VX_TEXT("usb\\kvusbaudio.sysfx")) ==
                        status::ok,
                "an endpoint isn't made");
    }
}

}  // namespace

void printEnumerationFigures() {
    makeEndpoints();
    VXAPOHandle const api = VXAPOCOMAPI_InitializeAPI();
    uint32_t count = 0;
    VXWCHAR **ids = nullptr;
    uint64_t tag = 0;
    const auto list = [&] {
        require(VXAPOCOMAPI_GetEndpointIDs(api, &count, &ids, 0, 1, nullptr) == 1 && count == kEndpoints, "they aren't listed");
        VXAPOCOMAPI_FreeEndpointIDs(api, count, ids);
    };
    require(VXAPOCOMAPI_GetEndpointIDs(api, &count, &ids, 0, 1, &tag) == 1, "they aren't listed");
    VXAPOCOMAPI_FreeEndpointIDs(api, count, ids);
    const std::vector<Figure> figures = timeInTurns({
        {"list",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) list();
         }},
        {"ask",
         [&](int repeats) {
             for (int i = 0; i < repeats; ++i) keep(VXAPOCOMAPI_GetEndpointIDs(api, &count, &ids, 0, 1, &tag));
         }},
    });
    const double ask = nanosecondsOf(figures, "ask");
    std::printf("endpoints\n  %-60s %8.3f ms\n", "list 64 of them", nanosecondsOf(figures, "list") / 1e6);
    std::printf("  %-60s %8.1f ns  aim below %.0f ns  %s\n\n", "ask by the tag whether the list still holds", ask, kFastPathAim,
                ask < kFastPathAim ? "reached" : "MISSED");
    VXAPOCOMAPI_FreeAPI(api);
}

}  // namespace vxcomn::bench
