// SPDX-License-Identifier: MIT
//
// The table of --levels-csv: a row a block with the linear peaks of every channel on both sides and the load.
#pragma once

#include <string>
#include <vector>

#include "tools/vx/layout.h"
#include "tools/vx/output_file.h"
#include "tools/vx/text.h"

namespace vx {

class LevelsCsv {
  public:
    LevelsCsv(const std::string &path, bool force, uint32_t inputMask, uint32_t outputMask, int sampleRate)
        : file_(path, force), sampleRate_(sampleRate) {
        std::string head = "seconds";
        for (int channel = 0; channel < channelCount(inputMask); ++channel) head += ",in_" + speakerName(inputMask, channel);
        for (int channel = 0; channel < channelCount(outputMask); ++channel) head += ",out_" + speakerName(outputMask, channel);
        file_.writeText(head + ",load_us\n");
    }

    void add(uint64_t frame, const std::vector<float> &input, const std::vector<float> &output, double nanoseconds) {
        std::string row = textf("%.6f", static_cast<double>(frame) / sampleRate_);
        for (const float peak : input) row += textf(",%.9g", static_cast<double>(peak));
        for (const float peak : output) row += textf(",%.9g", static_cast<double>(peak));
        file_.writeText(row + textf(",%.3f\n", nanoseconds / 1000.0));
    }

    void finish() { file_.commit(); }

  private:
    OutputFile file_;
    int sampleRate_;
};

}  // namespace vx
