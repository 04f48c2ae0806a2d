// SPDX-License-Identifier: MIT
#include "tools/vx_measure/plant.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include "tools/vx/failure.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr double kMostDelay = 1.0;  // seconds
constexpr int kHighestOrder = 9;
constexpr double kLowestDb = -160.0;
constexpr double kHighestGainDb = 40.0;
// No loudspeaker sounds at 0 Hz: what an even polynomial makes of a sine's mean goes.
constexpr double kLowestSoundHz = 5.0;
constexpr double kKaiserBeta = 8.0;  // 80 dB

[[noreturn]] void failPart(const std::string &part, const std::string &expected) {
    throw Failure(ExitStatus::usage, "--plant: \"" + part + "\": expected " + expected);
}

double decibels(const std::string &part, const std::string &value, double highest) {
    const std::string expected = textf("decibels from %gdB to %gdB", kLowestDb, highest);
    const std::string text = lowered(value);
    if (!text.ends_with("db")) failPart(part, expected);
    const auto number = parseNumber(text.substr(0, text.size() - 2));
    if (!number || *number < kLowestDb || *number > highest) failPart(part, expected);
    return std::pow(10.0, *number / 20.0);
}

double delayOf(const std::string &part, const std::string &value) {
    const std::string text = lowered(value);
    const auto number = text.ends_with("ms") ? parseNumber(text.substr(0, text.size() - 2)) : std::nullopt;
    if (!number || *number < 0.0 || *number > 1000.0 * kMostDelay) failPart(part, "a delay from 0ms to 1000ms");
    return *number / 1000.0;
}

void setBand(PlantDescription &plant, const std::string &part, const std::string &value, int sampleRate) {
    const size_t dash = value.find('-');
    const auto low = parseNumber(value.substr(0, dash));
    const auto high = dash == std::string::npos ? std::nullopt : parseNumber(value.substr(dash + 1));
    if (!low || !high || *low < 1.0 || *low >= *high || *high >= sampleRate / 2.0)
        failPart(part, textf("LOW-HIGH in Hz, from 1 to below %g, such as band=80-16000", sampleRate / 2.0));
    plant.lowestHz = *low;
    plant.highestHz = *high;
}

// The zeroth modified Bessel function of the first kind, by its series.
double bessel(double x) {
    double sum = 1.0, term = 1.0;
    for (int k = 1; k < 40; ++k) {
        term *= x / 2.0 / k * (x / 2.0 / k);
        sum += term;
    }
    return sum;
}

double chebyshev(int order, double x) {
    double before = 1.0, value = x;
    for (int n = 2; n <= order; ++n) {
        const double next = 2.0 * x * value - before;
        before = value;
        value = next;
    }
    return value;
}

}  // namespace

std::string plantParts() {
    return "  delay=12ms     0 to 1000 ms\n"
           "  gain=-6dB      -160 to 40 dB\n"
           "  invert         the other polarity\n"
           "  h2=-40dB       harmonic 2 of a sine at full scale, over its fundamental; h2 to h9, up to 0 dB\n"
           "  band=80-16000  second-order high pass and low pass\n"
           "  noise=-70dB    white, root mean square over full scale 1.0\n";
}

PlantDescription parsePlant(const std::string &text, int sampleRate) {
    PlantDescription plant;
    plant.text = text;
    if (text.empty()) return plant;
    std::vector<std::string> seen;
    for (const std::string &part : split(text, ',')) {
        const size_t equals = part.find('=');
        const std::string name = lowered(part.substr(0, equals));
        const std::string value = equals == std::string::npos ? "" : part.substr(equals + 1);
        if (std::find(seen.begin(), seen.end(), name) != seen.end()) failPart(part, "each part once");
        seen.push_back(name);
        if (name == "delay")
            plant.delaySeconds = delayOf(part, value);
        else if (name == "gain")
            plant.gain *= decibels(part, value, kHighestGainDb);
        else if (part == "invert")
            plant.gain = -plant.gain;
        else if (name == "band")
            setBand(plant, part, value, sampleRate);
        else if (name == "noise")
            plant.noise = decibels(part, value, 0.0);
        else if (name.size() == 2 && name[0] == 'h' && name[1] >= '2' && name[1] <= '0' + kHighestOrder)
            plant.harmonics.push_back({name[1] - '0', decibels(part, value, 0.0)});
        else
            failPart(part, "delay=, gain=, invert, h2= to h9=, band= or noise=, such as delay=12ms,h2=-40dB");
    }
    return plant;
}

