// SPDX-License-Identifier: MIT
//
// vx doctor: looks at one endpoint, or at all that the system plays through.
#include <iostream>
#include <memory>

#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/doctor.h"
#include "tools/vx_client/endpoint_choice.h"
#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

namespace {

constexpr uint32_t kActive = 1;

std::vector<Device> chosenDevices(const std::string &endpoint) {
    const std::vector<Device> all = listDevices();
    if (!endpoint.empty()) return {chooseEndpoint(all, endpoint)};
    std::vector<Device> active;
    for (const Device &device : all)
        if (device.state == kActive) active.push_back(device);
    if (active.empty())
        throw Failure(ExitStatus::found, all.empty() ? "the machine has no audio endpoints; install or connect a device"
                                                     : "no endpoint is active; vx list shows those that there are");
    return active;
}

bool examine(const SlotOptions &options) {
    const InstallationFacts installation = readInstallation();
    const Style style(options.common.colour, stdout);
    Json documents = Json::array();
    bool wrong = false;
    std::string text;
    for (const Device &device : chosenDevices(options.slot.endpoint)) {
        const DoctorFacts facts = gatherFacts(device, options.slot.apo, installation);
        const std::vector<Finding> findings = judge(facts);
        wrong = wrong || anythingWrong(findings);
        documents.push_back(doctorJson(facts, findings));
        text += (text.empty() ? "" : "\n") + doctorText(facts, findings, style);
    }
    if (options.common.json)
        std::cout << documentText({{"active", !wrong}, {"endpoints", documents}});
    else if (!options.common.quiet)
        std::cout << text;
    return !wrong;
}

}  // namespace

void addDoctorVerb(CLI::App &app, int &exitStatus) {
    auto options = std::make_shared<SlotOptions>();
    CLI::App *verb = app.add_subcommand("doctor", "Is the effect active on an endpoint, and if not, why?");
    verb->add_option("ENDPOINT", options->slot.endpoint,
                     "An endpoint: its id, its index or a part of its name; all active ones without it");
    addApoOption(*verb, options->slot.apo);
    addCommonOptions(*verb, options->common);
    verb->footer(
        "Looks and changes nothing. Every line tells what was found, what it means and what to do.\n"
        "Exit status: 0 the effect is active; 1 something is wrong.\n"
        "Examples:\n"
        "  vx doctor\n"
        "  vx doctor speakers --apo MFX --json");
    verb->callback([options, &exitStatus] {
        if (!examine(*options)) exitStatus = static_cast<int>(ExitStatus::found);
    });
}

}  // namespace vx::client
