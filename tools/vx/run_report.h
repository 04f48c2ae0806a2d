// SPDX-License-Identifier: MIT
//
// What `vx run` tells at its end: as text for a person, as JSON for a script, as a plot of the load.
#pragma once

#include <string>
#include <vector>

#include "tools/vx/plot.h"
#include "tools/vx/run_session.h"

namespace vx {

std::string runText(const RunOptions &options, const RunReport &report, const Style &style);
std::string runJson(const RunOptions &options, const RunReport &report, const std::vector<std::string> &files);

Table loadTable(const RunOptions &options, const RunReport &report);
std::string loadPlotCommands(const RunOptions &options, const RunReport &report);

std::string digestText(uint64_t digest);

// What changed, by whom, and how long it took.
std::string changeText(const FollowedChange &change);

}  // namespace vx
