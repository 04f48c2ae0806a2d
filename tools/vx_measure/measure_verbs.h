// SPDX-License-Identifier: MIT
//
// The verb groups `vx measure` and `vx signal`. addMeasureVerbs calls the functions behind it, one a subcommand.
#pragma once

namespace CLI {
class App;
}

namespace vx {

void addMeasureVerbs(CLI::App &app, int &exitStatus);
void addSignalVerb(CLI::App &app, int &exitStatus);

void addSweepVerb(CLI::App &measure, int &exitStatus);
void addPolarityVerb(CLI::App &measure, int &exitStatus);
void addSpectrumVerb(CLI::App &measure, int &exitStatus);
void addMeterVerb(CLI::App &measure, int &exitStatus);
void addLoadVerb(CLI::App &measure, int &exitStatus);
void addEqualiserVerb(CLI::App &measure, int &exitStatus);

}  // namespace vx
