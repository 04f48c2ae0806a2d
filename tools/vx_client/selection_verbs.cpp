// SPDX-License-Identifier: MIT
//
// vx engine, ioconfig, profile and content: what a slot has selected, and selecting. An engine and a configuration last as long as
// the client that forces them, so those two verbs stay; a profile and a content type are stored.
#include <iostream>
#include <memory>
#include <optional>

#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_json.h"
#include "tools/vx_client/hold.h"

namespace vx::client {

namespace {

struct SelectionKind {
    const char *name;
    const char *what;
    const char *help;
    bool lapses;
    std::string (Session::*get)() const;
    int32_t (*set)(const Session &session, const std::string &value);
    const char *example;
};

int32_t setEngine(const Session &session, const std::string &value) {
    return VXAPOCOMAPI_SetEngine(session.handle(), value.c_str(), VXAPOCOMAPI_GetEngineDefaultConfig(value.c_str()));
}

const SelectionKind kKinds[] = {
    {"engine", "engine", "The engine of an effect slot; with a name, force it while this runs", true, &Session::engine, setEngine,
     "KZNOVA"},
    {"ioconfig", "configuration", "The I/O configuration of an effect slot; with a name, force it while this runs", true,
     &Session::ioConfig,
     [](const Session &session, const std::string &value) { return VXAPOCOMAPI_SetIOConfig(session.handle(), value.c_str()); },
     "Headphones"},
    {"profile", "profile", "The user profile of an effect slot; with a name, select it", false, &Session::profile,
     [](const Session &session, const std::string &value) { return VXAPOCOMAPI_SetUserProfile(session.handle(), value.c_str()); },
     "Evening"},
    {"content", "content type", "The content type of an effect slot; with a name, select it", false, &Session::content,
     [](const Session &session, const std::string &value) { return VXAPOCOMAPI_SetContentType(session.handle(), value.c_str()); },
     "Movie"},
};

struct SelectionOptions : SlotOptions {
    std::string value;
    std::optional<double> seconds;
};

// A name becomes a level of keys and folders, so it cannot hold what separates these.
void checkName(const std::string &value) {
    if (value.size() > 255 || value.find_first_of("\\/:*?\"<>|") != std::string::npos || printable(value) != value)
        throw Failure(ExitStatus::usage,
                      "\"" + printable(value) + "\" is no name; expected at most 255 characters and none of \\ / : * ? \" < > |");
}

void select(const SelectionKind &kind, const SelectionOptions &options) {
    checkName(options.value);
    const bool sets = !options.value.empty();
    const Hold hold(kind.lapses ? options.seconds : std::optional<double>(0.0));
    const Session session = openSlot(options.slot);
    const std::string before = (session.*kind.get)();
    if (sets && kind.set(session, options.value) != 1) session.fail(std::string(kind.what) + " " + options.value);
    const std::string now = (session.*kind.get)();
    if (options.common.json) {
        Json json = {{"endpoint", deviceJson(session.device())}, {"apo", session.apo()}, {kind.name, textOrNull(now)}};
        if (sets) json["before"] = textOrNull(before);
        if (sets) json["lastsAsLongAsThisRuns"] = kind.lapses;
        std::cout << documentText(json);
    } else if (!sets) {
        std::cout << (now.empty() ? "-" : now) << "\n";
    } else if (!options.common.quiet) {
        std::cout << kind.what << " " << (before.empty() ? "-" : before) << " -> " << now
                  << (kind.lapses ? ", while this runs; Ctrl-C gives it back\n" : "\n");
    }
    if (sets && kind.lapses) hold.wait();
}

}  // namespace

void addSelectionVerbs(CLI::App &app) {
    for (const SelectionKind &kind : kKinds) {
        auto options = std::make_shared<SelectionOptions>();
        CLI::App *verb = app.add_subcommand(kind.name, kind.help);
        addSlotOptions(*verb, *options);
        verb->add_option("NAME", options->value,
                         std::string("The ") + kind.what + " to select; without it, the present one is printed");
        if (kind.lapses) addHoldOption(*verb, options->seconds, "Force it for so long");
        verb->footer(std::string("Examples:\n  vx ") + kind.name + " speakers\n  vx " + kind.name + " speakers " + kind.example +
                     (kind.lapses ? " --for 60" : ""));
        verb->callback([options, &kind] { select(kind, *options); });
    }
}

}  // namespace vx::client
