// SPDX-License-Identifier: MIT
#include "tools/vx/levels_plot.h"

#include <algorithm>
#include <cmath>

#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr double kWindowSeconds = 0.05;
constexpr double kFloorDb = -90.0;

double powerOf(const float *samples, size_t count) {
    double sum = 0.0;
    for (size_t i = 0; i < count; ++i)
        if (std::isfinite(samples[i])) sum += static_cast<double>(samples[i]) * static_cast<double>(samples[i]);
    return sum;
}

double decibels(double power, uint64_t samples) {
    return samples == 0 || power <= 0.0 ? kFloorDb : std::max(kFloorDb, 10.0 * std::log10(power / static_cast<double>(samples)));
}

}  // namespace

LevelsPlot::LevelsPlot(const std::vector<std::string> &paths, bool force, int sampleRate)
    : plot_(paths, force), sampleRate_(sampleRate), windowFrames_(static_cast<uint64_t>(std::lround(kWindowSeconds * sampleRate))) {
    table_.columns = {"seconds", "in_rms_db", "out_rms_db"};
}

void LevelsPlot::feed(const float *input, size_t inputSamples, const float *output, size_t outputSamples, size_t frames) {
    inputPower_ += powerOf(input, inputSamples);
    outputPower_ += powerOf(output, outputSamples);
    inputSamples_ += inputSamples;
    outputSamples_ += outputSamples;
    inWindow_ += frames;
    if (inWindow_ >= windowFrames_) finishWindow();
}

void LevelsPlot::finishWindow() {
    const double middle = (static_cast<double>(frame_) + static_cast<double>(inWindow_) / 2.0) / sampleRate_;
    table_.rows.push_back({middle, decibels(inputPower_, inputSamples_), decibels(outputPower_, outputSamples_)});
    frame_ += inWindow_;
    inWindow_ = inputSamples_ = outputSamples_ = 0;
    inputPower_ = outputPower_ = 0.0;
}

std::vector<std::string> LevelsPlot::draw(const std::string &title, const std::vector<FollowedChange> &changes) {
    if (inWindow_ > 0) finishWindow();
    std::string text = "set title \"" + gnuplotText(title) + "\" noenhanced\n";
    text += "set xlabel \"seconds of audio\"\nset ylabel \"RMS of all channels over 50 ms, dB of full scale\"\nset key top right\n";
    double highest = kFloorDb;
    for (const auto &row : table_.rows) highest = std::max({highest, row[1], row[2]});
    const double top = std::ceil(highest / 10.0) * 10.0 + 20.0;
    text += textf("set yrange [%g:%g]\n", top - 90.0, top);
    double height = top - 4.0;
    for (const FollowedChange &change : changes) {
        text += textf("set arrow from %.6f,%g to %.6f,%g nohead lw 1.2 dt 2 lc rgb '#c0392b' front\n", change.seconds, top - 90.0,
                      change.seconds, height);
        text += textf("set label \" %s\" at %.6f,%g left tc rgb '#c0392b' font ',10' noenhanced front\n",
                      gnuplotText(change.text).c_str(), change.seconds, height);
        height = height < top - 16.0 ? top - 4.0 : height - 4.0;
    }
    text +=
        "plot $data using 1:2 with lines lw 1 lc rgb '#999999' title \"in\", "
        "$data using 1:3 with lines lw 2 lc rgb '#1f6fb4' title \"out\"\n";
    return plot_.draw(table_, text);
}

}  // namespace vx
