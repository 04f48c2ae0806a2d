// SPDX-License-Identifier: MIT
#include "measure/instruction_set.h"

#include <cstdlib>
#include <cstring>

namespace vxcomn {

InstructionSet bestInstructionSet() noexcept {
    __builtin_cpu_init();
    if (__builtin_cpu_supports("avx512f") != 0 && __builtin_cpu_supports("avx512bw") != 0 &&
        __builtin_cpu_supports("avx512dq") != 0 && __builtin_cpu_supports("avx512vl") != 0) {
        return InstructionSet::avx512;
    }
    return __builtin_cpu_supports("avx2") != 0 ? InstructionSet::avx2 : InstructionSet::sse2;
}

InstructionSet chosenInstructionSet() noexcept {
    const InstructionSet best = bestInstructionSet();
    const char *wanted = std::getenv("VXCOMN_ISA");
    if (wanted == nullptr) return best;
    for (int i = 0; i < kInstructionSets; ++i) {
        const auto set = static_cast<InstructionSet>(i);
        if (std::strcmp(wanted, instructionSetName(set)) == 0) return set < best ? set : best;
    }
    return best;
}

const char *instructionSetName(InstructionSet set) noexcept {
    static constexpr const char *kNames[kInstructionSets] = {"sse2", "avx2", "avx512"};
    return kNames[static_cast<int>(set)];
}

}  // namespace vxcomn
