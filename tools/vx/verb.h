// SPDX-License-Identifier: MIT
//
// What every verb of vx shares with the program: the exit statuses, the one way to fail, and how a verb is registered. A verb group
// has a function `addXVerbs(app, exitStatus)` that adds its subcommands; main calls them all. A subcommand's callback does the
// work, stores an exit status other than 0 if there is one, and throws Failure for anything that ends it.
#pragma once

#include <CLI/CLI.hpp>
#include <stdexcept>
#include <string>

namespace vx {

enum class ExitStatus : int {
    ok = 0,
    found = 1,   // a check failed or something was found
    usage = 2,   // the command line
    input = 3,   // an input file, engine or endpoint is not usable
    system = 4,  // the system refused: rights, device busy, disk full
};

// Ends a verb. The message says what, what was found, what was expected, and what to do; main prints it behind "vx: ".
class Failure : public std::runtime_error {
  public:
    Failure(ExitStatus exitStatus, const std::string &message) : std::runtime_error(message), status(exitStatus) {}

    ExitStatus status;
};

void addLevelsVerb(CLI::App &app, int &exitStatus);
void addJoinVerb(CLI::App &app, int &exitStatus);

}  // namespace vx
