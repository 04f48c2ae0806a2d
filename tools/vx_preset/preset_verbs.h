// SPDX-License-Identifier: MIT
//
// The verb group `vx preset`: presets and packages from readable JSON and back.
#pragma once

namespace CLI {
class App;
}

namespace vx {

// Adds `preset` with its verbs. The verb that ran leaves its exit status in `exitStatus`: 0 well, 1 something was found, 2 usage, 3
// an input is not usable, 4 the system refused. Messages go to the standard error stream.
void addPresetVerbs(CLI::App &app, int &exitStatus);

}  // namespace vx
