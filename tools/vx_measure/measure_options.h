// SPDX-License-Identifier: MIT
//
// What all of `vx measure` is asked for: the engine and the format, the chain, and where results go.
#pragma once

#include <string>
#include <vector>

#include "tools/vx/console.h"

namespace CLI {
class App;
}

namespace vx {

struct MeasureOptions {
    CommonOptions common;
    // Engine and format.
    std::string engine = "SampleEngine";
    std::vector<std::string> settings;
    std::string layout = "0x1";
    int rate = 0;  // 0: the recording's, or 48000
    int block = 480;
    // The chain: simulated, or a pair of files.
    std::string plant;
    uint32_t seed = 1;
    std::string play;
    std::string recorded;
    // Results.
    std::string csv;
    std::vector<std::string> plots;
    bool force = false;

    // Whether the host is only played into a file, to be recorded by hand.
    bool onlyPlays() const { return !play.empty() && recorded.empty() && plant.empty(); }
    // For titles and reports: "a wire", the plant's parts, or the recording.
    std::string chainText() const;
};

void addEngineAndFormat(CLI::App &verb, MeasureOptions &options);
void addChain(CLI::App &verb, MeasureOptions &options);
void addResults(CLI::App &verb, MeasureOptions &options);

// What the parser cannot see: options that exclude each other.
void checkMeasureOptions(const MeasureOptions &options);

}  // namespace vx
