// SPDX-License-Identifier: MIT
//
// What the tests of FftFirFilter share: a filter that frees itself, random samples, a walk over the instruction sets.
#pragma once

#include <doctest/doctest.h>

#include <random>
#include <vector>

#include "measure/fir_kernels.h"
#include "vxcomn/measurement_records.h"

namespace fir {

struct Filter : FftFirFilter {
    Filter() { create(); }
    explicit Filter(const std::vector<float> &newTaps) : Filter() {
        load(newTaps.data(), 0, 48000);  // the default filter may be of another instruction set
        load(newTaps.data(), static_cast<int>(newTaps.size()), 48000);
    }
    ~Filter() { dispose(); }
    Filter(const Filter &) = delete;
    Filter &operator=(const Filter &) = delete;
};

inline std::vector<float> randomValues(std::mt19937 &random, int count) {
    std::uniform_real_distribution<float> uniform(-1.0f, 1.0f);
    std::vector<float> values(static_cast<size_t>(count));
    for (float &value : values) value = uniform(random);
    return values;
}

// Selects each set that the machine has in turn; the chosen one is back afterwards.
template <typename Body>
void withEachInstructionSet(Body body) {
    for (int i = 0; i <= static_cast<int>(vxcomn::bestInstructionSet()); ++i) {
        const auto set = static_cast<vxcomn::InstructionSet>(i);
        CAPTURE(vxcomn::instructionSetName(set));
        vxcomn::selectFirKernels(set);
        body();
    }
    vxcomn::selectFirKernels(vxcomn::chosenInstructionSet());
}

}  // namespace fir
