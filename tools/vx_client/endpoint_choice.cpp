// SPDX-License-Identifier: MIT
#include "tools/vx_client/endpoint_choice.h"

#include <algorithm>
#include <functional>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx::client {

namespace {

using Candidates = std::vector<const Device *>;
using Test = std::function<bool(const Device &)>;

Candidates matching(const std::vector<Device> &devices, const Test &fits) {
    Candidates found;
    for (const Device &device : devices)
        if (fits(device)) found.push_back(&device);
    return found;
}

std::string line(const Device &device) {
    const std::string index = device.index < 0 ? "no index" : "index " + std::to_string(device.index);
    return "\n  " + (device.name.empty() ? "(no name)" : device.name) + ", " + index + ", " + stateText(device.state) + ", " +
           printable(device.idText);
}

std::string lines(const Candidates &candidates) {
    std::string text;
    for (const Device *device : candidates) text += line(*device);
    return text;
}

}  // namespace

const Device &chooseEndpoint(const std::vector<Device> &devices, const std::string &text) {
    if (devices.empty())
        throw Failure(ExitStatus::input,
                      "endpoint \"" + text + "\": the machine has no audio endpoints; vx list shows them once there are");
    const std::string wanted = lowered(text);
    const auto number = parseInteger(text, 0, INT32_MAX);
    // The closest reading that anything fits wins.
    const Test readings[] = {
        [&](const Device &device) { return lowered(device.idText) == wanted; },
        [&](const Device &device) { return wanted.starts_with('{') && lowered(device.idText).ends_with("." + wanted); },
        [&](const Device &device) { return number && device.index == *number; },
        [&](const Device &device) { return !wanted.empty() && lowered(device.name) == wanted; },
        [&](const Device &device) { return !wanted.empty() && lowered(device.name).find(wanted) != std::string::npos; },
    };
    for (const Test &fits : readings) {
        Candidates found = matching(devices, fits);
        if (found.empty()) continue;
        if (found.size() == 1) return *found.front();
        const auto active = [](const Device *device) { return device->state == 1; };
        if (std::count_if(found.begin(), found.end(), active) == 1) return **std::find_if(found.begin(), found.end(), active);
        throw Failure(ExitStatus::usage, "endpoint \"" + text + "\": " + std::to_string(found.size()) +
                                             " endpoints fit; say which by more of its name or by its id:" + lines(found));
    }
    throw Failure(ExitStatus::input, "endpoint \"" + text + "\": there is none of that id, index or name; there are:" +
                                         lines(matching(devices, [](const Device &) { return true; })));
}

Device findEndpoint(const std::string &text) {
    const std::vector<Device> devices = listDevices();
    return chooseEndpoint(devices, text);
}

}  // namespace vx::client