HarmonicShaper::HarmonicShaper(const std::vector<Harmonic> &harmonics) : harmonics_(harmonics) {
    for (int i = 0; i < kLength; ++i) {
        const double offset = i - kHalf;
        const double place = offset / kHalf;
        const double turn = std::numbers::pi * offset / kFactor;
        const double window = bessel(kKaiserBeta * std::sqrt(1.0 - place * place)) / bessel(kKaiserBeta);
        filter_[static_cast<size_t>(i)] = (offset == 0.0 ? 1.0 : std::sin(turn) / turn) * window / kFactor;
    }
}

double HarmonicShaper::shape(double sample) const {
    double sum = sample;
    for (const Harmonic &harmonic : harmonics_)  // silence stays silence
        sum += harmonic.amplitude * (chebyshev(harmonic.order, sample) - chebyshev(harmonic.order, 0.0));
    return sum;
}

double HarmonicShaper::process(double sample) {
    std::copy_backward(slow_.begin(), slow_.end() - 1, slow_.end());
    slow_[0] = sample;
    for (int phase = 0; phase < kFactor; ++phase) {
        double between = 0.0;
        for (int tap = phase, past = 0; tap < kLength; tap += kFactor, ++past)
            between += filter_[static_cast<size_t>(tap)] * slow_[static_cast<size_t>(past)];
        fastPosition_ = (fastPosition_ + kLength - 1) % kLength;
        const double shaped = shape(kFactor * between);
        fast_[static_cast<size_t>(fastPosition_)] = fast_[static_cast<size_t>(fastPosition_ + kLength)] = shaped;
        if (phase > 0) continue;
        // The first phase of a sample stands where the sample does: both filters together are late by whole samples.
        slowOutput_ = 0.0;
        for (int tap = 0; tap < kLength; ++tap)
            slowOutput_ += filter_[static_cast<size_t>(tap)] * fast_[static_cast<size_t>(fastPosition_ + tap)];
    }
    return slowOutput_;
}

PassFilter::PassFilter(double hz, int sampleRate, bool high) {
    const double w = 2.0 * std::numbers::pi * hz / sampleRate;
    const double alpha = std::sin(w) / std::numbers::sqrt2;
    const double scale = 1.0 / (1.0 + alpha);
    const double edge = (high ? 1.0 + std::cos(w) : 1.0 - std::cos(w)) * scale;
    b0_ = b2_ = edge / 2.0;
    b1_ = high ? -edge : edge;
    a1_ = -2.0 * std::cos(w) * scale;
    a2_ = (1.0 - alpha) * scale;
}

double PassFilter::process(double sample) {
    const double y = b0_ * sample + b1_ * x1_ + b2_ * x2_ - a1_ * y1_ - a2_ * y2_;
    x2_ = x1_;
    x1_ = sample;
    y2_ = y1_;
    y1_ = y;
    return y;
}

Plant::Plant(const PlantDescription &description, int sampleRate, uint32_t seed)
    : gain_(description.gain),
      noise_(description.noise * std::numbers::sqrt3),  // the range of uniform noise of that power
      delay_(static_cast<size_t>(std::lround(description.delaySeconds * sampleRate)) + 1),
      random_(seed) {
    if (!description.harmonics.empty()) {
        shaper_.emplace(description.harmonics);
        filters_.emplace_back(kLowestSoundHz, sampleRate, true);
    }
    if (description.lowestHz > 0.0) filters_.emplace_back(description.lowestHz, sampleRate, true);
    if (description.highestHz > 0.0) filters_.emplace_back(description.highestHz, sampleRate, false);
}

void Plant::process(const float *input, float *output, size_t count) {
    for (size_t i = 0; i < count; ++i) {
        double sample = static_cast<double>(input[i]);
        if (shaper_) sample = shaper_->process(sample);
        for (PassFilter &filter : filters_) sample = filter.process(sample);
        delay_[delayPosition_] = sample * gain_;
        delayPosition_ = (delayPosition_ + 1) % delay_.size();
        sample = delay_[delayPosition_];
        if (noise_ > 0.0) sample += noise_ * (static_cast<double>(random_()) / 2147483647.5 - 1.0);
        output[i] = static_cast<float>(sample);
    }
}

}  // namespace vx
