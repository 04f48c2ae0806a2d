// SPDX-License-Identifier: MIT
//
// vx, the tool of the library: one program with verbs. Main registers the verb groups, parses, and turns every way to fail into a
// message on standard error and an exit status.
#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdio>
#include <exception>
#include <iostream>

#include "tools/vx/completion.h"
#include "tools/vx/run_verb.h"
#include "tools/vx/system.h"
#include "tools/vx/verb.h"
#include "tools/vx_client/client_verbs.h"
#include "tools/vx_client/endpoint_follower.h"
#include "tools/vx_measure/measure_verbs.h"
#include "tools/vx_preset/preset_verbs.h"

namespace {

constexpr const char *kVersion = "vx 2.1.0";

int statusOf(vx::ExitStatus status) {
    return static_cast<int>(status);
}

int failed(const std::string &message, vx::ExitStatus status) {
    std::cout.flush();
    std::cerr << "vx: " << message << "\n";
    return statusOf(status);
}

// CLI11's own statuses begin at 100; only asking for help or the version is no error.
int endedByParser(const CLI::App &app, const CLI::ParseError &error) {
    if (error.get_exit_code() == 0) return app.exit(error);
    const auto chosen = app.get_subcommands();
    const std::string help = chosen.empty() ? "vx --help" : "vx " + chosen.front()->get_name() + " --help";
    return failed(std::string(error.what()) + "; " + help + " tells the usage", vx::ExitStatus::usage);
}

int runVx(int argc, char **argv) {
    CLI::App app("Runs, measures and inspects audio engines and their presets, and drives the effects of audio endpoints.", "vx");
    app.require_subcommand(1);
    app.allow_windows_style_options(false);  // a path may begin with a slash
    app.set_help_flag("-h,--help", "Print this help");
    app.set_version_flag("-V,--version", kVersion, "Print the version");
    app.footer(
        "vx VERB --help tells more about a verb.\n"
        "Exit status: 0 well; 1 a check failed or something was found; 2 usage; 3 an input is not usable; 4 the system refused.\n"
        "Environment: NO_COLOR turns colour off; VX_GNUPLOT names the gnuplot to draw with.");
    int exitStatus = 0;
    vx::addRunVerb(app, vx::followEndpoint);
    vx::addLevelsVerb(app, exitStatus);
    vx::addJoinVerb(app, exitStatus);
    vx::addMeasureVerbs(app, exitStatus);
    vx::addSignalVerb(app, exitStatus);
    vx::addPresetVerbs(app, exitStatus);
    vx::addClientVerbs(app, exitStatus);
    vx::addCompleteVerb(app);
    std::vector<std::string> arguments = vx::commandLine(argc, argv);
    std::reverse(arguments.begin(), arguments.end());  // as the parser takes them
    try {
        app.parse(arguments);
    } catch (const CLI::ParseError &error) {
        return endedByParser(app, error);
    }
    std::cout.flush();
    if (!std::cout) return failed("standard output cannot be written", vx::ExitStatus::system);
    return exitStatus;
}

}  // namespace

int main(int argc, char **argv) {
    try {
        return runVx(argc, argv);
    } catch (const vx::Failure &failure) {
        return failed(failure.what(), failure.status);
    } catch (const std::bad_alloc &) {
        return failed("out of memory", vx::ExitStatus::system);
    } catch (const std::exception &error) {
        return failed(error.what(), vx::ExitStatus::system);
    }
}
