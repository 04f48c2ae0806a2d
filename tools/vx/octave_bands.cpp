// SPDX-License-Identifier: MIT
#include "tools/vx/octave_bands.h"

#include <algorithm>
#include <bit>
#include <complex>
#include <limits>
#include <numbers>

namespace vx {

const OctaveBand kOctaveBand[kOctaveBands] = {{"31.5", 31.25}, {"63", 62.5},   {"125", 125.0}, {"250", 250.0}, {"500", 500.0},
                                              {"1k", 1000.0},  {"2k", 2000.0}, {"4k", 4000.0}, {"8k", 8000.0}, {"16k", 16000.0}};

namespace {

using Spectrum = std::vector<std::complex<double>>;

constexpr double kFrameSeconds = 0.3;  // some seven cycles of the lowest band, a dozen bins in it
constexpr size_t kHops = 4;            // at this overlap the squared Hann windows add up to a constant
constexpr double kWindowSum = 1.5;     // that constant: the mean of the squared window, 3/8, times the overlap of 4

// Radix-2 transform in place; a power of two.
void transform(Spectrum &values) {
    const size_t size = values.size();
    for (size_t i = 1, j = 0; i < size; ++i) {
        size_t bit = size >> 1;
        for (; (j & bit) != 0; bit >>= 1) j ^= bit;
        j |= bit;
        if (i < j) std::swap(values[i], values[j]);
    }
    for (size_t length = 2; length <= size; length *= 2) {
        const double step = -2.0 * std::numbers::pi / static_cast<double>(length);
        std::vector<std::complex<double>> turn(length / 2);
        for (size_t k = 0; k < turn.size(); ++k) turn[k] = std::polar(1.0, step * static_cast<double>(k));
        for (size_t begin = 0; begin < size; begin += length)
            for (size_t k = 0; k < turn.size(); ++k) {
                const std::complex<double> upper = values[begin + k];
                const std::complex<double> lower = values[begin + k + turn.size()] * turn[k];
                values[begin + k] = upper + lower;
                values[begin + k + turn.size()] = upper - lower;
            }
    }
}

}  // namespace

OctaveAnalyser::OctaveAnalyser(int channels, int sampleRate)
    : channels_(static_cast<size_t>(channels)),
      sampleRate_(sampleRate),
      size_(std::bit_ceil(static_cast<size_t>(kFrameSeconds * sampleRate))),
      // The first frame holds only a quarter of new samples: so each sample lies in as many frames as any other.
      filled_(size_ - size_ / kHops),
      window_(size_),
      history_(channels_, std::vector<float>(size_)),
      power_(kOctaveBands) {
    for (size_t i = 0; i < size_; ++i)
        window_[i] = 0.5 - 0.5 * std::cos(2.0 * std::numbers::pi * static_cast<double>(i) / static_cast<double>(size_));
}

void OctaveAnalyser::feed(const float *interleaved, size_t frames) {
    frames_ += frames;
    for (size_t frame = 0; frame < frames; ++frame) {
        for (size_t channel = 0; channel < channels_; ++channel) {
            const float sample = interleaved[frame * channels_ + channel];
            history_[channel][filled_] = std::isfinite(sample) ? sample : 0.0F;
        }
        if (++filled_ == size_) analyseFrame();
    }
}

void OctaveAnalyser::analyseFrame() {
    const double binHz = static_cast<double>(sampleRate_) / static_cast<double>(size_);
    Spectrum spectrum(size_);
    for (std::vector<float> &samples : history_) {
        for (size_t i = 0; i < size_; ++i) spectrum[i] = window_[i] * static_cast<double>(samples[i]);
        transform(spectrum);
        for (int band = 0; band < kOctaveBands; ++band) {
            const double lowest = kOctaveBand[band].middleHz / std::numbers::sqrt2 / binHz;
            const double highest = kOctaveBand[band].middleHz * std::numbers::sqrt2 / binHz;
            for (auto bin = static_cast<size_t>(std::ceil(lowest)); static_cast<double>(bin) < highest && bin < size_ / 2; ++bin)
                power_[static_cast<size_t>(band)] += std::norm(spectrum[bin]);
        }
        std::move(samples.begin() + static_cast<std::ptrdiff_t>(size_ / kHops), samples.end(), samples.begin());
    }
    filled_ = size_ - size_ / kHops;
}

std::vector<double> OctaveAnalyser::finish() {
    const size_t counted = frames_;
    const std::vector<float> nothing(channels_);
    for (size_t i = 0; i < size_; ++i) feed(nothing.data(), 1);
    // Both halves of the spectrum over all frames are N * 1.5 times the sum of squares; a full-scale sine has a mean square of 1/2.
    const double scale = 2.0 /
                         (static_cast<double>(size_) * kWindowSum * static_cast<double>(std::max<size_t>(counted, 1)) *
                          static_cast<double>(channels_)) /
                         0.5;
    std::vector<double> levels;
    for (int band = 0; band < kOctaveBands; ++band) {
        const double decibels = 10.0 * std::log10(power_[static_cast<size_t>(band)] * scale);
        if (!isMeasurable(band, sampleRate_))
            levels.push_back(std::numeric_limits<double>::quiet_NaN());
        else
            levels.push_back(decibels < kSilenceDb ? -std::numeric_limits<double>::infinity() : decibels);
    }
    return levels;
}

}  // namespace vx
