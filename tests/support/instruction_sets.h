// SPDX-License-Identifier: MIT
//
// Runs a check with every instruction set that this machine has, and puts the best one back to use.
#pragma once

#include "host/kernels.h"
#include "measure/instruction_set.h"

namespace vxcomn::testing {

template <class Check>
void forEachInstructionSet(Check check) {
    for (int i = 0; i <= static_cast<int>(bestInstructionSet()); ++i) check(static_cast<InstructionSet>(i));
    selectHostKernels(bestInstructionSet());
}

}  // namespace vxcomn::testing
