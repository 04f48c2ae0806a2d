// SPDX-License-Identifier: MIT
//
// What every verb of vx shares with the program: how a verb is registered, and how it fails (failure.h). A verb group
// has a function `addXVerbs(app, exitStatus)` that adds its subcommands; main calls them all. A subcommand's callback does the
// work, stores an exit status other than 0 if there is one, and throws Failure for anything that ends it.
#pragma once

#include <CLI/CLI.hpp>

#include "tools/vx/failure.h"

namespace vx {

void addLevelsVerb(CLI::App &app, int &exitStatus);
void addJoinVerb(CLI::App &app, int &exitStatus);

}  // namespace vx
