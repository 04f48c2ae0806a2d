// SPDX-License-Identifier: MIT
//
// What `vx run` was asked for: the command line, checked.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "tools/vx/console.h"

namespace CLI {
class App;
}

namespace vx {

struct RunOptions {
    CommonOptions common;
    std::string input;
    std::string output;
    std::optional<std::string> engine;  // nothing: the endpoint's if one is followed, else the sample engine
    std::optional<std::string> platform;
    int hostType = 0;
    uint32_t hardware = 0;
    std::optional<std::string> commandLine;
    std::string fileLayout;
    std::string layout;
    std::string outputLayout;
    int block = 480;
    std::vector<std::string> parameters;
    std::vector<std::string> settings;
    std::optional<double> seconds;
    int loops = 1;
    int recordRate = 0;
    std::string bits;
    std::vector<std::string> plots;
    std::vector<std::string> levelsPlots;
    std::string levelsCsv;
    std::string follow;  // an endpoint; empty: none
    std::string apo = "EFX";
    bool realTime = false;
    bool digest = false;
    bool force = false;
};

inline constexpr const char *kUsualEngine = "SampleEngine";

void addRunOptions(CLI::App &verb, RunOptions &options);

// What the parser cannot see: options that exclude each other or mean nothing together.
void checkRunOptions(const RunOptions &options);

}  // namespace vx
