// SPDX-License-Identifier: MIT
//
// One of the library's analysers in use: reads it as often as it has heard half a transform of new samples, averages the power, and
// turns it into levels. Says of each band that cannot be told why.
#pragma once

#include <string>
#include <vector>

#include "tools/vx_measure/band_grid.h"
#include "tools/vx_measure/rig.h"

namespace vx {

struct SpectrumSettings {
    std::string tap = "record";
    std::string listen = "mean";
    int bandsPerOctave = 3;
    int fftSize = 0;  // 0: the largest that fits, up to 65536
    bool atCentres = false;
};

struct SpectrumBand {
    double centreHz = 0.0;
    double lowestHz = 0.0;
    double highestHz = 0.0;
    double levelDb = 0.0;  // 0 dB: a sine at full scale; -infinity for silence; NaN if not measurable
    std::string why;       // not measurable
};

// What --tap names, as the library numbers them.
int analyserOf(const std::string &tap);

// The transform size in use at a rate; fails for one that is no power of two or does not fit.
int fftSizeOf(const SpectrumSettings &settings, int rate);

// What the levels mean.
std::string spectrumDefinition(const SpectrumSettings &settings, int rate);

class SpectrumReader {
  public:
    // Switches the analyser on.
    SpectrumReader(Rig &rig, const SpectrumSettings &settings, int analyser);

    // Samples between two readouts that share none.
    uint64_t hop() const { return static_cast<uint64_t>(fftSize_ / 2); }
    // Takes what is there into the mean.
    void read();
    // What is there goes into no mean.
    void skip();
    void forget() {
        readouts_ = 0;
        power_.assign(power_.size(), 0.0);
    }
    int readouts() const { return readouts_; }

    // The mean of all readouts since the beginning, or since forget.
    std::vector<SpectrumBand> bands() const;

  private:
    const float *readout();
    std::string whyNot(size_t band) const;

    Rig &rig_;
    SpectrumSettings settings_;
    int analyser_;
    int fftSize_;
    BandGrid grid_;
    std::vector<double> power_;
    int readouts_ = 0;
};

}  // namespace vx
