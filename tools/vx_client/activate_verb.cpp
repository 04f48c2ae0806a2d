// SPDX-License-Identifier: MIT
//
// vx activate: keeps a silent stream open on an endpoint, so that the system has its effects loaded.
#include <iostream>
#include <memory>
#include <optional>

#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_json.h"
#include "tools/vx_client/hold.h"

namespace vx::client {

namespace {

struct ActivateOptions : SlotOptions {
    std::optional<double> seconds;
};

void activate(const ActivateOptions &options) {
    const Hold hold(options.seconds);
    const Session session = openSlot(options.slot, SessionKind::observer);
    if (VXAPOCOMAPI_ActivateEndpoint(session.handle()) != 1)
        throw Failure(session.device().state == 1 ? ExitStatus::system : ExitStatus::input,
                      session.device().name + ": no stream can be opened on it; it is " + stateText(session.device().state) +
                          (session.device().state == 1 ? ": close a program that holds it for itself alone"
                                                       : ", and only an active endpoint takes one"));
    if (options.common.json)
        std::cout << documentText({{"endpoint", deviceJson(session.device())}, {"apo", session.apo()}, {"activated", true}});
    else if (!options.common.quiet)
        std::cout << session.device().name << ": a silent stream is open while this runs; Ctrl-C closes it\n";
    hold.wait();
    VXAPOCOMAPI_DeactivateEndpoint(session.handle());
}

}  // namespace

void addActivateVerb(CLI::App &app) {
    auto options = std::make_shared<ActivateOptions>();
    CLI::App *verb =
        app.add_subcommand("activate", "Keep a silent stream open on an endpoint, so that the system loads its effects");
    addSlotOptions(*verb, *options);
    addHoldOption(*verb, options->seconds, "Keep it for so long");
    verb->footer(
        "Examples:\n"
        "  vx activate speakers\n"
        "  vx activate headphones --for 5");
    verb->callback([options] { activate(*options); });
}

}  // namespace vx::client
