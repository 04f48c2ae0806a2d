// SPDX-License-Identifier: MIT
//
// The run itself: a file through the library and an engine into a file, block by block, and what was counted on the way.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "tools/vx/audio_file.h"
#include "tools/vx/host_session.h"
#include "tools/vx/level_meter.h"
#include "tools/vx/load_statistics.h"
#include "tools/vx/run_follower.h"
#include "tools/vx/run_options.h"

namespace vx {

struct RunReport {
    AudioFormat file;
    uint32_t fileMask = 0;
    uint32_t inputMask = 0;
    uint32_t outputMask = 0;
    std::string engineFile;
    std::vector<ParameterAnswer> parameters;
    uint64_t frames = 0;
    uint64_t silentFrames = 0;  // in blocks that the library called silent
    std::vector<ChannelLevel> inputLevels;
    std::vector<ChannelLevel> outputLevels;
    LoadStatistics load;
    uint64_t digest = 0;
    double wallSeconds = 0.0;
    std::string sampleText;  // of the output file
    std::vector<FollowedChange> changes;
    std::vector<std::string> levelsPlots;  // files that were drawn

    double blockNs(int block) const { return 1e9 * block / file.sampleRate; }
};

// `follower` may be null.
RunReport runSession(const RunOptions &options, RunFollower *follower);

}  // namespace vx
