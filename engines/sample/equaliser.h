// SPDX-License-Identifier: MIT
//
// Component 5, the ten-band equaliser: ten bells one behind the other. A band's record names its type, frequency, quality and gain;
// type 1 is the bell, every other type and any frequency that the sample rate cannot hold leave the band neutral. Control threads
// design the bands, the render thread runs them.
#pragma once

#include <array>

#include "filter_stage.h"

namespace sample_engine {

inline constexpr int kEqualiserBands = 10;
inline constexpr int kBellType = 1;

struct EqualiserBand {
    int type = kBellType;
    double frequencyHz = 1000.0;
    double quality = 1.44;
    double gainDecibels = 0.0;
};

using EqualiserShapes = std::array<FilterShape, kEqualiserBands>;

FilterShape designBand(const EqualiserBand &band, double sampleRate);

class Equaliser {
  public:
    void snap(const EqualiserShapes &shapes) {
        for (int band = 0; band < kEqualiserBands; ++band) bands_[band].snap(shapes[band]);
    }
    void aim(const EqualiserShapes &shapes, int frames) {
        for (int band = 0; band < kEqualiserBands; ++band) bands_[band].aim(shapes[band], frames);
    }
    void process(Block &block, int begin, int count) {
        for (auto &band : bands_) band.process(block, begin, count);
    }

  private:
    std::array<FilterStage<Straight>, kEqualiserBands> bands_;
};

}  // namespace sample_engine
