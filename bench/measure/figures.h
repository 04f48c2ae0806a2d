// SPDX-License-Identifier: MIT
//
// The parts of measure_bench. Each prints its lines, one instruction set after the other up to `best`.
#pragma once

#include "measure/instruction_set.h"

namespace vxcomn::bench {

void benchReadout(InstructionSet best);

void benchSweep(InstructionSet best);
void benchNotch(InstructionSet best);
void benchPink(InstructionSet best);

void benchProcess(InstructionSet best);
void benchRecord(InstructionSet best);

}  // namespace vxcomn::bench
