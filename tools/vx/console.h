// SPDX-License-Identifier: MIT
//
// How verbs talk to a person: the options that all of them have, colour, and the progress bar. Results go to standard output,
// everything else to standard error.
#pragma once

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>

namespace CLI {
class App;
}

namespace vx {

struct CommonOptions {
    bool json = false;
    bool quiet = false;
    std::string colour = "auto";
};

// Adds --json, -q and --color to a verb.
void addCommonOptions(CLI::App &verb, CommonOptions &options);

// Marks text on a stream that shows it: `always`, `never`, or `auto` for a terminal without NO_COLOR.
class Style {
  public:
    Style(const std::string &choice, std::FILE *stream);

    std::string bold(const std::string &text) const { return mark("1", text); }
    std::string good(const std::string &text) const { return mark("32", text); }
    std::string warning(const std::string &text) const { return mark("33", text); }

  private:
    std::string mark(const char *code, const std::string &text) const;

    bool on_;
};

// A bar with the time left on a terminal, a line every tenth otherwise, nothing if silent.
class Progress {
  public:
    // `total` in whatever is counted; nothing if it is not known, which shows no progress.
    Progress(std::string what, std::optional<uint64_t> total, bool silent);
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;
    ~Progress();

    void update(uint64_t done);

  private:
    using Clock = std::chrono::steady_clock;

    void drawBar(double share, Clock::time_point now);

    std::string what_;
    uint64_t total_;
    bool silent_;
    bool terminal_;
    bool drawn_ = false;
    int tenths_ = 0;
    Clock::time_point start_;
    Clock::time_point lastDrawn_;
};

}  // namespace vx
