// SPDX-License-Identifier: MIT
#include "tools/vx_measure/live_bars.h"

#include <algorithm>
#include <cmath>
#include <iostream>
#include <thread>

#include "tools/vx/system.h"
#include "tools/vx/text.h"
#include "tools/vx_measure/result.h"

namespace vx {

namespace {

constexpr double kBottomDb = -80.0;
constexpr double kTopDb = 0.0;
constexpr int kBesideBar = 22;  // frequency and level
constexpr int kWidestBar = 80;

}  // namespace

std::string barLines(const std::vector<SpectrumBand> &bands, double bottomDb, double topDb, int width, const Style &style) {
    std::string text;
    for (const SpectrumBand &band : bands) {
        if (!band.why.empty()) continue;
        const double share = (band.levelDb - bottomDb) / (topDb - bottomDb);  // -infinity for silence
        const auto filled = static_cast<size_t>(std::lround(std::clamp(share, 0.0, 1.0) * width));
        const std::string level = std::isinf(band.levelDb) ? "silent" : textf("%.1f", band.levelDb);
        text += textf("%9s %8s  ", frequencyText(band.centreHz).c_str(), level.c_str());
        text += style.good(std::string(filled, '#')) + std::string(static_cast<size_t>(width) - filled, ' ') + "|\n";
    }
    return text;
}

LiveBars::LiveBars(const std::string &colour)
    : style_(colour, stdout), terminal_(isTerminal(stdout)), start_(std::chrono::steady_clock::now()) {}

void LiveBars::show(const std::vector<SpectrumBand> &bands, double seconds) {
    const int width = std::clamp(terminalWidth(stdout) - kBesideBar - 1, 10, kWidestBar);
    const std::string head =
        textf("%7.1f s   level in dB, 0 dB: sine at full scale; bars from %g to %g dB\n", seconds, kBottomDb, kTopDb);
    const std::string text = head + barLines(bands, kBottomDb, kTopDb, width, style_);
    if (terminal_ && lines_ > 0) std::cout << "\033[" << lines_ << "A";
    std::cout << text << std::flush;
    lines_ = static_cast<int>(std::count(text.begin(), text.end(), '\n'));
    if (terminal_) std::this_thread::sleep_until(start_ + std::chrono::duration<double>(seconds));
}

}  // namespace vx
