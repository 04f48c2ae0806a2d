// SPDX-License-Identifier: MIT
//
// What only the running machine knows, for the shell's completion: the endpoints, and the parameters of an effect slot.
#include <exception>

#include "tools/vx/completion.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/device_list.h"
#include "tools/vx_client/user_parameters.h"

namespace vx::client {
namespace {

using Words = std::vector<std::string>;

// None where the machine cannot be asked: completion has nobody to tell.
Words endpointNames(const Words &) {
    Words names;
    try {
        for (const Device &device : listDevices()) names.push_back(device.name.empty() ? device.idText : device.name);
    } catch (const std::exception &) {
        names.clear();
    }
    return names;
}

Words parameterNames(const Words &) {
    Words names;
    for (const UserParameter &parameter : userParameters()) names.emplace_back(parameter.name);
    return names;
}

// Behind the endpoint names and values take turns.
Words parameterOrValue(const Words &before) {
    if (before.size() % 2 == 1) return parameterNames(before);
    for (const UserParameter &parameter : userParameters())
        if (before.back() == parameter.name && parameter.isSwitch) return {"on", "off"};
    return {};
}

Words nothing(const Words &) {
    return {};
}

}  // namespace

void addClientCompletions() {
    completeWith("ENDPOINT", endpointNames);
    completeWith("get NAME", parameterNames);
    completeWith("reset NAME", parameterNames);
    completeWith("set NAME VALUE", parameterOrValue);
    for (const char *argument : {"engine NAME", "ioconfig NAME", "profile NAME", "content NAME", "raw PARAMETER"})
        completeWith(argument, nothing);
}

}  // namespace vx::client
