// SPDX-License-Identifier: MIT
#include "tools/vx_client/client_verbs.h"

#include "tools/vx_client/endpoint_choice.h"

namespace vx {

void addClientVerbs(CLI::App &app, int &exitStatus) {
    client::addListVerb(app);
    client::addDoctorVerb(app, exitStatus);
    client::addPropsVerb(app);
    client::addSelectionVerbs(app);
    client::addGetVerb(app);
    client::addSetVerb(app);
    client::addRawVerb(app);
    client::addResetVerb(app);
    client::addWatchVerb(app);
    client::addActivateVerb(app);
    client::addClientCompletions();
}

namespace client {

void addApoOption(CLI::App &verb, std::string &apo) {
    verb.add_option("--apo", apo, "The effect slot: EFX, MFX, SFX, LFX or GFX")
        ->check(CLI::IsMember({"EFX", "MFX", "SFX", "LFX", "GFX"}, CLI::ignore_case))
        ->capture_default_str()
        ->type_name("SLOT");
}

void addSlotOptions(CLI::App &verb, SlotOptions &options) {
    verb.add_option("ENDPOINT", options.slot.endpoint, "An endpoint: its id, its index or a part of its name")->required();
    addApoOption(verb, options.slot.apo);
    addCommonOptions(verb, options.common);
}

Session openSlot(const SlotChoice &choice, SessionKind kind) {
    return {findEndpoint(choice.endpoint), choice.apo, kind};
}

}  // namespace client
}  // namespace vx
