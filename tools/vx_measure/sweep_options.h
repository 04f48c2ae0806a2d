// SPDX-License-Identifier: MIT
//
// The sweep's own options, which `vx measure sweep` and `vx signal sweep` share.
#pragma once

#include <CLI/CLI.hpp>

#include "tools/vx_measure/sweep_measurement.h"

namespace vx {

void addSweepSettings(CLI::App &verb, SweepSettings &sweep);

}  // namespace vx
