// SPDX-License-Identifier: MIT
//
// vx list: the endpoints, their effect slots, and what is selected in each. Looks only.
#include <iostream>
#include <memory>

#include "tools/vx/text.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/doctor.h"
#include "tools/vx_client/endpoint_choice.h"
#include "tools/vx_client/endpoint_json.h"

namespace vx::client {

namespace {

constexpr uint32_t kActive = 1;

struct ListOptions {
    CommonOptions common;
    std::string endpoint;
    bool all = false;
    bool names = false;
};

std::string orDash(const std::string &text) {
    return text.empty() ? "-" : printable(text);
}

// "VXORLO!" for what a client forces.
std::string selected(const Selection &selection) {
    return orDash(selection.value) + (selection.origin == Origin::forced ? "!" : "");
}

std::string slotLine(const SlotFacts &slot) {
    return textf(
        "  %-4s %-12s %-16s %-16s %-14s %s%s\n", slot.apo.c_str(), selected(slot.engine).c_str(), selected(slot.ioConfig).c_str(),
        orDash(slot.profile.value).c_str(), orDash(slot.content.value).c_str(),
        !slot.preset.found ? "no preset" : orDash(slot.preset.entry.empty() ? slot.preset.path : slot.preset.entry).c_str(),
        slot.receiverRuns ? ", received" : "");
}

std::string deviceText(const Device &device, const std::vector<SlotFacts> &slots, const Style &style) {
    const std::string index = device.index < 0 ? "no index" : "index " + std::to_string(device.index);
    std::string text = style.bold(device.name.empty() ? "(no name)" : device.name) + ", " + index + ", " +
                       (device.isCapture ? "capture" : "render") + ", " + stateText(device.state) + ", " +
                       printable(device.idText) + "\n";
    text += "  device " + orDash(vxcomn::toUtf8(device.deviceId)) + ", " + orDash(vxcomn::toUtf8(device.subsystemId)) + "\n";
    text += "  slot engine       configuration    profile          content        preset\n";
    for (const SlotFacts &slot : slots) text += slotLine(slot);
    return text;
}

void list(const ListOptions &options) {
    std::vector<Device> devices = listDevices();
    if (!options.endpoint.empty())
        devices = {chooseEndpoint(devices, options.endpoint)};
    else if (!options.all)
        std::erase_if(devices, [](const Device &device) { return device.state != kActive; });
    const uint64_t version = readInstallation().keyVersion();
    const Style style(options.common.colour, stdout);
    Json documents = Json::array();
    std::string text;
    for (const Device &device : devices) {
        std::vector<SlotFacts> slots;
        for (const char *apo : kApoTypes) slots.push_back(readSlot(device, apo, version));
        text += (text.empty() ? "" : "\n") + deviceText(device, slots, style);
        Json json = deviceJson(device);
        json["slots"] = Json::array();
        for (const SlotFacts &slot : slots) json["slots"].push_back(slotJson(slot));
        documents.push_back(std::move(json));
    }
    if (options.common.json) {
        std::cout << documentText({{"endpoints", documents}});
        return;
    }
    if (text.empty()) text = "no active endpoint; vx list --all shows the others\n";
    std::cout << text;
}

// For completion: a name a line, and nothing else.
void listNames() {
    for (const Device &device : listDevices()) std::cout << device.name << "\n";
}

}  // namespace

void addListVerb(CLI::App &app) {
    auto options = std::make_shared<ListOptions>();
    CLI::App *verb = app.add_subcommand("list", "Endpoints, their effect slots, and what is selected in each");
    verb->add_option("ENDPOINT", options->endpoint, "Only this endpoint: its id, its index or a part of its name");
    verb->add_flag("--all", options->all, "Endpoints that are not active, too");
    verb->add_flag("--names", options->names, "Only the names of all endpoints, one a line");
    addCommonOptions(*verb, options->common);
    verb->footer(
        "Looks and changes nothing. An exclamation mark stands behind what a client forces.\n"
        "Examples:\n"
        "  vx list\n"
        "  vx list speakers --json");
    verb->callback([options] { options->names ? listNames() : list(*options); });
}

}  // namespace vx::client
