// SPDX-License-Identifier: MIT
//
// The level of a recording in each octave band from 31.5 Hz to 16 kHz: the mean power of all channels over the whole length, from
// transforms of overlapping Hann frames in which every sample counts the same. 0 dB is the power of a sine at full scale.
#pragma once

#include <cmath>
#include <cstddef>
#include <vector>

namespace vx {

inline constexpr int kOctaveBands = 10;

struct OctaveBand {
    const char *name;  // the nominal frequency, as it is written
    double middleHz;   // exact: 1000 * 2^n
};
extern const OctaveBand kOctaveBand[kOctaveBands];

// Below this nothing is told but "silent".
inline constexpr double kSilenceDb = -150.0;
// What cannot be measured, since the band reaches beyond half the sample rate.
inline bool isMeasurable(int band, int sampleRate) {
    return kOctaveBand[band].middleHz * std::sqrt(2.0) <= sampleRate / 2.0;
}

class OctaveAnalyser {
  public:
    OctaveAnalyser(int channels, int sampleRate);

    void feed(const float *interleaved, size_t frames);

    // Ends the recording. Decibels a band; NaN for one that is not measurable, -infinity for silence.
    std::vector<double> finish();

  private:
    void analyseFrame();

    size_t channels_;
    int sampleRate_;
    size_t size_;
    size_t filled_;
    size_t frames_ = 0;
    std::vector<double> window_;
    std::vector<std::vector<float>> history_;  // the frame in work, a vector a channel
    std::vector<double> power_;
};

}  // namespace vx
