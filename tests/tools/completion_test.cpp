// SPDX-License-Identifier: MIT
#include <doctest/doctest.h>
#include <CLI/CLI.hpp>

#include <algorithm>
#include <sstream>

#include "tests/tools/vx_fixture.h"
#include "tools/vx/completion.h"

namespace {

using Words = std::vector<std::string>;

Words linesOf(const std::string &text) {
    Words lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) {
        if (!line.empty() && line.back() == '\r') line.pop_back();
        lines.push_back(line);
    }
    return lines;
}

bool contains(const Words &words, const std::string &word) {
    return std::find(words.begin(), words.end(), word) != words.end();
}

Words completedByVx(const Words &words) {
    Words arguments{"complete", "--"};
    arguments.insert(arguments.end(), words.begin(), words.end());
    const test::Outcome outcome = test::VxFixture::vx(arguments);
    CHECK(outcome.status == 0);
    return linesOf(outcome.output);
}

// A program with an argument whose names only the machine knows.
struct Sample {
    CLI::App app{"sample"};
    std::string endpoint, parameter, colour;
    Words rest;

    Sample() {
        CLI::App *const set = app.add_subcommand("set", "set");
        set->add_option("SAMPLE_ENDPOINT", endpoint, "where");
        set->add_option("SAMPLE_PARAMETER", parameter, "which");
        set->add_option("--colour", colour, "when")->check(CLI::IsMember({"auto", "always", "never"}))->type_name("WHEN");
        app.add_subcommand("secret", "not for people")->group("");
        vx::completeWith("SAMPLE_ENDPOINT", [](const Words &) { return Words{"Speakers", "Headphones"}; });
        vx::completeWith("SAMPLE_PARAMETER", [](const Words &before) {
            return before == Words{"Speakers"} ? Words{"bass", "voice"} : Words{};
        });
    }
};

}  // namespace

TEST_CASE("completion: the first word is a verb") {
    const Words verbs = completedByVx({""});
    CHECK(contains(verbs, "run"));
    CHECK(contains(verbs, "preset"));
    CHECK_FALSE(contains(verbs, "complete"));
    CHECK(completedByVx({"pre"}) == Words{"preset"});
    CHECK(completedByVx({"nonsense"}).empty());
}

TEST_CASE("completion: a group's verbs, an option by its beginning, a closed set of values") {
    CHECK(completedByVx({"measure", "pol"}) == Words{"polarity"});
    CHECK(completedByVx({"run", "--plat"}) == Words{"--platform"});
    CHECK(completedByVx({"run", "--platform", "Hi"}) == Words{"HiFi2"});
    CHECK(completedByVx({"run", "--platform=Hi"}) == Words{"HiFi2"});
}

TEST_CASE("completion: a file's place asks the shell for files") {
    CHECK(completedByVx({"preset", "check", "s"}) == Words{vx::kCompleteFiles});
    CHECK(completedByVx({"run", "-o", ""}) == Words{vx::kCompleteFiles});
    CHECK(completedByVx({"preset", "check", "one", "too-many"}).empty());
}

TEST_CASE("completion: names that the machine knows, by the arguments before") {
    const Sample sample;
    CHECK(vx::completionsOf(sample.app, {"set", ""}) == Words{"Speakers", "Headphones"});
    CHECK(vx::completionsOf(sample.app, {"set", "He"}) == Words{"Headphones"});
    CHECK(vx::completionsOf(sample.app, {"set", "Speakers", "b"}) == Words{"bass"});
    CHECK(vx::completionsOf(sample.app, {"set", "--colour", "auto", "Speakers", ""}) == Words{"bass", "voice"});
    CHECK(vx::completionsOf(sample.app, {"set", "Headphones", ""}).empty());
}

TEST_CASE("completion: a completer of one verb goes before that of all") {
    const Sample sample;
    vx::completeWith("set SAMPLE_PARAMETER", [](const Words &) { return Words{"only here"}; });
    CHECK(vx::completionsOf(sample.app, {"set", "Speakers", ""}) == Words{"only here"});
    vx::completeWith("set SAMPLE_PARAMETER", [](const Words &) { return Words{"bass", "voice"}; });
}

TEST_CASE("completion: the sliders' names and, for a switch, its two values") {
    CHECK(completedByVx({"get", "speakers", "bas"}) == Words{"bass"});
    CHECK(completedByVx({"set", "speakers", "bass", "0.5", "by"}) == Words{"bypass"});
    CHECK(completedByVx({"set", "speakers", "bypass", ""}) == Words{"on", "off"});
    CHECK(completedByVx({"set", "speakers", "bass", ""}).empty());
    CHECK(completedByVx({"get", "--apo", "M"}) == Words{"MFX"});
}

TEST_CASE("completion: odd lines end in nothing, not in a crash") {
    const Sample sample;
    CHECK(vx::completionsOf(sample.app, {}).empty());
    CHECK(vx::completionsOf(sample.app, {"set", "-"}).size() > 1);
    CHECK(vx::completionsOf(sample.app, {"secret"}).empty());
    CHECK(vx::completionsOf(sample.app, {"=", "set", ""}).empty());
    CHECK(vx::completionsOf(sample.app, {"set", "--=", "--colour=", "--nothing", ""}).size() <= 2);
}
