// SPDX-License-Identifier: MIT
//
// The head of a block: which test signal, if any, takes the place of the caller's samples. Real-time safe.
#pragma once

#include "host/host_context.h"

namespace vxcomn {

// What the generators leave to the rest of the block.
enum class SignalPath : uint8_t {
    whole,        // silence test, meters, analysers, mixer and engine run
    measuredOnly  // all of these are skipped
};

// Runs the first mode that is switched on, of: single-channel pink noise, white noise, pink noise, sines, and the sweeps and tones
// of single channels. `channels` is at most 8. [render]
VXCOMN_RT SignalPath generateTestSignals(LibraryContext &context, float *const *chan, int channels, int frames) noexcept;

}  // namespace vxcomn
