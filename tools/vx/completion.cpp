// SPDX-License-Identifier: MIT
#include "tools/vx/completion.h"

#include <CLI/CLI.hpp>
#include <iostream>
#include <map>
#include <memory>

namespace vx {
namespace {

std::map<std::string, Completer> &completers() {
    static std::map<std::string, Completer> all;
    return all;
}

using Words = std::vector<std::string>;

bool isVisible(const std::string &group) {
    return !group.empty();
}

// An option by a word of the command line, with or without its value behind an equals sign.
const CLI::Option *optionOf(const CLI::App &app, const std::string &word) {
    return word.size() > 1 && word[0] == '-' ? app.get_option_no_throw(word.substr(0, word.find('='))) : nullptr;
}

bool takesValue(const CLI::Option &option) {
    return option.get_items_expected_max() > 0;
}

// The closed set of a value, which its type name ends with: NAME:{one,two}.
Words choicesOf(const std::string &typeName) {
    const size_t open = typeName.find('{');
    const size_t close = typeName.find('}', open);
    Words choices;
    if (open == std::string::npos || close == std::string::npos) return choices;
    std::string rest = typeName.substr(open + 1, close - open - 1);
    for (size_t comma; (comma = rest.find(',')) != std::string::npos; rest.erase(0, comma + 1))
        choices.push_back(rest.substr(0, comma));
    choices.push_back(rest);
    return choices;
}

Words valuesOf(const CLI::App &verb, const std::string &argument, const std::string &typeName, const Words &before) {
    for (const std::string &key : {verb.get_name() + " " + argument, argument}) {
        const auto known = completers().find(key);
        if (known != completers().end()) return known->second(before);
    }
    const Words choices = choicesOf(typeName);
    return choices.empty() ? Words{kCompleteFiles} : choices;
}

Words valuesOf(const CLI::App &verb, const CLI::Option &option, const Words &before) {
    const std::string typeName = option.get_type_name();
    return valuesOf(verb, typeName.substr(0, typeName.find(':')), typeName, before);
}

Words optionsOf(const CLI::App &app) {
    Words names;
    for (const CLI::Option *option : app.get_options()) {
        if (!isVisible(option->get_group())) continue;
        for (const std::string &name : option->get_lnames()) names.push_back("--" + name);
        for (const std::string &name : option->get_snames()) names.push_back("-" + name);
    }
    return names;
}

std::vector<const CLI::App *> verbsOf(const CLI::App &app) {
    return app.get_subcommands([](const CLI::App *verb) { return isVisible(verb->get_group()); });
}

const CLI::App *verbOf(const CLI::App &app, const std::string &name) {
    for (const CLI::App *verb : verbsOf(app))
        if (verb->get_name() == name) return verb;
    return nullptr;
}

Words verbNames(const CLI::App &app) {
    Words names;
    for (const CLI::App *verb : verbsOf(app)) names.push_back(verb->get_name());
    return names;
}

// The positional argument that comes behind those on the line, the last one if it may repeat; null for one too many.
const CLI::Option *nextPositional(const CLI::App &app, size_t before) {
    for (const CLI::Option *option : app.get_options([](const CLI::Option *each) { return each->get_positional(); })) {
        const auto room = static_cast<size_t>(option->get_items_expected_max());
        if (before < room) return option;
        before -= room;
    }
    return nullptr;
}

Words beginningWith(const Words &candidates, const std::string &prefix) {
    Words fitting;
    for (const std::string &candidate : candidates)
        if (candidate == kCompleteFiles || candidate.starts_with(prefix)) fitting.push_back(candidate);
    return fitting;
}

}  // namespace

void completeWith(const std::string &argument, Completer completer) {
    completers()[argument] = std::move(completer);
}

std::vector<std::string> completionsOf(const CLI::App &app, const std::vector<std::string> &words) {
    if (words.empty()) return {};
    const CLI::App *verb = &app;
    const CLI::Option *pending = nullptr;  // an option that waits for its value
    Words before;
    for (size_t i = 0; i + 1 < words.size(); ++i) {
        const std::string &word = words[i];
        if (pending != nullptr) {
            pending = nullptr;
        } else if (const CLI::Option *option = optionOf(*verb, word)) {
            if (takesValue(*option) && word.find('=') == std::string::npos) pending = option;
        } else if (const CLI::App *next = before.empty() ? verbOf(*verb, word) : nullptr) {
            verb = next;
        } else {
            before.push_back(word);
        }
    }
    const std::string &word = words.back();
    if (pending != nullptr) return beginningWith(valuesOf(*verb, *pending, before), word);
    if (const size_t equals = word.find('='); equals != std::string::npos) {
        const CLI::Option *const option = optionOf(*verb, word);
        if (option != nullptr && takesValue(*option))
            return beginningWith(valuesOf(*verb, *option, before), word.substr(equals + 1));
    }
    if (word.starts_with('-')) return beginningWith(optionsOf(*verb), word);
    const Words verbs = verbNames(*verb);
    if (!verbs.empty()) return before.empty() ? beginningWith(verbs, word) : Words{};
    const CLI::Option *const positional = nextPositional(*verb, before.size());
    if (positional == nullptr) return {};
    return beginningWith(valuesOf(*verb, positional->get_single_name(), positional->get_type_name(), before), word);
}

void addCompleteVerb(CLI::App &app) {
    const auto words = std::make_shared<Words>();
    CLI::App *const verb =
        app.add_subcommand("complete", "What the shell's completion asks: behind --, the words up to the cursor");
    verb->group("");
    verb->add_option("WORD", *words, "The words behind the program's name; the last one is completed");
    verb->callback([&app, words] {
        for (const std::string &candidate : completionsOf(app, *words)) std::cout << candidate << '\n';
    });
}

}  // namespace vx
