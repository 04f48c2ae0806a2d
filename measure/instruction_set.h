// SPDX-License-Identifier: MIT
//
// Which instruction set the kernels of the block path use. Chosen once when the library is loaded: the best that the machine has,
// or less if the environment variable VXCOMN_ISA names it ("sse2", "avx2", "avx512"). All sets give the same bits, so the choice is
// one of speed only. Each room with kernels keeps one table of functions for each set, in one file for each.
#pragma once

#include <cstdint>

namespace vxcomn {

enum class InstructionSet : uint8_t { sse2 = 0, avx2 = 1, avx512 = 2 };

inline constexpr int kInstructionSets = 3;

// The best that this machine and its operating system support.
InstructionSet bestInstructionSet() noexcept;

// What the library uses: the best, held down by VXCOMN_ISA. An unknown name there is ignored.
InstructionSet chosenInstructionSet() noexcept;

// "sse2", "avx2" or "avx512".
const char *instructionSetName(InstructionSet set) noexcept;

}  // namespace vxcomn
