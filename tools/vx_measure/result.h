// SPDX-License-Identifier: MIT
//
// A result on its way out: as a table for a person, one JSON document, CSV and pictures. All files are checked before anything is
// measured, so that nothing is written over unasked and no long measurement is lost to a wrong name.
#pragma once

#include <memory>
#include <nlohmann/json.hpp>
#include <string>

#include "tools/vx/plot.h"
#include "tools/vx_measure/measure_options.h"

namespace vx {

struct Result {
    std::string text;
    nlohmann::ordered_json json;
    Table table;
    std::string plotCommands;
};

class ResultFiles {
  public:
    explicit ResultFiles(const MeasureOptions &options);

    void deliver(const Result &result);

  private:
    MeasureOptions options_;
    std::unique_ptr<Plot> plot_;
};

// Whoever only plays says so, and what to do next.
void tellPlayed(const MeasureOptions &options, double seconds);

nlohmann::ordered_json numberOrNull(double value);

// "measured 2026-05-04 12:30 UTC"
std::string whenText();

// A title: what, and in small letters the definition, which may break behind a semicolon, when it was measured and on which chain.
std::string titleCommands(const std::string &what, const std::string &definition, const std::string &chain);

// A logarithmic frequency axis with ticks at 1-2-5.
std::string frequencyAxis(double lowestHz, double highestHz);

// "31.5 Hz", "1.25 kHz"
std::string frequencyText(double hz);

}  // namespace vx
