// SPDX-License-Identifier: MIT
//
// Times several pieces of work against one another. All of them run in turn, many times over, in one process, so that a machine
// whose speed drifts is the same machine for all; a figure is the median of its rounds. Throughput: the results of one call do not
// feed the next.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace vxcomn::bench {

struct Work {
    std::string name;
    std::function<void(int repeats)> run;  // does the work `repeats` times in a row
};

struct Figure {
    std::string name;
    double nanoseconds;  // median of one repeat
};

// Warms each up, finds how often it has to be repeated to last some 30 us, and takes turns.
std::vector<Figure> timeInTurns(const std::vector<Work> &works, int rounds = 301);

// The figure of a name.
double nanosecondsOf(const std::vector<Figure> &figures, const std::string &name);

// Keeps the compiler from leaving a result out.
template <class T>
inline void keep(const T &value) {
    asm volatile("" : : "r,m"(value) : "memory");
}

// Prints machine, compiler and commit.
void printHeading(const char *title);

// One line of a table: what was reached, and what was aimed at. `atMost` tells which way is better.
void printRatio(const std::string &what, double nanoseconds, double ratio, const char *against, double aim, bool atMost);

// The same where nothing was aimed at.
void printRatio(const std::string &what, double nanoseconds, double ratio, const char *against);

}  // namespace vxcomn::bench
