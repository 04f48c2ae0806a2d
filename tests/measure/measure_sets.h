// SPDX-License-Identifier: MIT
//
// Runs a check once for each instruction set that this machine has, with the kernels switched over, and goes back to the chosen
// one.
#pragma once

#include <doctest/doctest.h>

#include "measure/instruction_set.h"
#include "measure/kernels.h"

template <class Check>
void onEachInstructionSet(Check check) {
    for (int i = 0; i <= static_cast<int>(vxcomn::bestInstructionSet()); ++i) {
        const auto set = static_cast<vxcomn::InstructionSet>(i);
        CAPTURE(vxcomn::instructionSetName(set));
        vxcomn::selectMeasureKernels(set);
        check();
    }
    vxcomn::selectMeasureKernels(vxcomn::chosenInstructionSet());
}
