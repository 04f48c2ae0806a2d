// SPDX-License-Identifier: MIT
#include "tools/vxreg/command.h"

#include <algorithm>
#include <cctype>
#include <iostream>

namespace vxreg {
namespace {

std::string lowered(std::string text) {
    std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
    return text;
}

bool isKnown(const std::string &known, const std::string &name) {
    return (known + " ").find(" " + name + " ") != std::string::npos;
}

template <class Value>
void setOnce(const std::string &verb, const std::string &name, std::optional<Value> &place, Value value) {
    if (place) failSyntax(verb, "'" + name + "' or its like is given twice");
    place = std::move(value);
}

void setOnce(const std::string &verb, const std::string &name, bool &place) {
    if (place) failSyntax(verb, "'" + name + "' is given twice");
    place = true;
}

}  // namespace

void failSyntax(const std::string &verb, const std::string &what) {
    throw Failure{"ERROR: Invalid syntax: " + what + ".\nType \"vxreg " + verb + (verb.empty() ? "" : " ") + "/?\" for usage."};
}

void failStatus(vxcomn::Status status, const std::string &what) {
    switch (status) {
        case vxcomn::status::fileNotFound:
        case vxcomn::status::pathNotFound:
        case vxcomn::status::keyDeleted:
            throw Failure{"ERROR: The system was unable to find the specified registry key or value: " + what};
        case vxcomn::status::accessDenied:
            throw Failure{"ERROR: Access is denied: " + what};
        default:
            throw Failure{"ERROR: The registry declined with status " + std::to_string(status) + ": " + what};
    }
}

Command parseCommand(const std::string &verb, const std::vector<std::string> &arguments, const std::string &known) {
    if (arguments.empty()) failSyntax(verb, "the name of a key is missing");
    const std::optional<KeyName> key = parseKeyName(arguments.front());
    if (!key) {
        throw Failure{"ERROR: Invalid key name: " + arguments.front() +
                      ". It begins with HKLM, HKCU, HKU, HKCR or one of their long names."};
    }
    Command command{.key = *key, .value = {}, .type = {}, .data = {}, .separator = {}};
    for (size_t i = 1; i < arguments.size(); ++i) {
        const std::string name = lowered(arguments[i]);
        if (name == "/reg:64") continue;  // the view that is always meant
        std::string argument;
        if (isKnown(known, name + "=")) {
            if (++i == arguments.size()) failSyntax(verb, "'" + name + "' lacks its argument");
            argument = arguments[i];
        } else if (!isKnown(known, name)) {
            failSyntax(verb, "unknown option '" + arguments[i] + "'");
        }
        if (name == "/v" || name == "/ve") {
            setOnce(verb, name, command.value, argument);
        } else if (name == "/t") {
            setOnce(verb, name, command.type, argument);
        } else if (name == "/d") {
            setOnce(verb, name, command.data, argument);
        } else if (name == "/s" && isKnown(known, "/s=")) {
            setOnce(verb, name, command.separator, argument);
        } else {
            setOnce(verb, name, name == "/va" ? command.allValues : name == "/s" ? command.recursive : command.force);
        }
    }
    if (command.allValues && command.value) failSyntax(verb, "'/va' goes with neither '/v' nor '/ve'");
    return command;
}

bool confirm(const std::string &question) {
    std::cout << question << " (Yes/No)? " << std::flush;
    std::string answer;
    std::getline(std::cin, answer);
    std::cout << "\n";
    answer = lowered(answer);
    while (!answer.empty() && std::isspace(static_cast<unsigned char>(answer.back())) != 0) answer.pop_back();
    return answer == "y" || answer == "yes";
}

std::string printName(const vxcomn::WideString &name) {
    return name.empty() ? "(Default)" : vxcomn::toUtf8(name);
}

}  // namespace vxreg
