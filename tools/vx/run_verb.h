// SPDX-License-Identifier: MIT
//
// The verb `vx run`.
#pragma once

#include <CLI/CLI.hpp>

#include "tools/vx/run_follower.h"

namespace vx {

// `makeFollower` makes what --follow asks for.
void addRunVerb(CLI::App &app, FollowerMaker makeFollower);

}  // namespace vx
