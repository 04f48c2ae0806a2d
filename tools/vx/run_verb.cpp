// SPDX-License-Identifier: MIT
//
// vx run: registers the verb and puts its pieces together.
#include "tools/vx/run_verb.h"

#include <iostream>
#include <memory>

#include "tools/vx/plot.h"
#include "tools/vx/run_options.h"
#include "tools/vx/run_report.h"
#include "tools/vx/run_session.h"
#include "tools/vx/verb.h"

namespace vx {

namespace {

void run(const RunOptions &options, const FollowerMaker &makeFollower) {
    checkRunOptions(options);
    std::unique_ptr<Plot> plot;
    if (!options.plots.empty()) plot = std::make_unique<Plot>(options.plots, options.force);
    const std::unique_ptr<RunFollower> follower = options.follow.empty() ? nullptr : makeFollower(options);
    const RunReport report = runSession(options, follower.get());
    std::vector<std::string> files;
    if (!options.output.empty() && options.output != "-") files.push_back(options.output);
    if (!options.levelsCsv.empty()) files.push_back(options.levelsCsv);
    files.insert(files.end(), report.levelsPlots.begin(), report.levelsPlots.end());
    if (plot) {
        const std::vector<std::string> made = plot->draw(loadTable(options, report), loadPlotCommands(options, report));
        files.insert(files.end(), made.begin(), made.end());
    }
    if (options.common.json) {
        std::cout << runJson(options, report, files);
        return;
    }
    if (options.common.quiet) {
        if (options.digest) std::cout << digestText(report.digest) << "\n";
        return;
    }
    // With the sound on standard output the summary must not get into it.
    const bool soundOnOutput = options.output == "-";
    std::ostream &out = soundOnOutput ? std::cerr : std::cout;
    out << runText(options, report, Style(options.common.colour, soundOnOutput ? stderr : stdout));
    for (const std::string &file : files)
        out << "wrote    " << file << (file == options.output ? " (" + report.sampleText + ")" : "") << "\n";
}

}  // namespace

void addRunVerb(CLI::App &app, FollowerMaker makeFollower) {
    auto options = std::make_shared<RunOptions>();
    CLI::App *verb = app.add_subcommand("run", "Play a sound file through an engine into a file, and measure the run");
    addRunOptions(*verb, *options);
    verb->callback([options, makeFollower = std::move(makeFollower)] { run(*options, makeFollower); });
}

}  // namespace vx
