// SPDX-License-Identifier: MIT
//
// A digital filter as a chain of second-order stages, made from its poles and zeros, and the state that runs it. Control calls make
// it; nothing in the block path runs it.
#pragma once

#include <array>
#include <complex>

#include "measure/elliptic_prototype.h"

namespace Dsp {

inline constexpr int kMaxStages = kMaxDigitalPoles / 2;

struct Stage {
    double a0 = 1.0;
    double a1 = 0.0;
    double a2 = 0.0;
    double b1 = 0.0;
    double b2 = 0.0;
    double b0 = 1.0;
};

struct Cascade {
    int stageCount = 0;
    std::array<Stage, kMaxStages> stages{};

    void setLayout(const Layout<kMaxDigitalPoles> &layout);

    // The frequency is in rad/sample.
    std::complex<double> responseAt(double frequency) const;
};

// Direct form I, in double precision whatever the samples are.
struct DirectFormI {
    struct History {
        double x1 = 0.0;
        double x2 = 0.0;
        double y1 = 0.0;
        double y2 = 0.0;
    };

    std::array<History, kMaxStages> histories{};
    double antiDenormal = 1e-8;  // changes its sign with each sample

    void reset() { histories = {}; }

    double process(double sample, const Cascade &cascade);
};

}  // namespace Dsp
