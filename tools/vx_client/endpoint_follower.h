// SPDX-License-Identifier: MIT
//
// The receiving side of an effect slot, for `vx run --follow`: what applications change reaches the engine through the host while
// blocks run, as an audio processing object does it.
#pragma once

#include <memory>

#include "tools/vx/run_follower.h"

namespace vx {

std::unique_ptr<RunFollower> followEndpoint(const RunOptions &options);

}  // namespace vx
