// SPDX-License-Identifier: MIT
#include "bench/support/timing.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <stdexcept>

namespace vxcomn::bench {

namespace {

double timeOnce(const Work &work, int repeats) {
    const auto start = std::chrono::steady_clock::now();
    work.run(repeats);
    const std::chrono::duration<double, std::nano> took = std::chrono::steady_clock::now() - start;
    return took.count();
}

int calibrate(const Work &work) {
    constexpr double kBatch = 30000;  // ns: long against the clock, short against a time slice
    int repeats = 1;
    while (repeats < 1 << 20 && timeOnce(work, repeats) < kBatch) repeats *= 2;
    return repeats;
}

std::string processorName() {
    std::ifstream in("/proc/cpuinfo");
    for (std::string line; std::getline(in, line);) {
        if (line.starts_with("model name")) return line.substr(line.find(':') + 2);
    }
    return "unknown processor";
}

}  // namespace

std::vector<Figure> timeInTurns(const std::vector<Work> &works, int rounds) {
    std::vector<int> repeats;
    for (const Work &work : works) repeats.push_back(calibrate(work));
    std::vector<std::vector<double>> times(works.size());
    for (int round = 0; round < rounds; ++round) {
        for (size_t i = 0; i < works.size(); ++i) times[i].push_back(timeOnce(works[i], repeats[i]) / repeats[i]);
    }
    std::vector<Figure> figures;
    for (size_t i = 0; i < works.size(); ++i) {
        const auto middle = times[i].begin() + static_cast<std::ptrdiff_t>(times[i].size() / 2);
        std::nth_element(times[i].begin(), middle, times[i].end());
        figures.push_back({works[i].name, *middle});
    }
    return figures;
}

double nanosecondsOf(const std::vector<Figure> &figures, const std::string &name) {
    for (const Figure &figure : figures) {
        if (figure.name == name) return figure.nanoseconds;
    }
    throw std::invalid_argument("no figure named " + name);
}

void printHeading(const char *title) {
    std::printf("%s\n%s; g++ %s; commit %s; medians of one run\n\n", title, processorName().c_str(), __VERSION__, VXCOMN_COMMIT);
}

void printRatio(const std::string &what, double nanoseconds, double ratio, const char *against, double aim, bool atMost) {
    const bool reached = atMost ? ratio <= aim : ratio >= aim;
    std::printf("  %-44s %9.1f ns  %7.2f x %-26s aim %s %5.1f  %s\n", what.c_str(), nanoseconds, ratio, against,
                atMost ? "at most " : "at least", aim, reached ? "reached" : "MISSED");
}

void printRatio(const std::string &what, double nanoseconds, double ratio, const char *against) {
    std::printf("  %-44s %9.1f ns  %7.2f x %s\n", what.c_str(), nanoseconds, ratio, against);
}

}  // namespace vxcomn::bench
