// SPDX-License-Identifier: MIT
//
// vx get, set and reset: the user parameters, by name.
#include <iostream>
#include <memory>

#include "tools/vx/parameters.h"
#include "tools/vx/text.h"
#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_json.h"
#include "tools/vx_client/raw_value.h"
#include "tools/vx_client/user_parameters.h"

namespace vx::client {

namespace {

struct ParameterOptions : SlotOptions {
    std::vector<std::string> words;
    bool everywhere = false;
    bool wholeStore = false;
};

struct Reading {
    const UserParameter *parameter;
    float value;
    std::string problem;
};

Reading readUser(const Session &session, const UserParameter &parameter) {
    const float value = VXAPOCOMAPI_GetUserParameter(session.handle(), static_cast<int32_t>(parameter.id));
    if (value >= 0.0F) return {&parameter, value, {}};
    const std::string why = session.lastError();
    return {&parameter, value, why.empty() ? "the library gives no value and no reason" : why};
}

Json readingJson(const Reading &reading) {
    Json json = {{"name", reading.parameter->name}, {"id", reading.parameter->id}};
    json["value"] = reading.problem.empty() ? Json(userValueNumber(reading.value)) : Json();
    if (!reading.problem.empty()) json["problem"] = reading.problem;
    return json;
}

Json headJson(const Session &session) {
    return {{"endpoint", deviceJson(session.device())}, {"apo", session.apo()}, {"engine", textOrNull(session.engine())}};
}

void get(const ParameterOptions &options) {
    std::vector<const UserParameter *> wanted;
    for (const std::string &word : options.words) wanted.push_back(&userParameter(word));
    const bool named = !wanted.empty();
    if (!named)
        for (const UserParameter &parameter : userParameters()) wanted.push_back(&parameter);
    const Session session = openSlot(options.slot);
    Json json = headJson(session);
    json["parameters"] = Json::array();
    std::string text;
    for (const UserParameter *parameter : wanted) {
        const Reading reading = readUser(session, *parameter);
        if (named && !reading.problem.empty()) session.fail(parameter->name);
        json["parameters"].push_back(readingJson(reading));
        const std::string value = reading.problem.empty() ? userValueText(*parameter, reading.value) : "-       " + reading.problem;
        // One name asked for is one value, for scripts.
        text += options.words.size() == 1 ? value + "\n" : textf("%-9s ", parameter->name) + value + "\n";
    }
    std::cout << (options.common.json ? documentText(json) : text);
}

struct Assignment {
    const UserParameter *parameter;
    float value;
};

// NAME VALUE pairs and NAME=VALUE words.
std::vector<Assignment> assignmentsOf(const std::vector<std::string> &words) {
    std::vector<Assignment> assignments;
    for (size_t i = 0; i < words.size(); ++i) {
        const size_t equals = words[i].find('=');
        const UserParameter &parameter = userParameter(words[i].substr(0, equals));
        if (equals == std::string::npos && i + 1 == words.size())
            throw Failure(ExitStatus::usage, words[i] + ": has no value; expected NAME VALUE, such as bass 0.7");
        const std::string value = equals == std::string::npos ? words[++i] : words[i].substr(equals + 1);
        assignments.push_back({&parameter, parseUserValue(parameter, value)});
    }
    return assignments;
}

void set(const ParameterOptions &options) {
    const std::vector<Assignment> assignments = assignmentsOf(options.words);
    const Session session = openSlot(options.slot);
    Json json = headJson(session);
    json["parameters"] = Json::array();
    std::string text;
    for (const auto &[parameter, value] : assignments) {
        const uint32_t id = parameter->id | (options.everywhere ? uint32_t{VXAPOCOMAPI_IS_GLOBAL} : 0U);
        if (VXAPOCOMAPI_SetUserParameter(session.handle(), id, value) != 1) session.fail(parameter->name);
        const Reading reading = readUser(session, *parameter);
        json["parameters"].push_back(readingJson(reading));
        text += textf("%-9s ", parameter->name) +
                (reading.problem.empty() ? userValueText(*parameter, reading.value) : reading.problem) + "\n";
    }
    if (options.common.json)
        std::cout << documentText(json);
    else if (!options.common.quiet)
        std::cout << text;
}

void reset(const ParameterOptions &options) {
    if (options.wholeStore && !options.words.empty())
        throw Failure(ExitStatus::usage, "--whole-store takes everything back; leave the names out");
    std::vector<Triple> triples;
    for (const std::string &word : options.words) {
        if (word.find(',') != std::string::npos) {
            triples.push_back(parseTriple(word));
            continue;
        }
        const UserParameter &parameter = userParameter(word);
        triples.push_back({parameter.componentId, parameter.paramId, 0});
    }
    const Session session = openSlot(options.slot);
    for (const Triple &triple : triples)
        if (VXAPOCOMAPI_ResetUserParameter(session.handle(), triple.componentId, triple.paramId, 0) != 1) session.fail("reset");
    if (triples.empty() && VXAPOCOMAPI_ResetUserParametersEx(session.handle(), options.wholeStore ? 1 : 0) != 1)
        session.fail("reset");
    if (options.common.json) {
        Json json = headJson(session);
        json["reset"] = triples.empty() ? Json("all") : Json(options.words);
        std::cout << documentText(json);
    } else if (!options.common.quiet) {
        std::cout << session.device().name << ", " << session.apo() << ": "
                  << (triples.empty() ? "all parameters are" : std::to_string(triples.size()) + " parameters are")
                  << " the preset's again\n";
    }
}

}  // namespace

void addGetVerb(CLI::App &app) {
    auto options = std::make_shared<ParameterOptions>();
    CLI::App *verb = app.add_subcommand("get", "Read the user parameters of an effect slot");
    addSlotOptions(*verb, *options);
    verb->add_option("NAME", options->words, "Parameters; all seventeen without one. A single one prints its value alone");
    verb->footer("Parameters:\n" + userParameterHelp() +
                 "\nExamples:\n"
                 "  vx get speakers\n"
                 "  vx get speakers bass\n");
    verb->callback([options] { get(*options); });
}

void addSetVerb(CLI::App &app) {
    auto options = std::make_shared<ParameterOptions>();
    CLI::App *verb = app.add_subcommand("set", "Set user parameters of an effect slot");
    addSlotOptions(*verb, *options);
    verb->add_option("NAME VALUE", options->words, "Pairs of a name and a value; NAME=VALUE does as well")->required();
    verb->add_flag("--everywhere", options->everywhere,
                   "For every configuration and content type of the slot, not just the present one");
    verb->footer("Parameters:\n" + userParameterHelp() +
                 "\nExamples:\n"
                 "  vx set speakers bass 0.7\n"
                 "  vx set speakers voice=0.8 detail=0.6 eq on --apo MFX\n");
    verb->callback([options] { set(*options); });
}

void addResetVerb(CLI::App &app) {
    auto options = std::make_shared<ParameterOptions>();
    CLI::App *verb = app.add_subcommand("reset", "Take parameters of an effect slot back to the preset's");
    addSlotOptions(*verb, *options);
    verb->add_option("NAME", options->words,
                     "User parameters, or COMPONENT,ID; without one all of the slot, which also switches the power on");
    verb->add_flag("--whole-store", options->wholeStore,
                   "Also forget what is stored for all other slots and endpoints: they fill themselves from their presets again");
    verb->footer(
        "Examples:\n"
        "  vx reset speakers\n"
        "  vx reset speakers bass eq3\n"
        "  vx reset speakers 5,115 --apo MFX");
    verb->callback([options] { reset(*options); });
}

}  // namespace vx::client
