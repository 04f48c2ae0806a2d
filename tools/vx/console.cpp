// SPDX-License-Identifier: MIT
#include "tools/vx/console.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdlib>

#include "tools/vx/system.h"
#include "tools/vx/text.h"

namespace vx {

namespace {

constexpr auto kRedraw = std::chrono::milliseconds(100);
constexpr int kWidestBar = 40;
constexpr int kAroundBar = 24;  // percent and time left

std::string clockText(double seconds) {
    const auto whole = static_cast<long>(std::clamp(seconds, 0.0, 359999.0) + 0.5);
    return whole >= 3600 ? textf("%ld:%02ld:%02ld", whole / 3600, whole / 60 % 60, whole % 60)
                         : textf("%ld:%02ld", whole / 60, whole % 60);
}

}  // namespace

void addCommonOptions(CLI::App &verb, CommonOptions &options) {
    verb.add_flag("--json", options.json, "Print the results as one JSON document");
    verb.add_flag("-q,--quiet", options.quiet, "No progress and no summary; errors only");
    verb.add_option("--color,--colour", options.colour, "Colour: auto, always or never (NO_COLOR is honoured)")
        ->check(CLI::IsMember({"auto", "always", "never"}))
        ->type_name("WHEN");
}

Style::Style(const std::string &choice, std::FILE *stream) {
    const char *noColour = std::getenv("NO_COLOR");
    on_ = choice == "always" || (choice == "auto" && isTerminal(stream) && (noColour == nullptr || *noColour == '\0'));
}

std::string Style::mark(const char *code, const std::string &text) const {
    return on_ ? std::string("\033[") + code + "m" + text + "\033[0m" : text;
}

Progress::Progress(std::string what, std::optional<uint64_t> total, bool silent)
    : what_(std::move(what)),
      total_(total.value_or(0)),
      silent_(silent || total_ == 0),
      terminal_(isTerminal(stderr)),
      start_(Clock::now()),
      lastDrawn_(start_) {}

Progress::~Progress() {
    if (drawn_) std::fprintf(stderr, "\r\033[K");
}

void Progress::update(uint64_t done) {
    if (silent_) return;
    const double share = std::min(1.0, static_cast<double>(done) / static_cast<double>(total_));
    const Clock::time_point now = Clock::now();
    if (terminal_) {
        if (now - lastDrawn_ >= kRedraw) drawBar(share, now);
        return;
    }
    const int tenths = static_cast<int>(share * 10.0);
    if (tenths <= tenths_) return;
    tenths_ = tenths;
    std::fprintf(stderr, "%s: %d %%\n", what_.c_str(), 10 * tenths);
}

void Progress::drawBar(double share, Clock::time_point now) {
    lastDrawn_ = now;
    drawn_ = true;
    const double elapsed = std::chrono::duration<double>(now - start_).count();
    const int room = terminalWidth(stderr) - static_cast<int>(what_.size()) - kAroundBar;
    const int width = std::clamp(room, 0, kWidestBar);
    const int filled = static_cast<int>(share * width);
    const std::string left = share > 0.0 ? clockText(elapsed * (1.0 - share) / share) + " left" : "";
    std::fprintf(stderr, "\r\033[K%s [%s%s] %3.0f %% %s", what_.c_str(), std::string(static_cast<size_t>(filled), '#').c_str(),
                 std::string(static_cast<size_t>(width - filled), ' ').c_str(), 100.0 * share, left.c_str());
    std::fflush(stderr);
}

}  // namespace vx
