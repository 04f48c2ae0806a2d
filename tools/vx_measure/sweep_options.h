// SPDX-License-Identifier: MIT
//
// The sweep's own options, which `vx measure sweep` and `vx signal sweep` share.
#pragma once

#include "tools/vx_measure/sweep_measurement.h"

namespace CLI {
class App;
}

namespace vx {

void addSweepSettings(CLI::App &verb, SweepSettings &sweep);

}  // namespace vx
