// SPDX-License-Identifier: MIT
//
// A simulated chain from the host's output to its capture side: loudspeaker, room and microphone as far as measurements care.
// Harmonics of stated order and level, a band-limited response, gain, polarity, delay, noise; in this order.
//
// The harmonics are those of a sine of full scale, exactly: Chebyshev polynomials turn it into them. The polynomials run at eight
// times the rate, so that what lies beyond half the rate is filtered away, as a converter does, instead of folding back.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <vector>

namespace vx {

struct Harmonic {
    int order = 2;
    double amplitude = 0.0;  // over the fundamental's, of a sine of full scale
};

struct PlantDescription {
    std::string text;  // as asked for; empty for a wire
    double delaySeconds = 0.0;
    double gain = 1.0;  // below 0 it inverts
    std::vector<Harmonic> harmonics;
    double lowestHz = 0.0;   // 0: no limit
    double highestHz = 0.0;  // 0: no limit
    double noise = 0.0;      // root mean square, full scale 1.0
};

// "delay=12ms,gain=-6dB,invert,h2=-40dB,h3=-50dB,band=80-16000,noise=-70dB"; fails with what is wrong.
PlantDescription parsePlant(const std::string &text, int sampleRate);

// What parsePlant takes, for --help.
std::string plantParts();

// Polynomials between two filters, 32 samples late.
class HarmonicShaper {
  public:
    explicit HarmonicShaper(const std::vector<Harmonic> &harmonics);

    double process(double sample);

  private:
    static constexpr int kFactor = 8;
    static constexpr int kHalf = 128;  // samples of the fast rate
    static constexpr int kLength = 2 * kHalf + 1;
    static constexpr int kPast = kHalf * 2 / kFactor + 1;

    double shape(double sample) const;

    std::array<double, kLength> filter_ = {};
    std::array<double, kPast> slow_ = {};       // newest first
    std::array<double, 2 *kLength> fast_ = {};  // a ring, held twice so that a stretch never wraps
    int fastPosition_ = 0;
    double slowOutput_ = 0.0;
    std::vector<Harmonic> harmonics_;
};

// A second-order low or high pass without resonance.
class PassFilter {
  public:
    PassFilter(double hz, int sampleRate, bool high);

    double process(double sample);

  private:
    double b0_, b1_, b2_, a1_, a2_;
    double x1_ = 0.0, x2_ = 0.0, y1_ = 0.0, y2_ = 0.0;
};

// One channel. The same seed gives the same noise.
class Plant {
  public:
    Plant(const PlantDescription &description, int sampleRate, uint32_t seed);

    void process(const float *input, float *output, size_t count);

  private:
    double gain_;
    double noise_;
    std::optional<HarmonicShaper> shaper_;
    std::vector<PassFilter> filters_;
    std::vector<double> delay_;
    size_t delayPosition_ = 0;
    std::mt19937 random_;
};

}  // namespace vx
