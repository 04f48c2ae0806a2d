// SPDX-License-Identifier: MIT
//
// One layer of proof around the blocks of a run. Each program of this folder links one: the real-time sanitizer, the trap of system
// calls, the count of page faults, the marks for a log of DLL calls.
#pragma once

namespace realtime {

// How the layer wants to be used.
struct WatchNeeds {
    int warmBlocks;     // of each case, before the watch begins
    int watchedBlocks;  // of each case
};
WatchNeeds watchNeeds();

// On the thread that runs the blocks.
void beginWatch();
void enterBlock();
void leaveBlock();

// Prints what the layer saw in `blocks` blocks; true if nothing was wrong.
bool endWatch(long blocks);

}  // namespace realtime
